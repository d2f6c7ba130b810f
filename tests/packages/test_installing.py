"""Installing, upgrading, removing and purging the packages on a fresh host."""

import os

import pytest
from support.booting import boot, lay_out_host, links_of
from support.deb import make_deb
from support.host import RECORD

ALL = ["vantor", "vantor-hostlibs", "vantor-dev"]
LATER = "9.0-1"
# What the tests put there, and their log daemon.
LAID_OUT = ("/tmp/", "/usr/libexec/vantor/plugins/", "/usr/lib/nuvex/nvsyslog",
            "/usr/lib/nuvex/nvcli/note", "/run/nuvex/nvsyslogd", "/etc/init.d/nvevtd")


def test_installing_boots_nothing_and_arranges_the_next_boot(host):
    assert host.state_of("vantor") == host.state_of("vantor-hostlibs") == "installed"
    assert not host.exists("/var/log/sysboot.log")
    assert not host.exists(RECORD)
    assert {f"rc{level}.d/S" for level in "2345"} <= links_of(host)


def test_the_installed_program_finds_its_libraries_in_the_systems_folders(host):
    lines = host.run("ldd", "/usr/sbin/vantor").splitlines()
    assert not [line for line in lines if "not found" in line]
    for library in ("libbasekit.so", "libnvkctl.so"):
        assert [line for line in lines if library in line and "-linux-gnu/" in line], lines
    assert "--init" in host.run("vantor", "--help")


def test_the_installed_completion_knows_the_installed_commands(host):
    if not host.has_proc:
        pytest.skip("without /proc bash has no files for its process substitutions")
    lay_out_host(host)
    ask = """
        . /usr/share/bash-completion/completions/nvcli
        COMP_WORDS=(nvcli {0}) COMP_CWORD=$((${{#COMP_WORDS[@]}} - 1))
        _nvcli nvcli; printf '%s\\n' "${{COMPREPLY[@]}}" """
    assert host.run("bash", "-c", ask.format("no")).split() == ["note"]
    assert host.run("bash", "-c", ask.format("note ''")).split() == ["add"]
    assert host.run("bash", "-c", ask.format("note add --")).split() == ["--help", "--text="]


def later(packages, folder, change=lambda unpacked: None):
    """The packages of a later version."""
    made = []
    for name in ("vantor", "vantor-hostlibs"):
        os.mkdir(f"{folder}/{name}")
        made.append(packages[name].with_version(
            LATER, f"{folder}/{name}", change if name == "vantor" else lambda unpacked: None))
    return made


def test_an_upgrade_keeps_the_administrators_settings(host, packages, tmp_path):
    host.write("/etc/default/vantor", "VANTOR_PARALLEL=yes # ours\n")

    def new_defaults(unpacked):
        with open(f"{unpacked}/etc/default/vantor", "a", encoding="utf-8") as file:
            file.write("# a word more\n")

    lay_out_host(host)
    done = host.dpkg_install(*later(packages, tmp_path, new_defaults))
    assert done.returncode == 0, done.stdout + done.stderr
    assert host.run("dpkg-query", "-W", "-f=${Version}", "vantor") == LATER
    assert host.read("/etc/default/vantor") == "VANTOR_PARALLEL=yes # ours\n"
    assert {f"rc{level}.d/S" for level in "2345"} <= links_of(host)
    assert not host.exists("/var/log/sysboot.log")
    assert boot(host).status == 0


def test_an_upgrade_renews_settings_that_nobody_changed(host, packages, tmp_path):
    def new_defaults(unpacked):
        with open(f"{unpacked}/etc/default/vantor", "a", encoding="utf-8") as file:
            file.write("# a word more\n")

    assert host.dpkg_install(*later(packages, tmp_path, new_defaults)).returncode == 0
    assert host.read("/etc/default/vantor").endswith("# a word more\n")


PLUGIN = '''{"metadata": {"version": 1, "requires": ["storag"], "provides": []},
"operations": {"start": []}}'''
FOUND = "vantor: vantor-analyze verify says of the plugin directory:"


def test_installing_a_plugin_tells_what_is_wrong_with_it(host, tmp_path):
    plugin = make_deb(tmp_path, "a-plugin", {"/usr/libexec/vantor/plugins/vault.json": PLUGIN})
    done = host.dpkg_install(plugin)
    assert done.returncode == 0, done.stdout + done.stderr
    found = done.stdout.partition(FOUND + "\n")[2]
    assert "/usr/libexec/vantor/plugins/vault.json" in found and "error[no-provider]: " in found
    assert host.state_of("a-plugin") == host.state_of("vantor") == "installed"


def test_removing_the_plugin_at_fault_leaves_nothing_to_tell(host, tmp_path):
    plugin = make_deb(tmp_path, "a-plugin", {"/usr/libexec/vantor/plugins/vault.json": PLUGIN})
    host.dpkg_install(plugin)
    assert FOUND not in host.run("dpkg", "--remove", "a-plugin")
    assert host.state_of("vantor") == "installed"


def test_a_plugin_is_checked_as_the_next_boot_filters_it(host, tmp_path):
    host.write("/etc/default/vantor", "VANTOR_OPTIONS='\n--disable-plugins=vault\n'\n")
    plugin = make_deb(tmp_path, "a-plugin", {"/usr/libexec/vantor/plugins/vault.json": PLUGIN})
    done = host.dpkg_install(plugin)
    assert done.returncode == 0, done.stdout + done.stderr
    assert "error[no-provider]" not in done.stdout
    assert "note[no-provider]" in done.stdout


def test_a_check_that_cannot_be_run_stops_no_installation(host, tmp_path):
    host.script("/usr/sbin/vantor-analyze", "echo broken; exit 127")
    plugin = make_deb(tmp_path, "a-plugin", {"/usr/libexec/vantor/plugins/vault.json": PLUGIN})
    done = host.dpkg_install(plugin)
    assert done.returncode == 0, done.stdout + done.stderr
    assert FOUND + "\nbroken\n" in done.stdout
    assert host.state_of("a-plugin") == host.state_of("vantor") == "installed"


def test_removing_leaves_settings_and_nothing_that_runs(host):
    lay_out_host(host)
    boot(host)
    host.run("dpkg", "--remove", "vantor")
    assert host.state_of("vantor") == "config-files"
    assert not host.exists("/usr/sbin/vantor")
    assert host.exists("/etc/default/vantor")
    done = host.try_run("/etc/init.d/vantor", "start")
    assert (done.returncode, done.stdout, done.stderr) == (0, "", "")


def test_purging_leaves_no_stray_file(connected_host, hosts, packages, tmp_path):
    host = hosts.copy_of(connected_host.folder)
    before = host.names()
    host.apt_install(*(packages[name] for name in ALL))
    host.write("/etc/default/vantor", "VANTOR_PARALLEL=yes\n")
    lay_out_host(host)
    assert boot(host).status == 0
    # An interrupted boot leaves an unfinished log.
    host.write("/var/log/sysboot.log.a1B2c3")
    host.write("/usr/libexec/vantor/plugins/libbroken.so", "no shared object")
    boot(host)
    assert host.exists("/var/run/nuvex/system-alerts")
    assert host.dpkg_install(*later(packages, tmp_path)).returncode == 0

    # What the test itself laid out is not the packages'.
    for name in sorted(host.names() - before):
        if name.startswith(LAID_OUT):
            host.run("rm", "-rf", name)
    host.run("apt-get", "purge", "-y", *ALL)
    host.run("apt-get", "autoremove", "--purge", "-y")
    assert host.names() ^ before == {RECORD, "/dev/log"}


def test_a_hosts_own_libraries_take_the_place_of_ours(connected_host, hosts, packages, tmp_path):
    host = hosts.copy_of(connected_host.folder)
    own = make_deb(tmp_path, "a-hosts-own", Provides="vantor-host-libraries",
                   Conflicts="vantor-host-libraries", Replaces="vantor-host-libraries")
    host.apt_install(own, packages["vantor"])
    assert host.state_of("vantor") == "installed"
    assert host.state_of("vantor-hostlibs") != "installed"


def test_two_sets_of_host_libraries_do_not_lie_beside_each_other(host, tmp_path):
    own = make_deb(tmp_path, "a-hosts-own", Provides="vantor-host-libraries",
                   Conflicts="vantor-host-libraries", Replaces="vantor-host-libraries")
    host.apt_install(own)
    assert host.state_of("a-hosts-own") == host.state_of("vantor") == "installed"
    assert host.state_of("vantor-hostlibs") != "installed"
    assert not host.exists("/usr/bin/nvcli")


def test_without_host_libraries_the_program_is_not_installed(connected_host, hosts, packages):
    host = hosts.copy_of(connected_host.folder)
    done = host.dpkg_install(packages["vantor"])
    assert done.returncode != 0
    assert "vantor depends on vantor-hostlibs | vantor-host-libraries" in done.stderr
