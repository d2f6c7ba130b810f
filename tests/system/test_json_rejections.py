"""Plugin documents that are refused: every reason, and what else of the host stays as it should."""

import json
import re

import pytest

from harness.json_plugin import describe_notes, document, failed, write_plugin, write_text
from harness.messages import invalid, starting
from harness.syslog_recorder import INFO, WARNING
from test_alerts import ALERTS, unprovided
from test_dump import drawn

PLUGINS = "/usr/libexec/vantor/plugins"
MISSING = object()
NO_FILE = "no such file or directory"
NO_OBJECT = "plugin root is not an object"
COMMAND = "command is not a string"


def assert_refused(root, result, reason, file_name="x.json"):
    text = invalid(file_name, reason)
    assert result.messages == [(WARNING, text)]
    assert (result.status, result.stdout, result.stderr) == (0, "", "")
    # The alert is the very text, behind the time in UTC and a blank.
    [line] = root.read(ALERTS).split("\n")[:-1]
    assert re.fullmatch(r"\d{4}-\d\d-\d\dT\d\d:\d\d:\d\dZ " + re.escape(text), line)


def changed(version, part, key, value):
    """A good document with one key of one part (of the root, when there is no part) changed."""
    made = document(version, apply=["a"], start=["b"])
    place = made[part] if part else made
    if value is MISSING:
        place.pop(key, None)
    else:
        place[key] = value
    return made


def unparsable(key, part="metadata"):
    return f"{part} is corrupt (unable to parse {key})"


def cases():
    """Version, part, key, value and reason of every refusal of a document that is an object."""
    for value in (MISSING, None, [], "x", 1, True):
        yield 3, "", "metadata", value, "invalid metadata interface"
        yield 1, "", "operations", value, "invalid operations interface"
    for value in (MISSING, None, "2", [2], {"2": 2}, True):
        yield 3, "metadata", "version", value, unparsable("version")
    for value in (0, 5, -1, 0.5, 0.999, -0.5, 5.1, 2147483648, -2147483649, 1e300, -1e300):
        yield 3, "metadata", "version", value, "Unsupported API version"
    for key in ("provides", "requires"):
        for version in (1, 2, 3, 4):
            yield version, "metadata", key, MISSING, unparsable(key)
        yield 3, "metadata", key, None, unparsable(key)
        yield 3, "metadata", key, "ready", unparsable(key)
        yield 3, "metadata", key, {"ready": 1}, unparsable(key)
        yield 3, "metadata", key, ["a", 1], f"{key} tag is not a string"
        yield 1, "metadata", key, [None, "a"], f"{key} tag is not a string"
        yield 1, "metadata", key, [["a"]], f"{key} tag is not a string"
    for key in ("required_flags", "disabling_flags"):
        for version in (3, 4):
            yield version, "metadata", key, "usb", unparsable(key)
        yield 3, "metadata", key, None, unparsable(key)
        yield 3, "metadata", key, ["a", True], f"{key} tag is not a string"
        yield 4, "metadata", key, [{}], f"{key} tag is not a string"
    for value in (MISSING, None, 0, 1, "true", []):
        yield 3, "metadata", "run_once", value, unparsable("run_once")
    for value in (MISSING, None, 1, 1.5, True, ["1"]):
        yield 4, "metadata", "plugin_version", value, unparsable("plugin_version")
    for value in (MISSING, None, "a", {}, 7):
        yield 3, "operations", "start", value, unparsable("start", "operations")
    for value in (["a", 1], [None], [["a"]], [{}], [True]):
        yield 1, "operations", "start", value, COMMAND
        yield 2, "operations", "apply_host_profile", value, COMMAND
    for version in (2, 3, 4):
        for value in (None, "x", {}):
            yield (version, "operations", "apply_host_profile", value,
                   unparsable("apply-host-profile", "operations"))


def case_name(value):
    return "missing" if value is MISSING else json.dumps(value)


@pytest.mark.parametrize("version, part, key, value, reason", cases(), ids=case_name)
def test_a_document_with_one_fault(root, vantor, version, part, key, value, reason):
    write_text(root, "x", json.dumps(changed(version, part, key, value)))
    assert_refused(root, vantor(), reason)


@pytest.mark.parametrize("text", [
    "", " \n", "[]", "42", '"text"', "true ", "null", "// a comment alone", "/* not closed {}",
    "{", "{]", '{"a" 1}', "{a: 1}", '{"metadata": {"version": 1', '{"a": nul', '{"a": "open}',
    '{"a": 1 "b": 2}', '{"a": 1,,, "b": 2}', "\ufeff{}", "\0", "\x7fELF",
])
def test_a_text_that_is_no_object(root, vantor, text):
    write_text(root, "x", text)
    assert_refused(root, vantor(), NO_OBJECT)


def test_an_object_of_nothing(root, vantor):
    write_text(root, "x", "{}")
    assert_refused(root, vantor(), "invalid metadata interface")


# In the order in which a document is checked: of two faults, the one nearer to the top is told.
FAULTS = [
    ("", "metadata", [], "invalid metadata interface"),
    ("metadata", "version", "3", unparsable("version")),
    ("metadata", "version", 9, "Unsupported API version"),
    ("metadata", "provides", {}, unparsable("provides")),
    ("metadata", "requires", [1], "requires tag is not a string"),
    ("metadata", "required_flags", {}, unparsable("required_flags")),
    ("metadata", "disabling_flags", [1], "disabling_flags tag is not a string"),
    ("metadata", "run_once", 1, unparsable("run_once")),
    ("metadata", "plugin_version", 1, unparsable("plugin_version")),
    ("", "operations", [], "invalid operations interface"),
    ("operations", "start", {}, unparsable("start", "operations")),
    ("operations", "apply_host_profile", [1], COMMAND),
]


@pytest.mark.parametrize("first", range(len(FAULTS)))
def test_of_many_faults_the_first_that_is_met_is_told(root, vantor, first):
    made = document(start=["a"])
    for part, key, value, _ in reversed(FAULTS[first:]):
        place = made[part] if part else made
        if isinstance(place, dict):
            place[key] = value
    write_text(root, "x", json.dumps(made))
    assert_refused(root, vantor(), FAULTS[first][3])


@pytest.mark.parametrize("version, metadata, apply", [
    (1, {"run_once": "x", "plugin_version": 1, "required_flags": "x", "disabling_flags": [1]}, "x"),
    (2, {"run_once": 7, "plugin_version": [], "required_flags": {}, "disabling_flags": 0}, ["a"]),
])
def test_what_only_later_versions_know_is_not_looked_at(root, vantor, version, metadata, apply):
    made = document(version, **metadata)
    made["operations"]["apply_host_profile"] = apply
    write_text(root, "x", json.dumps(made))
    result = vantor("--plugin-flags=x")
    assert result.messages == starting("x")
    assert root.run_once_record() == "vantor.run-once=\n"


@pytest.mark.parametrize("version", [1, 1.9, 2, 3, 4, 4.7, 4.999])
def test_versions_that_are_known(root, vantor, version):
    write_plugin(root, "x", version=version, run_once=False, plugin_version="")
    assert vantor().messages == starting("x")


@pytest.mark.parametrize("kind", ["fifo", "socket", "folder", "dangling link", "link to itself",
                                  "link to a fifo", "device"])
def test_an_entry_that_is_no_file(root, vantor, kind):
    if not root.odd_entry(f"{PLUGINS}/x.json", kind):
        pytest.skip("no device file can be made here")
    assert_refused(root, vantor(), NO_FILE)


def test_a_file_that_is_named_and_not_there(root, vantor):
    assert_refused(root, vantor("--plugin=x.json"), NO_FILE)


def test_a_file_for_which_no_descriptor_is_left(session, root, vantor):
    if session.sanitizers.names:
        pytest.skip("the sanitizers need descriptors of their own")
    write_plugin(root, "x")
    # The first message takes the last descriptor for the system log.
    result = vantor("--plugin=README,x.json", open_files=4)
    assert result.messages[:2] == [
        (WARNING, "ignoring plugin 'README' of unspecified type..."),
        (WARNING, invalid("x.json", NO_FILE))]
    assert result.status == 0


def test_a_file_whose_reading_fails(session, root, vantor):
    if not session.isolation.has_proc:
        pytest.skip("the roots hold no /proc")
    root.symlink("/proc/self/mem", f"{PLUGINS}/x.json")
    assert_refused(root, vantor(), NO_OBJECT)


def test_a_link_to_a_document_is_a_plugin_of_the_links_name(root, vantor):
    describe_notes(root)
    write_plugin(root, "../elsewhere", "test note --text=here")
    root.symlink("../elsewhere.json", f"{PLUGINS}/libhere.json")
    assert vantor().messages == starting("here")
    assert root.ran() == ["here"]


@pytest.mark.parametrize("file_name, name", [
    ("foo", "foo"), ("libfoo", "foo"), ("lib", ""), ("", ""), ("foo.so", "foo.so"),
    ("lib foo", " foo"), ("50%s", "50%s")])
def test_the_name_of_a_json_plugin(root, vantor, file_name, name):
    write_plugin(root, file_name)
    assert vantor().messages == starting(name)


@pytest.mark.parametrize("file_name", ["x.JSON", "x.json5", "x.json~", "x.json.bak"])
def test_a_name_that_is_nearly_a_documents(root, vantor, file_name):
    root.write(f"{PLUGINS}/{file_name}", json.dumps(document()))
    extension = file_name.rpartition(".")[2]
    assert vantor().messages == [
        (WARNING, f"ignoring plugin '{file_name}' of unknown type ({extension})...")]


def test_percent_signs_of_a_refused_files_name_are_no_format(root, vantor):
    write_text(root, "100%s%n", "{}")
    assert_refused(root, vantor(), "invalid metadata interface", "100%s%n.json")


def test_a_refused_document_of_another_folder_is_told_with_that_folder(root, vantor):
    root.write("/tmp/plugins/x.json", "{}")
    text = invalid("x.json", "invalid metadata interface", "/tmp/plugins")
    assert vantor("--plugin-directory=/tmp/plugins").messages == [(WARNING, text)]


def test_a_blacklisted_document_that_is_bad_is_still_reported(root, vantor):
    write_text(root, "x", "{}")
    assert_refused(root, vantor("--disable-plugins=x"), "invalid metadata interface")


BARRIERS = {"provides": ["ready", "alone"], "requires": ["earlier"]}


@pytest.mark.parametrize("options", [[], ["--parallel"], ["--randomize"]])
def test_plugins_that_wait_for_a_refused_one_run_and_an_alert_names_them(root, vantor, options):
    describe_notes(root)
    write_text(root, "bad", json.dumps(document(start=[1], **BARRIERS)))
    write_plugin(root, "taker", "test note --text=taker", requires=["ready"])
    root.native("giver", start=None, provides=["earlier"])
    result = vantor("--plugin=bad.json,taker.json,libgiver.so", *options)
    text = invalid("bad.json", COMMAND)
    assert sorted(result.messages) == sorted([(WARNING, text), *starting("taker", "giver")])
    assert result.status == 0
    assert root.ran() == ["taker"]
    assert root.alerts() == [text, unprovided("ready", "taker")]


def test_the_barriers_of_a_refused_document_are_drawn_without_it(root, vantor):
    write_text(root, "bad", json.dumps(document(start="x", **BARRIERS)))
    root.native("taker", requires=["ready"])
    root.native("giver", provides=["earlier"])
    vantor("--plugin=bad.json,libtaker.so,libgiver.so", "--dump-dependency-tree=/tmp/graph.dot")
    assert drawn(root) == [
        "digraph g {",
        'taker [label="taker"];',
        'giver [label="giver"];',
        "giver -> earlier;",
        'alone [label="alone" shape=box];',
        'earlier [label="earlier" shape=box];',
        'ready [label="ready" shape=box];',
        "ready -> taker;",
        "}",
    ]


def test_a_list_with_one_bad_name_links_none_of_its_names(root, vantor):
    write_text(root, "bad", json.dumps(document(provides=["ready"], requires=["a", "b", 3])))
    vantor("--dump-dependency-tree=/tmp/graph.dot")
    assert drawn(root) == ["digraph g {", 'ready [label="ready" shape=box];', "}"]


def test_a_directory_of_refused_documents_leaves_the_good_ones_alone(root, vantor):
    describe_notes(root)
    texts = []
    for number, (_, key, value, reason) in enumerate(FAULTS[3:9]):
        name = f"bad{number}"
        how = {"provides": ["ready", "shared"], "requires": ["early", "shared"], key: value}
        write_text(root, name, json.dumps(document(**how)))
        texts.append(invalid(f"{name}.json", reason))
    write_plugin(root, "giver", "test note --text=giver", provides=["ready"], requires=["early"])
    write_plugin(root, "taker", "test note --text=taker", requires=["ready"])
    write_plugin(root, "first", "test note --text=first", provides=["early"])
    result = vantor("--parallel")
    assert root.ran() == ["first", "giver", "taker"]
    assert sorted(result.texts(WARNING)) == sorted(texts)
    assert sorted(root.alerts()) == sorted(texts)
    assert result.texts(INFO) == [text for _, text in starting("first", "giver", "taker")]


def nested(levels):
    """A good document, that many levels deep in a key that nobody reads."""
    text = json.dumps(document(start=["test note --text=deep"]))
    # The root is a level, the object in the list is one.
    inner = "[" * (levels - 2) + "{}" + "]" * (levels - 2)
    return f'{{"unread": {inner}, {text[1:]}'


def test_a_document_of_a_thousand_levels_is_read(root, vantor):
    describe_notes(root)
    write_text(root, "x", nested(1000))
    assert vantor().messages == starting("x")
    assert root.ran() == ["deep"]


@pytest.mark.parametrize("levels", [1001, 1002, 1000000])
def test_a_deeper_document_is_refused(root, vantor, levels):
    write_text(root, "x", nested(levels))
    assert_refused(root, vantor(), NO_OBJECT)


def test_a_document_of_opening_brackets_alone_is_refused(root, vantor):
    write_text(root, "x", '{"a":[' * 500000)
    assert_refused(root, vantor(), NO_OBJECT)


LENIENT = """// The document of a careless author
/* with comments
   everywhere */ {, "metadata": /**/ {"version": 9, "version": 2.5,
    "provides": [,], "requires": [] /* nobody */ , // nothing
    "run_once": "whatever",
  },
  "operations": {"start": ["test note \\u002d-text=1" , "test note --text=\\q",],},
  "odd": [true , }, :, +],
}
garbage } ] " behind the root
"""


def test_a_lenient_document_is_read(root, vantor):
    describe_notes(root)
    write_text(root, "x", LENIENT)
    assert vantor().messages == [*starting("x"), failed(
        "test note 002d-text=1", "x",
        'unknown command "test note 002d-text=1"; the nearest known one is "test note"')]
    assert root.ran() == ["q"]


@pytest.mark.parametrize("behind", [" x", "}", "{}", "]]]", '"', "\0\0", "/", "/* open"])
def test_what_stands_behind_the_root_is_not_looked_at(root, vantor, behind):
    describe_notes(root)
    write_text(root, "x", json.dumps(document(start=["test note --text=read"])) + behind)
    assert vantor().messages == starting("x")
    assert root.ran() == ["read"]


def test_bytes_that_are_no_text_stay_what_they_are(root, vantor):
    describe_notes(root)
    text = json.dumps(document(start=["test note --text=NAME"])).encode()
    root.write(f"{PLUGINS}/x.json", text.replace(b"NAME", b"\xff\xc3\xa9\x80"))
    assert vantor().messages == starting("x")
    with open(root.path("/tmp/ran"), "rb") as file:
        assert file.read() == b"\xff\xc3\xa9\x80\n"


def test_a_document_of_ten_megabytes_is_read(root, vantor):
    describe_notes(root)
    made = document(start=["test note --text=large"])
    made["notes"] = ["a note of some length"] * 200000 + ["x" * 5000000]
    write_text(root, "x", json.dumps(made))
    assert vantor().messages == starting("x")
    assert root.ran() == ["large"]
