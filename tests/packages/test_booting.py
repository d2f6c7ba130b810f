"""Boots of a host on which the packages are installed, by the installed init script."""

import gzip

import pytest
from support.booting import add_plugin, boot, lay_out_host
from support.host import RECORD

DEFAULTS = "/etc/default/vantor"
WITHOUT_RECORD = "booting as if no run-once plugin had run"


@pytest.fixture(name="machine")
def fixture_machine(host):
    """A host with daemons and plugins that has booted once."""
    lay_out_host(host)
    host.write(RECORD, gzip.compress(b"vantor.run-once=\n"))
    return host


def record_of(machine):
    with open(machine.path(RECORD), "rb") as file:
        return gzip.decompress(file.read()).decode()


def test_the_installed_script_boots_the_host(machine):
    seen = boot(machine)
    assert (seen.status, seen.stdout, seen.stderr) == (0, "", "")
    assert seen.notes[:3] == ["syslog daemon -i", "event daemon start", "plugin first"]
    assert sorted(seen.notes[3:-1]) == ["plugin once", "plugin second"]
    assert seen.notes[-1] == "syslog reloaded"
    assert [len(seen.logged(f"executing start plugin: {name}"))
            for name in ("first", "once", "second")] == [1, 1, 1]
    log = machine.read("/var/log/sysboot.log")
    assert all(name in log for name in ("first", "once", "second"))
    assert record_of(machine) == "vantor.run-once=once1,\n"


def test_the_next_boot_runs_no_run_once_plugin_again(machine):
    assert "plugin once" in boot(machine).notes
    seen = boot(machine)
    assert (seen.status, seen.stderr) == (0, "")
    assert "plugin once" not in seen.notes
    assert "plugin second" in seen.notes
    assert seen.logged("ignoring plugin 'once' because version '1' has already been run")
    assert record_of(machine) == "vantor.run-once=once1,\n"


def test_a_torn_record_does_not_keep_the_host_from_booting(machine):
    boot(machine)
    with open(machine.path(RECORD), "rb") as file:
        content = file.read()
    machine.write(RECORD, content[:-5])
    seen = boot(machine)
    assert (seen.status, seen.stderr) == (
        0, f"vantor: {RECORD} is no whole gzip file; {WITHOUT_RECORD}\n")
    assert {"plugin first", "plugin once", "plugin second"} <= set(seen.notes)
    assert record_of(machine) == "vantor.run-once=once1,\n"


def test_a_missing_record_does_not_keep_the_host_from_booting(machine):
    machine.remove(RECORD)
    seen = boot(machine)
    assert (seen.status, seen.stderr) == (0, f"vantor: {RECORD} is missing; {WITHOUT_RECORD}\n")
    assert {"plugin first", "plugin once", "plugin second"} <= set(seen.notes)


def test_a_broken_defaults_file_does_not_keep_the_host_from_booting(machine):
    machine.write(DEFAULTS, "VANTOR_PARALLEL=yes\nVANTOR_PLUGIN_FLAGS='never closed\n")
    seen = boot(machine)
    assert (seen.status, seen.stderr) == (
        0, f"vantor: {DEFAULTS} does not run to its end; booting without it\n")
    assert {"plugin first", "plugin second"} <= set(seen.notes)


def test_flags_and_options_come_from_the_defaults_file(machine):
    add_plugin(machine, "diagnosis", required_flags=["debug"])
    add_plugin(machine, "quick tour", disabling_flags=["no tour"])
    assert "plugin diagnosis" not in boot(machine).notes
    machine.write(DEFAULTS, "VANTOR_PLUGIN_FLAGS='debug,no tour'\n"
                  "VANTOR_OPTIONS='\n--disable-plugins=second\n--trace\n'\n")
    seen = boot(machine)
    assert "plugin diagnosis" in seen.notes
    assert not {"plugin quick tour", "plugin second"} & set(seen.notes)
    assert "starting execution of plugin: diagnosis\n" in seen.stdout


def test_parallel_comes_from_the_defaults_file(machine):
    """Two commands, each of which waits for the other one to run, and gives up in the end."""
    machine.script("/usr/bin/meet", "touch /tmp/$1", "for i in $(seq $3); do",
                   "[ ! -e /tmp/$2 ] || exit 0; sleep 0.05", "done", "exit 1")
    for parallel, patience, gave_up in [("no", 4, ["a"]), ("yes", 1000, [])]:
        machine.remove("/tmp/a")
        machine.remove("/tmp/b")
        machine.write("/etc/nuvex/vantor/debug.conf",
                      f"a: : :meet a b {patience}\nb: : :meet b a {patience}\n")
        machine.write(DEFAULTS, f"VANTOR_PARALLEL={parallel}\n")
        seen = boot(machine)
        assert seen.status == 0
        assert len(seen.logged("executing start plugin: a")) == 1
        injections = [one.text for one in seen.syslog if one.text.startswith("debug injection")]
        assert injections == [f"debug injection '{name}' returned 0x000100" for name in gave_up]


def test_a_mistake_in_the_options_does_not_keep_the_host_from_booting(machine):
    machine.write(DEFAULTS, "VANTOR_OPTIONS='--trace --parallel'\n")
    seen = boot(machine)
    assert seen.status == 0
    assert "plugin second" in seen.notes
    assert (f"vantor: {DEFAULTS}: VANTOR_OPTIONS: unrecognized option '--trace --parallel'; "
            "booting without them\n") in seen.stderr


def test_the_scripts_status_is_the_programs(machine):
    machine.write(DEFAULTS, "VANTOR_OPTIONS=--plugin-directory=/nowhere\n")
    seen = boot(machine)
    assert seen.status == 1
    assert seen.stderr.startswith("Failed to boot the system.")
