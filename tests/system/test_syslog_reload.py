"""How init mode has the log daemon read its configuration again, after the plugins."""

import pytest

from harness.messages import NO_PID_FILE, UNREADABLE_PID, starting
from harness.signal_listener import SignalListener
from harness.syslog_recorder import WARNING

PID_FILE = "/var/run/nuvex/nvsyslogd.pid"
OLD_CONFIGURATION = "/etc/syslog.conf"
UPGRADE = "/usr/lib/nuvex/nvsyslog/bin/upgrade-syslog.conf.sh"
NO_SUCH_PROCESS = 2000000000  # beyond every kernel's highest process id


@pytest.fixture
def init(root, vantor):
    """Runs in init mode with services that do nothing."""
    root.script("/usr/lib/nuvex/nvsyslog/bin/nvsyslogd", "true")
    root.script("/etc/init.d/nvevtd", "true")
    return lambda *arguments: vantor("--init", *arguments)


@pytest.mark.parametrize("form", ["{}\n", "{}", " \n\t {}\n", "{} and more\n", "+{}\n"])
def test_the_process_of_the_pid_file_is_signalled(root, start, init, form):
    del init  # laid the services out
    with SignalListener() as daemon:
        root.write(PID_FILE, form.format(daemon.pid))
        run = start("--init")
        result = run.wait()
        assert daemon.signals() == [("SIGUSR1", run.pid)]
    assert (result.status, result.stderr, result.messages) == (0, "", [])


@pytest.mark.parametrize("form", [
    "", "\n", "pid {}\n", "x{}", "99999999999999999999", "4294967297"])
def test_a_pid_file_without_a_process_id_signals_nobody(root, init, form):
    with SignalListener() as daemon:
        root.write(PID_FILE, form.format(daemon.pid))
        result = init()
        assert daemon.signals() == []
    assert (result.status, result.messages) == (0, [UNREADABLE_PID])


def test_a_missing_pid_file_is_reported_once(init):
    assert init().messages == [NO_PID_FILE]


def test_a_process_that_is_gone_is_reported(root, init):
    root.write(PID_FILE, f"{NO_SUCH_PROCESS}\n")
    assert init().messages == [(WARNING, "failed to reload nvsyslogd: No such process")]


def test_an_old_configuration_is_upgraded_before_the_daemon_is_signalled(root, init):
    root.native("alpha")
    root.write(OLD_CONFIGURATION)
    with SignalListener() as daemon:
        # The daemon is found only if the script has run by then.
        root.script(UPGRADE, "echo upgrade >>/tmp/ran", f"echo {daemon.pid} >{PID_FILE}")
        result = init()
        assert len(daemon.signals()) == 1
    assert result.messages == starting("alpha")
    assert root.ran()[-1] == "upgrade"
    assert root.started() == ["alpha"]


def test_without_an_old_configuration_the_daemon_is_signalled_alone(root, init):
    root.script(UPGRADE, "echo upgrade >>/tmp/ran")
    with SignalListener() as daemon:
        root.write(PID_FILE, f"{daemon.pid}\n")
        init()
        assert len(daemon.signals()) == 1
    assert root.ran() == []


def test_a_failing_upgrade_script_is_not_looked_at(root, init):
    root.write(OLD_CONFIGURATION)
    root.script(UPGRADE, "echo upgrade >>/tmp/ran", "exit 9")
    with SignalListener() as daemon:
        root.write(PID_FILE, f"{daemon.pid}\n")
        result = init()
        assert len(daemon.signals()) == 1
    assert (result.status, result.messages, root.ran()) == (0, [], ["upgrade"])


def test_the_upgrade_script_runs_after_the_profiling_log_is_written(root, init):
    root.write(OLD_CONFIGURATION)
    root.script(UPGRADE, "cat /var/log/sysboot.log >/tmp/log")
    init()
    assert root.read("/tmp/log") == root.read("/var/log/sysboot.log") != ""
