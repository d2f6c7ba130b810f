"""The ground the other tests stand on: what it must notice, and that it leaves nothing behind."""

import os

import pytest

from harness.isolation import Isolation
from harness.sanitizers import EXIT_STATUS, SanitizerReport, check
from harness.waiting import wait_until


def test_the_program_sees_the_root_alone(root, vantor):
    root.debug_configuration("look: : :ls -a / >/tmp/top; ls /etc >/tmp/etc")
    vantor()
    assert set(root.read("/tmp/top").split()) == {".", "..", *os.listdir(root.folder)}
    assert root.read("/tmp/etc").split() == ["init.d", "nuvex"]


def test_a_removed_root_leaves_no_file_no_mount_and_no_process(session):
    made = session.new_root()
    made.script("/usr/bin/lasting", "echo $$ >/tmp/pid", "sleep 1000")
    process = os.posix_spawn(session.enter, ["enter", made.folder, "/usr/bin/lasting"], {
        "PATH": "/usr/bin"})
    wait_until(lambda: made.read("/tmp/pid"), "the script runs")
    assert process in made.processes()
    made.remove_all()
    os.waitpid(process, 0)
    assert made.processes() == []
    assert not os.path.exists(made.folder)
    assert Isolation.mounts_below(made.folder) == []


def test_roots_share_no_file_that_a_test_writes(session, root):
    other = session.new_root()
    try:
        root.write("/usr/bin/sh", "changed")
        assert os.stat(other.path("/usr/bin/sh")).st_size > len("changed")
    finally:
        other.remove_all()


@pytest.mark.parametrize("stderr", [
    "==7==ERROR: AddressSanitizer: heap-use-after-free on address 0x1",
    "==7==ERROR: LeakSanitizer: detected memory leaks",
    "WARNING: ThreadSanitizer: data race (pid=7)",
    "FATAL: ThreadSanitizer: unexpected memory mapping",
    "/src/graph/Node.cc:7:3: runtime error: signed integer overflow",
    "AddressSanitizer:DEADLYSIGNAL",
    "==7==LeakSanitizer has encountered a fatal error.",
])
def test_a_sanitizer_report_fails_the_run(stderr):
    with pytest.raises(SanitizerReport):
        check(0, f"ordinary\n{stderr}\n")
    check(0, "ordinary\n")


def test_the_sanitizers_exit_status_fails_the_run():
    with pytest.raises(SanitizerReport):
        check(EXIT_STATUS, "")


def test_many_messages_are_recorded_whole_and_in_order(root, vantor):
    names = [f"README{number}" for number in range(400)]
    for name in names:
        root.write(f"/usr/libexec/vantor/plugins/{name}")
    result = vantor()
    assert [text for _, text in result.messages] == [
        f"ignoring plugin '{name}' of unspecified type..." for name in root.listing()]
    assert sorted(root.listing()) == sorted(names)
