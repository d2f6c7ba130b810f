"""How one plugin is run: which method, what is traced and logged, what becomes of failures."""

import os
import re

import pytest

from harness.messages import starting
from harness.syslog_recorder import ERR, INFO

PROFILE = "/etc/nuvex/hostprofile.xml"
THROWING = """#include "vantor/plugin.h"
#include <stdexcept>
VANTOR_METHOD(start) {{ throw {what}; }}
VANTOR_METHOD(apply) {{ throw {what}; }}
VANTOR_OPERATIONS_WITH_HOST_PROFILE(start, apply);
VANTOR_METADATA_2(NULL, NULL);
"""
STANDARD = THROWING.format(what='std::runtime_error("the disk is 100% full")')
OTHER = THROWING.format(what='"a text"')


def applying(*names):
    return [(INFO, f"executing host profile plugin: {name}") for name in names]


def failure(name, result):
    return (ERR, f"execution failure in context '{name}', returncode {result}")


def untimed(text):
    """Trace lines without the number of microseconds."""
    return re.sub(r"\(took \d+ us\)", "(took N us)", text).splitlines()


def traced(*names):
    lines = []
    for name in names:
        lines += [f"starting execution of plugin: {name}",
                  f"completed execution of plugin: {name} (took N us)"]
    return lines


def test_trace_frames_each_plugin(root, vantor):
    root.native("alpha")
    root.debug_configuration("inject: : :echo amid")
    result = vantor("--trace")
    lines = untimed(result.stdout)
    assert lines == [*traced("alpha"), traced("inject")[0], "amid", traced("inject")[1]]
    assert result.stderr == ""


def test_without_trace_nothing_is_printed(root, vantor):
    root.native("alpha", start=7)
    result = vantor("--verbose")
    assert (result.stdout, result.stderr) == ("", "")


def test_barriers_are_not_traced(root, vantor):
    root.native("giver", provides=["ready"])
    root.native("taker", requires=["ready"])
    assert untimed(vantor("--trace").stdout) == traced("giver", "taker")


@pytest.mark.parametrize("result", [1, 5, 4294967295])
def test_a_result_other_than_zero_is_logged_and_the_boot_goes_on(root, vantor, result):
    root.native("foo", start=result, provides=["ready"])
    root.native("after", requires=["ready"])
    run = vantor()
    assert run.messages == [*starting("foo"), failure("foo", result), *starting("after")]
    assert run.status == 0


def test_a_null_start_entry_does_nothing(root, vantor):
    root.native("foo", start=None)
    result = vantor("--trace")
    assert result.messages == starting("foo")
    assert untimed(result.stdout) == traced("foo")
    assert root.ran() == []


@pytest.mark.parametrize("text, message", [
    (STANDARD, "unhandled exception whilst processing bad: the disk is 100% full"),
    (OTHER, "ignoring unknown exception whilst processing bad ..."),
], ids=["standard", "other"])
def test_an_exception_is_logged_and_the_plugin_counts_as_run(root, vantor, text, message):
    root.compiled("bad", text, "cc")
    result = vantor("--trace")
    assert result.messages == [*starting("bad"), (ERR, message)]
    assert untimed(result.stdout) == traced("bad")
    assert result.status == 0
    assert "[1970" not in root.read("/var/log/sysboot.log")


@pytest.mark.parametrize("profile", [PROFILE, PROFILE + ".gz"])
def test_a_host_profile_has_it_applied_in_place_of_the_start(root, vantor, profile):
    root.write(profile)
    root.native("foo", apply=0)
    assert vantor().messages == applying("foo")
    assert [line.split()[0] for line in root.ran()] == ["apply", "end"]


def test_a_folder_counts_as_a_host_profile(root, vantor):
    root.folder_at(PROFILE)
    root.native("foo", apply=0)
    assert vantor().messages == applying("foo")


@pytest.mark.parametrize("target", ["nowhere", os.path.basename(PROFILE)])
def test_a_link_that_leads_nowhere_is_no_host_profile(root, vantor, target):
    root.symlink(target, PROFILE)
    root.native("foo", apply=0)
    assert vantor().messages == starting("foo")


@pytest.mark.parametrize("version, apply, messages", [
    (1, 0, starting("foo")), (2, 0, applying("foo")), (3, 0, applying("foo")),
    (4, 0, applying("foo")), (2, None, starting("foo")), (4, None, starting("foo")),
])
def test_who_has_a_host_profile_applied(root, vantor, version, apply, messages):
    root.write(PROFILE)
    root.native("foo", version=version, apply=apply)
    assert vantor().messages == messages


def test_a_failing_host_profile_method_is_logged_as_a_start_is(root, vantor):
    root.write(PROFILE)
    root.native("foo", start=0, apply=9)
    assert vantor().messages == [*applying("foo"), failure("foo", 9)]


def test_a_host_profile_that_appears_after_the_first_look_is_not_noticed(root, vantor):
    root.native("first", apply=0, creates=PROFILE, provides=["ready"])
    root.native("second", apply=0, requires=["ready"])
    assert vantor().messages == starting("first", "second")
    assert root.exists(PROFILE)


def test_all_threads_share_the_first_look_for_the_host_profile(root, vantor):
    names = [f"second{number}" for number in range(8)]
    root.folder_at("/tmp/here")
    root.native("first", apply=0, creates=PROFILE, provides=["ready"])
    for name in names:
        root.native(name, apply=0, requires=["ready"], meets_at="/tmp/here", meets=8)
    result = vantor("--parallel")
    assert sorted(result.messages) == sorted(starting("first", *names))


def test_only_a_plugin_that_could_apply_it_looks_for_the_host_profile(root, vantor):
    root.native("first", creates=PROFILE, provides=["ready"])
    root.native("second", apply=0, requires=["ready"])
    assert vantor().messages == starting("first") + applying("second")


def test_a_named_method_is_run_without_a_notice(root, vantor):
    root.write(PROFILE)
    root.native("foo", apply=0)
    result = vantor("--method=start", "--trace")
    assert (result.status, result.stderr, result.messages) == (0, "", [])
    assert untimed(result.stdout) == traced("foo")
    assert root.started() == ["foo"]


def test_an_unknown_method_does_nothing_without_complaint(root, vantor):
    root.native("foo", apply=0)
    result = vantor("--method=Start", "--trace")
    assert (result.status, result.stderr, result.messages) == (0, "", [])
    assert untimed(result.stdout) == traced("foo")
    assert root.ran() == []


def test_a_named_host_profile_method_needs_no_host_profile(root, vantor):
    root.native("foo", apply=4)
    assert vantor("--method=apply_host_profile").messages == [failure("foo", 4)]


@pytest.mark.parametrize("version, apply", [(1, 0), (3, None)])
def test_a_named_method_that_is_missing_is_said_on_standard_error(root, vantor, version, apply):
    root.native("foo", version=version, apply=apply)
    result = vantor("--method=apply_host_profile")
    assert result.stderr == (
        "unable to invoke method 'apply_host_profile' on plugin 'foo': "
        "method `NativePlugin::ApplyHostProfile' is not implemented\n")
    assert (result.status, result.messages, root.ran()) == (0, [], [])


@pytest.mark.parametrize("method", ["start", "apply_host_profile"])
@pytest.mark.parametrize("text, said", [
    (STANDARD, "unable to invoke method '{}' on plugin 'bad': the disk is 100% full\n"),
    (OTHER, "unknown exception whilst attempting to execute method '{}' on plugin 'bad'\n"),
], ids=["standard", "other"])
def test_an_exception_of_a_named_method_is_said_on_standard_error(root, vantor, method, text, said):
    root.compiled("bad", text, "cc")
    result = vantor(f"--method={method}")
    assert (result.status, result.stdout, result.messages) == (0, "", [])
    assert result.stderr == said.format(method)


def test_an_invocation_runs_one_method_of_the_named_plugins_alone(root, vantor):
    root.native("foo", start=3, requires=["nobody-provides-this"])
    root.native("bar")
    result = vantor("--invoke", "--method=start", "--plugin=libfoo.so", "--trace")
    assert (result.status, result.stderr) == (0, "")
    assert result.messages == [failure("foo", 3)]
    assert untimed(result.stdout) == traced("foo")
    assert root.started() == ["foo"]
    # Neither a report nor an alert: the others are missing on purpose.
    assert not root.exists("/var/log/sysboot.log")
    assert root.alerts() == []
    assert root.run_once_record() == "vantor.run-once=\n"


def test_an_invocation_that_fails_says_so_and_still_ends_well(root, vantor):
    root.compiled("bad", STANDARD, "cc")
    result = vantor("--invoke", "--method=start", "--plugin=libbad.so")
    assert result.stderr == (
        "unable to invoke method 'start' on plugin 'bad': the disk is 100% full\n")
    assert result.status == 0


def test_an_invocation_of_an_unknown_method_does_nothing(root, vantor):
    root.native("foo")
    result = vantor("--invoke", "--method=stop", "--plugin=libfoo.so")
    assert (result.status, result.stdout, result.stderr, result.messages) == (0, "", "", [])
    assert root.ran() == []
