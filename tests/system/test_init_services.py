"""The services that init mode launches before any plugin runs."""

import pytest

from harness.messages import NO_PID_FILE, starting
from harness.syslog_recorder import ERR

SYSLOG_DAEMON = "/usr/lib/nuvex/nvsyslog/bin/nvsyslogd"
EVENT_DAEMON = "/etc/init.d/nvevtd"
NO_SYSLOG_DAEMON = f"execve({SYSLOG_DAEMON}, ...) failure: "
NO_EVENT_DAEMON = f"execve({EVENT_DAEMON}) failure: "


def noting_daemons(root):
    root.script(SYSLOG_DAEMON, 'echo "log daemon" >>/tmp/ran')
    root.script(EVENT_DAEMON, 'echo "event daemon" >>/tmp/ran')


def witnessing_daemons(root):
    root.link_program("/usr/bin/witness", SYSLOG_DAEMON)
    root.link_program("/usr/bin/witness", EVENT_DAEMON)


def seen(root, name, fact):
    """What the witness of that name noted of one kind, such as every "argument"."""
    lines = root.read("/tmp/seen." + name).splitlines()
    return [line.partition(" ")[2] for line in lines if line.startswith(fact + " ")]


def test_the_log_daemon_comes_first_then_the_event_daemon_then_plugins(root, vantor):
    noting_daemons(root)
    root.native("alpha")
    result = vantor("--init")
    assert [line.rsplit(" ", 1)[0] if "alpha" in line else line for line in root.ran()] == [
        "log daemon", "event daemon", "start alpha", "end alpha"]
    assert result.messages == starting("alpha") + [NO_PID_FILE]
    assert (result.status, result.stderr) == (0, "")


def test_without_init_no_service_is_launched(root, vantor):
    noting_daemons(root)
    root.script("/usr/lib/nuvex/nvsyslog/bin/upgrade-syslog.conf.sh", "echo upgrade >>/tmp/ran")
    root.write("/etc/syslog.conf")
    result = vantor()
    assert (result.messages, root.ran()) == ([], [])


def test_each_service_gets_one_argument(root, vantor):
    witnessing_daemons(root)
    vantor("--init")
    assert seen(root, "nvsyslogd", "argument") == [SYSLOG_DAEMON, "-i"]
    assert seen(root, "nvevtd", "argument") == [EVENT_DAEMON, "start"]


def test_each_service_gets_an_empty_environment(root, vantor):
    witnessing_daemons(root)
    vantor("--init", environment={"SECRET": "of the caller"})
    for name in ("nvsyslogd", "nvevtd"):
        assert seen(root, name, "argument")
        assert seen(root, name, "variable") == []


@pytest.mark.parametrize("leaked", [(), (3, 9), (17, 1000, 19999)])
def test_services_get_the_standard_descriptors_alone(root, vantor, leaked):
    witnessing_daemons(root)
    vantor("--init", leaked=leaked, open_files=20000)
    for name in ("nvsyslogd", "nvevtd"):
        assert seen(root, name, "descriptor") == ["0", "1", "2"]


def test_an_open_file_limit_of_a_thousand_million_delays_nothing(root, vantor):
    # The limit of the run is what the machine grants; the run's own time limit is the check.
    witnessing_daemons(root)
    assert vantor("--init", leaked=(50,), open_files=1_000_000_000).status == 0
    assert seen(root, "nvevtd", "descriptor") == ["0", "1", "2"]


def test_the_run_waits_for_each_service_to_exit(root, start):
    root.fifo("/tmp/gate")
    root.script(SYSLOG_DAEMON, "echo begin >>/tmp/ran", "read line </tmp/gate",
                "echo end >>/tmp/ran")
    root.script(EVENT_DAEMON, "echo event >>/tmp/ran")
    run = start("--init")
    run.wait_until(lambda: root.ran() == ["begin"], "the log daemon begins")
    run.wait_until_asleep()
    assert root.ran() == ["begin"]
    with open(root.path("/tmp/gate"), "w", encoding="ascii") as gate:
        gate.write("go on\n")
    assert run.wait().status == 0
    assert root.ran() == ["begin", "end", "event"]


def test_a_service_in_the_background_does_not_hold_the_run_up(root, vantor):
    # It keeps the standard descriptors and goes on after the run.
    root.fifo("/tmp/gate")
    root.script(SYSLOG_DAEMON, "{ read line </tmp/gate; } &", "echo launched >>/tmp/ran")
    root.script(EVENT_DAEMON, "true")
    assert vantor("--init").status == 0
    assert root.ran() == ["launched"]
    assert root.processes() != []


def test_the_exit_status_of_a_service_is_not_looked_at(root, vantor):
    root.script(SYSLOG_DAEMON, "exit 3")
    root.script(EVENT_DAEMON, "kill -9 $$")
    result = vantor("--init")
    assert (result.status, result.stderr, result.messages) == (0, "", [NO_PID_FILE])


def test_missing_services_are_reported_each_in_its_own_way(root, vantor):
    root.native("alpha")
    result = vantor("--init")
    reason = "No such file or directory"
    assert result.stderr == f"{NO_SYSLOG_DAEMON}{reason}\n"
    assert result.messages == [
        (ERR, NO_EVENT_DAEMON + reason), *starting("alpha"), NO_PID_FILE]
    assert [message.ident for message in result.syslog] == ["vantor"] * 3
    assert result.status == 0


def test_services_that_may_not_be_executed_are_reported(root, vantor):
    root.write(SYSLOG_DAEMON, "#!/bin/sh\n", mode=0o644)
    root.write(EVENT_DAEMON, "no program at all\n", mode=0o755)
    result = vantor("--init")
    assert result.stderr == f"{NO_SYSLOG_DAEMON}Permission denied\n"
    assert result.messages == [(ERR, NO_EVENT_DAEMON + "Exec format error"), NO_PID_FILE]


def test_services_are_launched_before_a_failure_of_the_plugin_directory(root, vantor):
    noting_daemons(root)
    result = vantor("--init", "--plugin-directory=/nowhere")
    assert result.status == 1
    assert root.ran() == ["log daemon", "event daemon"]
    # The log daemon is reloaded all the same, last of all.
    assert result.messages[-1] == NO_PID_FILE
    assert len(result.messages) == 2


def test_init_with_a_drawing_launches_and_reloads_too(root, vantor):
    noting_daemons(root)
    result = vantor("--init", "--dump-dependency-tree=/tmp/graph.dot")
    assert (result.status, result.messages) == (0, [NO_PID_FILE])
    assert root.ran() == ["log daemon", "event daemon"]
    assert root.read("/tmp/graph.dot") == "digraph g {\n}\n"


def test_init_with_an_invocation_launches_and_reloads_too(root, vantor):
    noting_daemons(root)
    root.native("alpha")
    result = vantor("--init", "--invoke", "--method=start", "--plugin=libalpha.so")
    assert (result.status, result.messages) == (0, [NO_PID_FILE])
    assert root.ran()[:2] == ["log daemon", "event daemon"]
    assert root.started() == ["alpha"]
    assert not root.exists("/var/log/sysboot.log")


def test_a_refused_invocation_launches_nothing(root, vantor):
    noting_daemons(root)
    assert vantor("--init", "--invoke").status == 1
    assert root.ran() == []
