"""JSON plugins as plugins among others: filters, records, methods, and many at one time."""

import re

import pytest

from harness.json_plugin import (
    command, describe, describe_notes, failed, make_directories, shell_command, unparsed,
    write_plugin)
from harness.messages import starting
from harness.syslog_recorder import DEBUG, INFO, WARNING
from test_dump import drawn

PROFILE = "/etc/nuvex/hostprofile.xml"
FAILED = '"/usr/bin/fail" ended with exit status 3: no'


@pytest.fixture(autouse=True)
def notes(root):
    describe_notes(root)


def applying(*names):
    return [(INFO, f"executing host profile plugin: {name}") for name in names]


def note(text):
    return f"test note --text={text}"


def test_kinds_of_plugin_wait_for_each_other(root, vantor):
    root.native("first", provides=["a"])
    write_plugin(root, "second", note("second"), requires=["a"], provides=["b"])
    root.debug_configuration("third:b:c:echo third >>/tmp/ran")
    write_plugin(root, "fourth", note("fourth"), requires=["a", "c"])
    result = vantor("--parallel")
    assert result.messages == starting("first", "second", "third", "fourth")
    assert [line.split()[0] for line in root.ran()] == ["start", "end", "second", "third", "fourth"]


def test_a_plugin_that_runs_is_traced_and_profiled(root, vantor):
    write_plugin(root, "net", note("x"))
    result = vantor("--trace")
    assert re.sub(r"\d+ us", "N us", result.stdout) == (
        "starting execution of plugin: net\ncompleted execution of plugin: net (took N us)\n")
    assert len([line for line in root.profiling_log() if line.endswith("] sysboot: net")]) == 1


def test_a_plugin_without_commands_succeeds_doing_nothing(root, vantor):
    write_plugin(root, "net", provides=["ready"])
    root.native("after", start=None, requires=["ready"])
    assert vantor().messages == starting("net", "after")
    assert root.alerts() == []


def test_a_plugin_is_drawn_like_any_other(root, vantor):
    write_plugin(root, "net", note("x"), provides=["ready"])
    assert vantor("--dump-dependency-tree=/tmp/graph.dot").messages == []
    assert drawn(root) == [
        "digraph g {", 'net [label="net"];', "net -> ready;", 'ready [label="ready" shape=box];',
        "}"]
    assert root.ran() == []


def test_a_blacklisted_plugin_is_left_out_and_still_provides(root, vantor):
    write_plugin(root, "net", note("off"), provides=["ready"])
    write_plugin(root, "taker", note("taker"), requires=["ready"])
    result = vantor("--plugin=net.json,taker.json", "--disable-plugins=net")
    assert result.messages == [
        (INFO, "ignoring plugin 'net' due to blacklist"), *starting("taker")]
    assert (root.ran(), root.alerts()) == (["taker"], [])


@pytest.mark.parametrize("metadata, boot, message", [
    ({"disabling_flags": ["nousb", "noacpi", "nousb"]}, "nousb,x,noacpi",
     "ignoring plugin 'net', disabled due to boot flags: noacpi nousb "),
    ({"required_flags": ["b", "a", "b"]}, "",
     "ignoring plugin 'net', disabled due to missing required boot flags: a b "),
    ({"required_flags": ["a", "b"]}, "b",
     "ignoring plugin 'net', disabled due to missing required boot flags: a "),
    ({"required_flags": ["a"], "disabling_flags": ["d"]}, "d",
     "ignoring plugin 'net', disabled due to boot flags: d "),
    ({"required_flags": ["a"], "disabling_flags": ["d"]}, "a", ""),
    ({"required_flags": [], "disabling_flags": []}, "a,d", ""),
    ({"version": 4, "required_flags": ["a"]}, "",
     "ignoring plugin 'net', disabled due to missing required boot flags: a "),
])
def test_boot_flags(root, vantor, metadata, boot, message):
    write_plugin(root, "net", note("on"), **metadata)
    result = vantor(f"--plugin-flags={boot}")
    assert result.messages == ([(WARNING, message)] if message else starting("net"))
    assert root.ran() == ([] if message else ["on"])


def test_a_run_once_plugin_is_skipped_when_its_record_is_given_back(root, vantor):
    write_plugin(root, "setup", note("setup"), run_once=True, plugin_version="1.0-rc_2+x",
                 provides=["ready"])
    write_plugin(root, "always", note("always"), plugin_version="7", requires=["ready"])
    assert vantor("--plugin=setup.json,always.json").messages == starting("setup", "always")
    line = root.run_once_record()
    assert line == "vantor.run-once=setup1.0-rc_2+x,\n"
    second = vantor("--plugin=setup.json,always.json",
                    f"--run-once={line.strip().partition('=')[2]}")
    assert second.messages == [
        (DEBUG, "ignoring plugin 'setup' because version '1.0-rc_2+x' has already been run"),
        *starting("always")]
    assert root.ran() == ["setup", "always", "always"]
    assert root.run_once_record() == line
    # A new version is a new key.
    write_plugin(root, "setup", note("newer"), run_once=True, plugin_version="1.1")
    vantor(f"--run-once={line.strip().partition('=')[2]}", "--plugin=setup.json")
    assert root.ran()[3:] == ["newer"]
    assert root.run_once_record() == "vantor.run-once=setup1.0-rc_2+x,setup1.1,\n"


def test_a_run_once_plugin_whose_commands_fail_counts_as_run(root, vantor):
    write_plugin(root, "setup", "test fail -t x", run_once=True, plugin_version="1")
    vantor()
    assert root.run_once_record() == "vantor.run-once=setup1,\n"


@pytest.mark.parametrize("version, apply, applied", [
    (1, [note("apply")], False), (2, None, False), (2, [], False), (2, [note("apply")], True),
    (3, None, False), (3, [], False), (3, [note("apply")], True), (4, [note("apply")], True),
])
def test_who_has_a_host_profile_applied(root, vantor, version, apply, applied):
    root.write(PROFILE)
    write_plugin(root, "net", note("start"), version=version, apply=apply)
    assert vantor().messages == (applying("net") if applied else starting("net"))
    assert root.ran() == ["apply" if applied else "start"]


def test_without_a_host_profile_it_is_the_start_that_runs(root, vantor):
    write_plugin(root, "net", note("start"), apply=[note("apply")])
    assert vantor().messages == starting("net")
    assert root.ran() == ["start"]


def test_a_host_profile_cannot_be_applied_by_a_version_1_document(root, vantor):
    write_plugin(root, "net", note("start"), version=1, apply=[note("apply")])
    result = vantor("--invoke", "--method=apply_host_profile", "--plugin=net.json")
    assert result.stderr == (
        "unable to invoke method 'apply_host_profile' on plugin 'net': "
        "method `json_plugin::ApplyHostProfile' is not implemented\n")
    assert (result.status, result.stdout, result.messages, root.ran()) == (0, "", [], [])


@pytest.mark.parametrize("version, apply, ran", [
    (2, None, []), (3, [], []), (2, [note("a"), note("b")], ["a", "b"])])
def test_a_later_version_applies_what_commands_it_has(root, vantor, version, apply, ran):
    write_plugin(root, "net", note("start"), version=version, apply=apply)
    result = vantor("--invoke", "--method=apply_host_profile", "--plugin=net.json")
    assert (result.status, result.stdout, result.stderr, result.messages) == (0, "", "", [])
    assert root.ran() == ran


@pytest.mark.parametrize("method, operation", [
    ("start", "start"), ("apply_host_profile", "apply host profile")])
def test_an_invoked_method_logs_its_failed_commands(root, vantor, method, operation):
    write_plugin(root, "net", "test fail -t x", apply=["test fail -t x"])
    result = vantor("--invoke", f"--method={method}", "--plugin=net.json")
    assert result.messages == [failed("test fail -t x", "net", f"{FAILED} x", operation)]
    assert (result.status, result.stdout, result.stderr) == (0, "", "")


# Returns once eight commands are here at one time.
MEETING = ['touch "/tmp/here/$1"', "while set -- /tmp/here/*; [ $# -lt 8 ]; do sleep 0.01; done"]


def test_eight_plugins_run_their_commands_at_one_time(root, vantor):
    names = [f"p{number}" for number in range(8)]
    root.folder_at("/tmp/here")
    root.script("/usr/bin/meet", *MEETING)
    describe(root, *(command(f"meet {name}", "/usr/bin/meet", name) for name in names))
    for name in names:
        write_plugin(root, name, note(f"{name}-before"), f"meet {name}", f"test fail -t {name}",
                     "test '", note(f"{name}-after"))
    result = vantor("--parallel")
    assert (result.status, result.stderr) == (0, "")
    for name in names:
        assert [line for line in root.ran() if line.startswith(name)] == [
            f"{name}-before", name, f"{name}-after"]
    assert sorted(result.messages) == sorted([*starting(*names), *(
        message for name in names for message in (
            failed(f"test fail -t {name}", name, f"{FAILED} {name}"),
            unparsed(name, 'the word "\'" has a single quote that is not closed')))])


def test_forty_plugins_in_parallel_share_one_dispatcher(root, vantor):
    names = [f"p{number:02}" for number in range(40)]
    root.remove("/usr/lib/nuvex/nvcli/ext")
    for name in names:
        write_plugin(root, name, note(name), note(name))
    result = vantor("--parallel")
    assert sorted(root.ran()) == sorted(names * 2)
    # The missing folder is told by the one who makes the dispatcher, however many ask at first.
    assert [text for _, text in result.messages if "dispatcher" in text] == [
        "unable to add external directory to the nvcli dispatcher: "
        "/usr/lib/nuvex/nvcli/ext: cannot read the directory: No such file or directory"]
    assert len(result.messages) == 41


def test_a_slow_command_holds_nobody_up_in_a_parallel_boot(root, vantor):
    root.fifo("/tmp/gate")
    shell_command(root, "test wait", "read line </tmp/gate", 'echo "$line" >>/tmp/ran')
    shell_command(root, "test open", "echo opened >/tmp/gate")
    write_plugin(root, "waiter", "test wait")
    write_plugin(root, "opener", note("first"), "test open")
    assert sorted(vantor("--parallel").messages) == sorted(starting("waiter", "opener"))
    assert root.ran() == ["first", "opened"]


def test_a_host_without_descriptions_boots_to_its_end(root, vantor):
    root.remove("/usr/lib/nuvex/nvcli")
    make_directories(root)
    write_plugin(root, "net", note("x"))
    assert vantor().messages == [*starting("net"), failed(
        note("x"), "net", 'unknown command "test note"; no command is known at all')]
