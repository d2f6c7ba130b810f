"""The course of a run: directories, selections, failures, and what is written all the same."""

import re

import pytest

from harness.messages import BOOT_FAILED, INVOKE_FAILED, NOT_ELF, linker_says, starting
from harness.syslog_recorder import ERR, INFO, WARNING

# A stack for which no address space has room, by the bytes of a pointer.
MORE_THAN_FITS = {4: 0xF0000000, 8: 1 << 48}
NO_THREAD = "Could not create enough execution threads. (0 created, {}requested)"


def test_an_empty_directory_boots_and_leaves_record_and_log(root, vantor):
    result = vantor()
    assert (result.status, result.stdout, result.stderr, result.messages) == (0, "", "", [])
    assert root.run_once_record() == "vantor.run-once=\n"
    lines = root.profiling_log()
    assert len(lines) == 9
    assert lines[0].startswith("NVKernel Initialization Time: ")
    assert lines[1] == "=== Vantor configuration info ==="


def test_plugins_are_run_in_the_order_of_the_directory_listing(root, vantor):
    for name in ("zebra", "apple", "mango", "kiwi", "plum", "fig", "lime", "pear"):
        root.native(name)
    result = vantor()
    assert result.messages == starting(*root.plugins_in_order())
    assert root.started() == root.plugins_in_order()


def test_a_missing_plugin_directory_is_explained_and_still_logged(root, vantor):
    root.remove("/usr/libexec/vantor/plugins")
    result = vantor()
    assert result.status == 1
    assert result.stderr.startswith(BOOT_FAILED + "Details:\n")
    details = result.stderr[len(BOOT_FAILED + "Details:\n"):]
    assert re.fullmatch(
        r'.*: No such file or directory: "/usr/libexec/vantor/plugins"\n', details), details
    text = "unhandled exception whilst enumerating plugins: " + details.rstrip("\n")
    assert result.messages == [(ERR, text)]
    assert len(root.profiling_log()) == 9
    assert not root.exists("/bootbank/vantorbk.gz")


def test_a_plugin_directory_that_is_a_file_is_explained(root, vantor):
    root.write("/tmp/plugins", "")
    result = vantor("--plugin-directory=/tmp/plugins")
    assert result.status == 1
    assert result.stderr.startswith(BOOT_FAILED + "Details:\n")
    assert result.stderr.endswith(': Not a directory: "/tmp/plugins"\n')


@pytest.fixture
def no_threads(session):
    """Limits under which no thread can be made."""
    if "tsan" in session.sanitizers.names:
        pytest.skip("the thread sanitizer does not start with such a stack limit")
    return {"stack_size": MORE_THAN_FITS[session.base.word_size]}


def test_threads_that_cannot_be_made_end_the_run(root, vantor, no_threads):
    root.native("alpha")
    result = vantor("--parallel", **no_threads)
    reason = NO_THREAD.format(8)
    assert result.stderr == f"{BOOT_FAILED}Details:\n{reason}\n"
    assert result.messages == [(ERR, f"unhandled exception whilst enumerating plugins: {reason}")]
    assert (result.status, result.stdout) == (1, "")
    assert root.ran() == []
    assert not root.exists("/bootbank/vantorbk.gz")
    # A plugin that was never run shows as the beginning of time.
    never = "1970-01-01 00:00:00.000000"
    assert root.profiling_log()[1] == f"[{never} - {never}] sysboot: alpha"


def test_a_failed_invocation_is_explained_and_not_logged(root, vantor, no_threads):
    root.native("alpha")
    result = vantor("--invoke", "--method=start", "--plugin=libalpha.so", **no_threads)
    reason = NO_THREAD.format(1)
    assert result.stderr == f"{INVOKE_FAILED}Details:\n{reason}\n"
    assert result.messages == [(ERR, f"unhandled exception whilst enumerating plugins: {reason}")]
    assert result.status == 1
    assert not root.exists("/var/log/sysboot.log")
    assert not root.exists("/bootbank/vantorbk.gz")


def test_selected_plugins_are_loaded_in_the_order_given_and_no_others(root, vantor):
    for name in ("a", "b", "c"):
        root.native(name)
    root.debug_configuration("inject:x:y:echo debug >>/tmp/ran", "line without fields")
    result = vantor("--plugin=libc.so,liba.so")
    # The malformed line is met by the loader alone, once for each file.
    malformed = (INFO, "ignoring malformed debug entry at line 2: line without fields")
    assert result.messages == [malformed] * 2 + starting("c", "a")
    assert root.started() == ["c", "a"]
    assert "debug" not in root.ran()


def test_a_selected_file_that_is_missing_is_skipped(root, vantor):
    root.native("a")
    result = vantor("--plugin=libgone.so,liba.so")
    text = linker_says("libgone.so",
                       "cannot open shared object file: No such file or directory")
    assert result.messages == [(WARNING, text)] + starting("a")
    assert root.alerts() == [text]
    assert result.status == 0


def test_a_relative_plugin_directory_is_meant_from_where_the_caller_stands(root, vantor):
    root.write("/tmp/own/libbad.so", NOT_ELF)
    result = vantor("--plugin-directory=own", cwd="/tmp")
    assert result.messages == [
        (WARNING, linker_says("libbad.so", "invalid ELF header", "/tmp/own"))]


def test_a_relative_plugin_directory_that_is_missing_is_named_in_full(vantor):
    result = vantor("--plugin-directory=own", cwd="/tmp")
    assert result.status == 1
    assert result.stderr.endswith(': No such file or directory: "/tmp/own"\n')


def test_the_run_takes_place_in_the_root_and_in_a_session_of_its_own(root, start):
    root.debug_configuration("where:a:b:pwd >/tmp/place; /usr/bin/witness")
    run = start(cwd="/tmp")
    assert run.wait().status == 0
    assert root.read("/tmp/place") == "/\n"
    assert f"session {run.pid}\n" in root.read("/tmp/seen.witness")


def test_a_process_group_leader_stays_in_its_session(root, vantor):
    root.native("alpha")
    result = vantor(group_leader=True)
    session_refused = (ERR, "unable to create session: Operation not permitted")
    assert result.messages == [session_refused] + starting("alpha")
    assert result.status == 0


def test_messages_carry_the_programs_name_and_no_process_id(root, vantor):
    root.native("alpha")
    assert [message.ident for message in vantor().syslog] == ["vantor"]


def test_a_host_without_a_system_log_boots_all_the_same(root, vantor):
    root.native("alpha", returns=3)
    root.syslog.hide()
    assert vantor().status == 0
    assert root.started() == ["alpha"]
