"""The plugin author's kit, built out of tree from the installed packages alone, and booted."""

import os
import re

import pytest
from support.booting import PLUGINS, boot, lay_out_daemons
from support.deb import output_of
from support.host import RECORD

EXAMPLES = "/usr/share/doc/vantor-dev/examples"
COMMANDS = "/usr/lib/nuvex/nvcli/kit.json"
INSTALLED = [f"{PLUGINS}/{name}" for name in ("libagent.so", "libvolume.so", "welcome.json")]
# What each plugin of the kit notes, in the order in which they wait for each other.
ORDER = ["volume", "agent", "welcome", "with blanks", "debug"]
BUILDS = {
    "cmake": "cmake -B build && cmake --build build && cmake --install build",
    "make": "make && make install",
}


@pytest.fixture(name="author", scope="module")
def fixture_author(dev_root, packages, session_hosts):
    """The machine of somebody who writes plugins: compilers, and the three packages."""
    host = session_hosts.copy_of(dev_root)
    done = host.dpkg_install(*packages.values())
    assert done.returncode == 0, done.stdout + done.stderr
    os.makedirs(host.path("/bootbank"), exist_ok=True)
    return host


@pytest.fixture(name="built", scope="module", params=BUILDS)
def fixture_built(author, request):
    """The kit as one of the two ways builds and installs it, on a host that can boot."""
    for name in [*INSTALLED, COMMANDS]:
        author.remove(name)
    author.run("sh", "-ec", f"rm -rf /tmp/kit; cp -r {EXAMPLES} /tmp/kit; cd /tmp/kit; "
               + BUILDS[request.param])
    author.run("install", "-D", "-m", "644", "/tmp/kit/debug.conf",
               "/etc/nuvex/vantor/debug.conf")
    lay_out_daemons(author)
    return author


@pytest.fixture(name="kit")
def fixture_kit(built):
    """The same, as if it had never booted."""
    built.remove(RECORD)
    built.remove("/var/run/kit/boot")
    return built


def test_everything_lies_where_it_is_looked_for(kit):
    assert all(kit.exists(name) for name in [*INSTALLED, COMMANDS])


def test_the_kit_boots_in_its_order(kit):
    seen = boot(kit)
    assert seen.status == 0
    assert kit.read("/var/run/kit/boot").splitlines() == ORDER
    assert not [one.text for one in seen.syslog if one.priority < 14 and "nuvex" not in one.text]


def test_a_second_boot_leaves_out_what_runs_once(kit):
    boot(kit)
    seen = boot(kit)
    assert kit.read("/var/run/kit/boot").splitlines() == [
        note for note in ORDER if note != "agent"]
    assert seen.logged("ignoring plugin 'agent' because version '1.0' has already been run")


def test_plugins_show_each_other_nothing_but_their_interface(kit):
    for name in INSTALLED[:2]:
        lines = output_of("readelf", "-W", "--dyn-syms", kit.path(name)).splitlines()
        shown = {
            line.split()[7] for line in lines
            if re.search(r" (GLOBAL|WEAK) +DEFAULT +\d+ ", line)
        }
        # What the standard library's templates leave has to be one thing in the whole process.
        assert {one for one in shown if not one.startswith("_Z")} == {"operations", "metadata"}
        assert not [one for one in shown if "StartAgent" in one or "make_volume" in one]


def test_the_readmes_commands_do_what_it_says(kit):
    assert "--text=TEXT" in kit.run(
        "nvcli", "--directory=/tmp/kit/commands", "kit", "note", "add", "--help")
    traced = kit.run("vantor", "--trace", "--plugin=libvolume.so,libagent.so,welcome.json")
    assert re.findall(r"starting execution of plugin: (\w+)", traced) == [
        "volume", "agent", "welcome"]
    assert kit.read("/var/run/kit/boot").splitlines() == ORDER[:4]


def configure(author, lines):
    """The finished run of CMake on a project of these lines."""
    author.write("/tmp/own/CMakeLists.txt", "cmake_minimum_required(VERSION 3.25)\n"
                 "project(own LANGUAGES C)\nfind_package(vantor-plugin 0.1 REQUIRED)\n" + lines)
    author.write("/tmp/own/one.c", "#include <vantor/plugin.h>\nVANTOR_METHOD(go) { return 0; }\n"
                 "VANTOR_OPERATIONS(go);\nVANTOR_METADATA_1(NULL, NULL);\n")
    author.run("rm", "-rf", "/tmp/own/build")
    return author.try_run("cmake", "-S", "/tmp/own", "-B", "/tmp/own/build")


def test_the_helper_gives_the_file_its_name_whatever_the_plugin_is_called(author):
    assert configure(author, "vantor_add_plugin(libone.2 SOURCES one.c)\n").returncode == 0
    author.run("cmake", "--build", "/tmp/own/build")
    author.run("env", "DESTDIR=/tmp/own/image", "cmake", "--install", "/tmp/own/build")
    assert author.exists(f"/tmp/own/image{PLUGINS}/liblibone.2.so")


@pytest.mark.parametrize("line", [
    "vantor_add_plugin(one)", "vantor_add_plugin(one one.c)", "vantor_add_plugin(one SOURCES)",
])
def test_the_helper_says_how_it_is_used(author, line):
    done = configure(author, line + "\n")
    assert done.returncode != 0
    assert "usage: vantor_add_plugin(<name> SOURCES <file>...)" in done.stderr


def test_a_later_interface_is_not_taken_for_this_one(author):
    done = configure(author, "find_package(vantor-plugin 7 REQUIRED)\n")
    assert done.returncode != 0
    assert '"7"' in done.stderr
