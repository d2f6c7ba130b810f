"""What each option changes in a run, seen from outside."""

import time

import pytest

from harness.messages import starting
from harness.syslog_recorder import INFO, WARNING


def configuration(root):
    """The configuration lines of the profiling log as a dictionary."""
    lines = root.profiling_log()
    start = lines.index("=== Vantor configuration info ===")
    return dict(line.strip().split(": ", 1) for line in lines[start + 1:])


def flags(root):
    found = configuration(root)
    return [found[key] for key in ("Verbose", "Parallel", "Randomize", "Interactive Mode")]


@pytest.mark.parametrize("arguments, expected", [
    ([], ["0", "0", "0", "0"]),
    (["--verbose"], ["1", "0", "0", "0"]),
    (["--parallel"], ["0", "1", "0", "0"]),
    (["--randomize"], ["0", "0", "1", "0"]),
    (["--interactive"], ["0", "0", "0", "1"]),
    (["--parallel", "--interactive"], ["0", "0", "0", "1"]),
    (["--interactive", "--parallel"], ["0", "1", "0", "0"]),
    (["--interactive", "--parallel", "--interactive"], ["0", "0", "0", "1"]),
    (["--verbose", "--parallel", "--randomize=3"], ["1", "1", "1", "0"]),
])
def test_flags_as_the_profiling_log_shows_them(root, vantor, arguments, expected):
    assert vantor(*arguments).status == 0
    assert flags(root) == expected


@pytest.mark.parametrize("seed, shown", [
    ("42", "42"), ("-5", "-5"), ("+7", "7"), ("0", "0"), ("007", "7"),
    ("2147483647", "2147483647"), ("-2147483648", "-2147483648"),
])
def test_a_seed_is_shown_in_the_profiling_log(root, vantor, seed, shown):
    assert vantor(f"--randomize={seed}").status == 0
    assert configuration(root)["Random Seed"] == shown


@pytest.mark.parametrize("arguments", [
    ["--randomize"], ["--randomize=abc"], ["--randomize="], ["--randomize=12x"],
    ["--randomize=1.0"], ["--randomize= 5"], ["--randomize=5 "], ["--randomize=+"],
    ["--randomize=--5"], ["--randomize=2147483648"], ["--randomize=-2147483649"],
    ["--randomize=99999999999999999999"], ["--randomize", "42"],
])
def test_without_a_valid_seed_the_time_of_creation_stays(root, vantor, arguments):
    before = int(time.time())
    result = vantor(*arguments)
    assert (result.status, result.stdout, result.stderr, result.messages) == (0, "", "", [])
    assert before <= int(configuration(root)["Random Seed"]) <= int(time.time())
    assert flags(root)[2] == "1"


def test_a_bad_seed_keeps_the_one_before_it(root, vantor):
    vantor("--randomize=11", "--randomize=x")
    assert configuration(root)["Random Seed"] == "11"


def test_the_last_plugin_flags_alone_count(root, vantor):
    root.native("needs_a", required_flags=["a"])
    root.native("not_with_a", disabling_flags=["a", "b"])
    root.native("not_with_c", disabling_flags=["c"])
    result = vantor("--plugin-flags=a,b", "--plugin-flags=c")
    assert sorted(result.texts(WARNING)) == [
        "ignoring plugin 'needs_a', disabled due to missing required boot flags: a ",
        "ignoring plugin 'not_with_c', disabled due to boot flags: c ",
    ]
    assert root.started() == ["not_with_a"]


def test_disabled_plugins_accumulate(root, vantor):
    for name in ("one", "two", "three", "four"):
        root.native(name)
    result = vantor("--disable-plugins=one,two", "--disable-plugins=three")
    assert root.started() == ["four"]
    assert sorted(text for text in result.texts(INFO) if "blacklist" in text) == [
        "ignoring plugin 'one' due to blacklist",
        "ignoring plugin 'three' due to blacklist",
        "ignoring plugin 'two' due to blacklist",
    ]


def test_run_once_names_accumulate_sorted_and_once_each(root, vantor):
    vantor("--run-once=b,,a, c", "--run-once=a,B")
    assert root.run_once_record() == "vantor.run-once= c,B,a,b,\n"


def test_a_list_of_commas_names_nothing(root, vantor):
    root.native("alpha")
    assert vantor("--plugin=,,").status == 0
    assert root.started() == ["alpha"]


def test_selected_plugins_accumulate_in_order_and_repeat(root, vantor):
    for name in ("one", "two", "three"):
        root.native(name)
    result = vantor("--plugin=libtwo.so,libone.so", "--plugin=libthree.so,libtwo.so")
    assert result.messages == starting("two", "one", "three", "two")


def test_blanks_of_a_list_item_belong_to_it(vantor):
    result = vantor("--plugin=none, libalpha.so")
    assert result.texts(WARNING)[0] == "ignoring plugin 'none' of unspecified type..."
    assert "whilst loading plugin  libalpha.so: " in result.texts(WARNING)[1]


def test_the_last_method_counts(root, vantor):
    root.native("alpha", apply=0)
    assert vantor("--method=start", "--method=apply_host_profile").messages == []
    assert [line.split()[0] for line in root.ran()] == ["apply", "end"]


def test_the_last_plugin_directory_counts(root, vantor):
    root.native("usual")
    root.folder_at("/tmp/own")
    root.write("/tmp/own/note", "")
    result = vantor("--plugin-directory=/nowhere", "--plugin-directory=/tmp/own")
    assert result.status == 0
    assert result.messages == [(WARNING, "ignoring plugin 'note' of unspecified type...")]


def test_words_that_are_no_options_are_ignored(root, vantor):
    root.native("alpha")
    result = vantor("word", "--trace", "--", "--no-such-option")
    assert (result.status, result.stderr) == (0, "")
    assert root.started() == ["alpha"]


@pytest.mark.parametrize("arguments", [
    ["--parallel"], ["--interactive", "--parallel"], ["--parallel", "--randomize"],
])
def test_parallel_runs_eight_plugins_at_once(root, vantor, arguments):
    root.folder_at("/tmp/here")
    for number in range(8):
        root.native(f"p{number}", meets_at="/tmp/here", meets=8)
    assert vantor(*arguments).status == 0
    assert sorted(root.started()) == [f"p{number}" for number in range(8)]


def test_parallel_runs_no_more_than_eight_plugins_at_once(root, start):
    root.fifo("/tmp/gate")
    for number in range(9):
        root.native(f"p{number}", opens_to_read="/tmp/gate")
    run = start("--parallel")
    run.wait_until(lambda: len(root.started()) == 8, "eight plugins run")
    run.wait_until_every_thread_sleeps()
    assert len(root.started()) == 8
    with open(root.path("/tmp/gate"), "wb"):
        assert run.wait().status == 0
    assert len(root.started()) == 9


def test_without_parallel_one_plugin_runs_at_a_time(root, vantor):
    for number in range(9):
        root.native(f"p{number}")
    assert vantor().status == 0
    assert [line.split()[0] for line in root.ran()] == ["start", "end"] * 9
