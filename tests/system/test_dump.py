"""The dependency graph as DOT text."""

import re

from harness.syslog_recorder import WARNING


def drawn(root, name="/tmp/graph.dot"):
    """The lines of the drawing with each node's id replaced by its label."""
    text = root.read(name)
    labels = dict(re.findall(r'^(\d+) \[label="(.*)"', text, re.MULTILINE))
    assert len(set(labels.values())) == len(labels), "the tests' labels are unique"
    return re.sub(r"^(\d+)(?: -> (\d+))?", lambda found: " -> ".join(
        labels[number] for number in found.groups() if number), text,
        flags=re.MULTILINE).splitlines()


def assert_nothing_was_run(root):
    assert root.ran() == []
    assert not root.exists("/bootbank/vantorbk.gz")


def test_plugins_come_in_load_order_and_barriers_in_byte_order(root, vantor):
    # giver --> ready --> taker, other        giver --> Zone (nobody waits for it)
    # missing (provided by nobody) --> other
    root.native("giver", provides=["ready", "Zone"])
    root.native("taker", requires=["ready"])
    root.native("other", requires=["missing", "ready"])
    selection = "--plugin=libtaker.so,libgiver.so,libother.so"
    result = vantor(selection, "--dump-dependency-tree=/tmp/graph.dot")
    assert (result.status, result.stdout, result.stderr, result.messages) == (0, "", "", [])
    assert drawn(root) == [
        "digraph g {",
        'taker [label="taker"];',
        'giver [label="giver"];',
        "giver -> ready;",
        "giver -> Zone;",
        'other [label="other"];',
        'Zone [label="Zone" shape=box];',
        'missing [label="missing" shape=box];',
        "missing -> other;",
        'ready [label="ready" shape=box];',
        "ready -> taker;",
        "ready -> other;",
        "}",
    ]
    assert root.read("/tmp/graph.dot").endswith("\n}\n")
    assert_nothing_was_run(root)


def test_ids_are_decimal_numbers_of_their_own(root, vantor):
    for name in ("a", "b", "c"):
        root.native(name)
    vantor("--dump-dependency-tree=/tmp/graph.dot")
    ids = re.findall(r"^(\d+) \[label=", root.read("/tmp/graph.dot"), re.MULTILINE)
    assert len(set(ids)) == 3
    assert all(1 <= int(one) < 1 << 64 for one in ids)


def test_an_edge_added_twice_is_drawn_twice(root, vantor):
    root.native("giver", provides=["b", "b"])
    vantor("--dump-dependency-tree=/tmp/graph.dot")
    assert drawn(root)[2:4] == ["giver -> b;", "giver -> b;"]


def test_names_are_drawn_as_they_are(root, vantor):
    root.native("a", provides=['say "b\\n"'])
    vantor("--dump-dependency-tree=/tmp/graph.dot")
    assert '[label="say "b\\n"" shape=box];' in root.read("/tmp/graph.dot")


def test_debug_entries_and_disabled_plugins_in_the_drawing(root, vantor):
    root.native("off", provides=["ready"])
    root.debug_configuration("inject:ready:done:true")
    vantor("--disable-plugins=off", "--dump-dependency-tree=/tmp/graph.dot")
    # A disabled plugin still provides its barriers but has no line of its own.
    assert drawn(root) == [
        "digraph g {",
        'inject [label="inject"];',
        "inject -> done;",
        'done [label="done" shape=box];',
        'ready [label="ready" shape=box];',
        "ready -> inject;",
        "}",
    ]


def test_no_plugins_give_a_frame_alone_and_the_profiling_log(root, vantor):
    assert vantor("--dump-dependency-tree=/tmp/graph.dot").status == 0
    assert root.read("/tmp/graph.dot") == "digraph g {\n}\n"
    assert len(root.profiling_log()) == 9


def test_an_older_drawing_is_replaced(root, vantor):
    root.write("/tmp/graph.dot", "old\n" * 100)
    vantor("--dump-dependency-tree=/tmp/graph.dot")
    assert root.read("/tmp/graph.dot") == "digraph g {\n}\n"


def test_a_relative_path_is_meant_from_the_root(root, vantor):
    vantor("--dump-dependency-tree=graph.dot", cwd="/tmp")
    assert root.read("/graph.dot") == "digraph g {\n}\n"


def test_a_path_that_cannot_be_opened_fails_in_silence(root, vantor):
    root.native("alpha")
    result = vantor("--dump-dependency-tree=/nonexistent/x.dot")
    assert (result.status, result.stdout, result.stderr, result.messages) == (1, "", "", [])
    assert_nothing_was_run(root)
    assert [line for line in root.profiling_log() if "sysboot: alpha" in line]


def test_without_a_path_nothing_is_drawn_anywhere(root, vantor):
    root.native("alpha")
    before = root.all_files()
    result = vantor("--dump-dependency-tree")
    assert (result.status, result.stdout, result.stderr, result.messages) == (0, "", "", [])
    assert root.all_files() - before == {"/var/log/sysboot.log"}
    assert_nothing_was_run(root)


def test_the_path_is_taken_only_in_the_attached_form(root, vantor):
    assert vantor("--dump-dependency-tree", "/tmp/graph.dot").status == 0
    assert not root.exists("/tmp/graph.dot")


def test_load_errors_are_reported_in_a_drawing_run_too(root, vantor):
    root.write("/usr/libexec/vantor/plugins/README")
    result = vantor("--dump-dependency-tree")
    assert result.messages == [(WARNING, "ignoring plugin 'README' of unspecified type...")]
