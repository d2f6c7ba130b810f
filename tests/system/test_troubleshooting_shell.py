"""The troubleshooting shell of the interactive prompt."""

import os
import subprocess
import sys

import pytest

from harness.messages import starting
from harness.prompt import ERASE, prompt, redrawn
from harness.syslog_recorder import ERR

SHELL = "/usr/bin/sh"
CAP_SYS_ADMIN = 21


@pytest.fixture
def troubleshoot(root, start, terminal):
    """Answers the prompt of the plugin "a" with "t" and returns the run."""

    def begin(**how):
        run = start("--interactive", "--plugin=liba.so", stdin=terminal.slave,
                    stdout=terminal.slave, **how)
        terminal.answer(run, "t", redrawn("t"))
        return run

    root.native("a")
    return begin


def facts(root):
    """What the witness in the shell's place noted."""
    return root.read("/tmp/seen.sh").splitlines()


def test_the_shell_gets_its_own_name_and_no_argument(root, terminal, troubleshoot):
    root.link_program("/usr/bin/witness", SHELL)
    result = troubleshoot().wait()
    assert [fact for fact in facts(root) if fact.startswith("argument")] == ["argument /bin/sh"]
    assert terminal.transcript() == prompt("a", "t") + ERASE
    assert result.messages == starting("a")
    assert (result.status, result.stderr) == (0, "")


def test_the_shell_leads_a_session_with_the_terminal_for_its_own(root, troubleshoot):
    root.link_program("/usr/bin/witness", SHELL)
    run = troubleshoot()
    run.wait()
    assert "leads its session: yes" in facts(root)
    assert "terminal of its session: yes" in facts(root)
    assert f"session {run.pid}" not in facts(root)


@pytest.mark.parametrize("how", [
    {},
    {"leaked": (3, 9, 1000), "open_files": 20000},
    {"leaked": (9,), "open_files": 1_000_000_000},
], ids=["none leaked", "some leaked", "highest limit"])
def test_the_shell_gets_the_standard_descriptors_alone(root, troubleshoot, how):
    root.link_program("/usr/bin/witness", SHELL)
    troubleshoot(**how).wait()
    assert [fact for fact in facts(root) if fact.startswith("descriptor")] == [
        "descriptor 0", "descriptor 1", "descriptor 2"]


def test_the_plugin_runs_after_the_shell_has_ended(root, terminal, troubleshoot):
    run = troubleshoot()
    terminal.type("echo repaired >>/tmp/ran\n")
    run.wait_until(lambda: root.ran() == ["repaired"], "the shell runs the command")
    run.wait_until_every_thread_sleeps()
    assert root.ran() == ["repaired"]
    terminal.type("exit 3\n")
    result = run.wait()
    # The shell's exit status is not looked at.
    assert (result.status, result.messages) == (0, starting("a"))
    assert [line.split()[0] for line in root.ran()] == ["repaired", "start", "end"]
    assert terminal.transcript().endswith(ERASE)


def test_the_shell_is_shown_an_ordinary_terminal(root, terminal, troubleshoot):
    before = terminal.attributes()
    run = troubleshoot()
    assert terminal.attributes() == before
    terminal.type("echo typed >/tmp/ran\n")
    run.wait_until(root.ran, "the shell runs the command")
    terminal.type("exit\n")
    run.wait()
    # What is typed to the shell is echoed, unlike the keys of the prompt.
    assert prompt("a", "t") in terminal.transcript()
    assert "echo typed >/tmp/ran\n" in terminal.transcript()


def test_the_shell_can_open_its_terminal_by_name(root, terminal, troubleshoot):
    if "tty" not in root.devices:
        pytest.skip("no /dev/tty can be made here")
    run = troubleshoot()
    terminal.type("echo to the terminal >/dev/tty\n")
    terminal.expect("\nto the terminal\n")
    terminal.type("exit\n")
    assert run.wait().status == 0


def test_a_shell_that_is_killed_lets_the_plugin_run(root, terminal, troubleshoot):
    run = troubleshoot()
    terminal.type("kill -9 $$\n")
    assert run.wait().messages == starting("a")
    assert root.started() == ["a"]


def test_a_missing_shell_is_reported_and_the_plugin_runs(root, terminal, troubleshoot):
    root.remove(SHELL)
    result = troubleshoot().wait()
    assert result.messages == [
        (ERR, "unable to exec shell: No such file or directory"), *starting("a")]
    assert terminal.transcript() == prompt("a", "t") + ERASE
    assert (result.status, result.stderr, root.started()) == (0, "", ["a"])


def test_the_prompt_of_the_next_plugin_follows_the_shell(root, start, terminal):
    root.native("a")
    root.native("b")
    root.link_program("/usr/bin/true", SHELL)
    run = start("--interactive", "--plugin=liba.so,libb.so", stdin=terminal.slave,
                stdout=terminal.slave)
    terminal.answer(run, "T", redrawn("t"))
    terminal.answer(run, "s", redrawn("s"))
    run.wait()
    assert terminal.transcript() == prompt("a", "t") + ERASE + prompt("b", "s")


def test_without_a_terminal_the_shell_reads_on_behind_the_key(root, start):
    root.native("a")
    read_end, write_end = os.pipe()
    os.write(write_end, b"techo from the pipe >/tmp/said\nexit\n")
    run = start("--interactive", stdin=read_end)
    result = run.wait()
    os.close(read_end)
    os.close(write_end)
    assert root.read("/tmp/said") == "from the pipe\n"
    assert result.stdout == prompt("a", "t") + ERASE
    assert result.messages[-1:] == starting("a")


OWNER = """
import fcntl, os, signal, termios
fcntl.ioctl(0, termios.TIOCSCTTY, 0)
assert os.tcgetpgrp(0) == os.getpid()
print("it is mine", flush=True)
signal.pause()
"""


def may_steal_terminals():
    """Whether this is the machine's root with all that goes with it, and not a namespace's."""
    with open("/proc/self/status", encoding="ascii") as file:
        effective = next(line for line in file if line.startswith("CapEff"))
    with open("/proc/self/uid_map", encoding="ascii") as file:
        whole = file.read().split() == ["0", "0", "4294967295"]
    return whole and bool(int(effective.split()[1], 16) >> CAP_SYS_ADMIN & 1)


def test_a_terminal_is_taken_over_from_another_session(root, terminal, troubleshoot):
    if not may_steal_terminals():
        pytest.skip("only an unrestricted root may take a terminal over")
    root.link_program("/usr/bin/witness", SHELL)
    with subprocess.Popen([sys.executable, "-S", "-c", OWNER], stdin=terminal.slave,
                          stdout=subprocess.PIPE, text=True, start_new_session=True) as owner:
        try:
            assert owner.stdout.readline() == "it is mine\n"
            troubleshoot().wait()
            assert "terminal of its session: yes" in facts(root)
        finally:
            owner.kill()
