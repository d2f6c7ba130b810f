"""Debug plugins: the two roads they come by, and what becomes of their commands."""

import pytest

from harness.messages import starting
from harness.syslog_recorder import ERR, INFO

PLUGINS = "/usr/libexec/vantor/plugins"


def returned(name, status):
    return (INFO, f"debug injection '{name}' returned {status}")


def saying(name, barriers=" : "):
    """An entry whose command notes its name; without barriers it runs in its turn."""
    return f"{name}:{barriers}:echo {name} >>/tmp/ran"


def test_every_entry_is_run_in_file_order_after_the_plugins(root, vantor):
    root.debug_configuration(saying("second"), saying("first"))
    root.native("alpha", start=None)
    result = vantor()
    assert result.messages == starting("alpha", "second", "first")
    assert root.ran() == ["second", "first"]


def test_an_entry_with_a_marker_file_is_run_twice(root, vantor):
    root.debug_configuration(saying("marked"), saying("other"))
    root.write(f"{PLUGINS}/marked.debug")
    result = vantor()
    assert result.messages == starting("marked", "marked", "other")
    assert root.ran() == ["marked", "marked", "other"]


def test_two_entries_of_one_name_and_a_marker_give_four_plugins(root, vantor):
    root.debug_configuration("m: : :echo 1 >>/tmp/ran", "m: : :echo 2 >>/tmp/ran")
    root.write(f"{PLUGINS}/libm.debug")
    vantor()
    assert root.ran() == ["1", "2", "1", "2"]


def test_a_marker_file_without_an_entry_yields_nothing(root, vantor):
    root.write(f"{PLUGINS}/lonely.debug")
    assert vantor().messages == []


def test_a_selected_marker_yields_its_entries_alone(root, vantor):
    root.debug_configuration(saying("other"), saying("marked"), saying("marked"))
    result = vantor("--plugin=marked.debug")
    assert result.messages == starting("marked", "marked")
    assert root.ran() == ["marked", "marked"]


def test_no_filter_stops_a_debug_plugin(root, vantor):
    root.debug_configuration(saying("m"))
    root.write(f"{PLUGINS}/m.debug")
    result = vantor("--disable-plugins=m", "--run-once=m", "--plugin-flags=a")
    assert result.messages == starting("m", "m")
    assert root.run_once_record() == "vantor.run-once=m,\n"


def test_the_command_runs_at_its_place_in_the_graph(root, vantor):
    # giver --> before --> inject --> after --> taker
    root.native("taker", requires=["after"])
    root.native("giver", provides=["before"])
    root.debug_configuration(saying("inject", "before:after"))
    vantor()
    assert [line.split()[0:2] for line in root.ran()] == [
        ["start", "giver"], ["end", "giver"], ["inject"], ["start", "taker"], ["end", "taker"]]


@pytest.mark.parametrize("command, status", [
    ("exit 1", "0x000100"),
    ("exit 255", "0x00ff00"),
    ("kill -9 $$", "0x000009"),
    ("kill -15 $$", "0x00000f"),
    ("no-such-command 2>/dev/null", "0x007f00"),
])
def test_a_command_that_fails_is_noted_with_its_raw_status(root, vantor, command, status):
    root.debug_configuration(f"inject: : :{command}")
    result = vantor()
    assert result.messages == starting("inject") + [returned("inject", status)]
    assert result.status == 0


def test_without_a_shell_the_command_counts_as_failed(root, vantor):
    root.remove("/usr/bin/sh")
    root.debug_configuration("inject: : :true")
    assert vantor().messages == starting("inject") + [returned("inject", "0x007f00")]


def test_the_output_of_a_command_goes_where_the_programs_goes(root, vantor):
    root.debug_configuration("inject: : :echo out; echo err >&2")
    result = vantor("--trace")
    lines = result.stdout.splitlines()
    assert lines[:2] == ["starting execution of plugin: inject", "out"]
    assert result.stderr == "err\n"


def test_a_host_profile_changes_nothing_for_a_debug_plugin(root, vantor):
    root.write("/etc/nuvex/hostprofile.xml")
    root.debug_configuration(saying("inject"))
    assert vantor().messages == starting("inject")


def test_a_debug_plugin_has_no_host_profile_method(root, vantor):
    root.debug_configuration(saying("inject"))
    result = vantor("--method=apply_host_profile")
    assert result.stderr == (
        "unable to invoke method 'apply_host_profile' on plugin 'inject': "
        "method `DebugPlugin::ApplyHostProfile' is not implemented\n")
    assert (result.status, root.ran(), result.texts(ERR)) == (0, [], [])


def test_a_debug_plugin_can_be_invoked(root, vantor):
    root.debug_configuration(saying("inject"))
    result = vantor("--invoke", "--method=start", "--plugin=inject.debug")
    assert (result.status, result.messages, root.ran()) == (0, [], ["inject"])


def test_no_command_finds_a_signal_blocked(root, vantor):
    """Not even SIGCHLD, which a worker blocks while it sleeps."""
    blocked = ("while read name value; do case $name in SigBlk*) echo $value >>/tmp/ran;; esac; "
               "done </proc/self/status")
    root.debug_configuration(f"first: :passed:{blocked}", f"second:passed: :{blocked}")
    for options in ([], ["--parallel"]):
        vantor(*options)
        assert root.ran() == ["0" * 16] * 2
        root.remove("/tmp/ran")
