"""Times after January 2038, and files that are large or have large inode numbers.

Each is an ordinary case on 64 bits; on 32 bits every call must be the wide one of its kind.
"""

import ctypes
import errno
import os
import subprocess
from datetime import datetime, timedelta, timezone

import pytest

from harness.base_root import compile_program, linked_files
from harness.elf import exports, imports, plain, word_size_of
from harness.json_plugin import describe_notes, write_plugin
from harness.messages import starting
from harness.private_root import (
    DEBUG_CONFIGURATION, HOST_PROFILE, PLUGINS, PROFILING_LOG, RUN_ONCE_RECORD, SYSTEM_ALERTS)
from harness.syslog_recorder import ERR, INFO

LAST_OF_32_BITS = 0x7FFFFFFF
YEAR_2040 = 2208988800
_CLOCK = os.path.join(os.path.dirname(os.path.abspath(__file__)),
                      "harness", "programs", "ticking_clock.c")


def in_utc(seconds):
    return datetime(1970, 1, 1, tzinfo=timezone.utc) + timedelta(seconds=seconds)


def named(seconds):
    """The time in words, which also names a test."""
    return f"{in_utc(seconds):%Y-%m-%d %H:%M:%S}"


def logged(seconds):
    """A time of the profiling log."""
    return named(seconds) + ".000042"


@pytest.fixture(name="clock_from")
def fixture_clock_from(session, root):
    """clock_from(time) gives the root's programs a clock that ticks with each reading."""
    if "asan" in session.base.sanitizers or "tsan" in session.base.sanitizers:
        pytest.skip("a sanitizer's library must be the first that is loaded")

    def clock_from(beginning):
        compile_program(
            _CLOCK, root.path("/usr/lib/ticking-clock.so"), "-shared", "-fPIC",
            "-D_FILE_OFFSET_BITS=64", "-D_TIME_BITS=64", f"-DBEGINNING={beginning}LL")
        root.write("/etc/ld.so.preload", "/usr/lib/ticking-clock.so\n")
    return clock_from


# The readings: the default seed, the start, the plugin's start and its end, the end.
@pytest.mark.parametrize("beginning", [
    LAST_OF_32_BITS - 3, LAST_OF_32_BITS - 2, LAST_OF_32_BITS - 1, YEAR_2040, 0xFFFFFFFD,
    253402300790,
], ids=named)
def test_the_profiling_log_of_any_time(root, vantor, clock_from, beginning):
    clock_from(beginning)
    root.native("alpha")
    result = vantor("--trace")
    seed = (beginning + (1 << 31)) % (1 << 32) - (1 << 31)  # a signed number of 32 bits
    assert root.profiling_log()[1:] == [
        f"[{logged(beginning + 2)} - {logged(beginning + 3)}] sysboot: alpha",
        "=== Vantor configuration info ===",
        f" Start: {logged(beginning + 1)}", f" End: {logged(beginning + 4)}",
        " Verbose: 0", " Parallel: 0", " Randomize: 0", " Interactive Mode: 0",
        f" Random Seed: {seed}"]
    assert result.stdout == ("starting execution of plugin: alpha\n"
                             "completed execution of plugin: alpha (took 1000000 us)\n")


def test_the_log_after_2038_as_it_is_read(root, vantor, clock_from):
    clock_from(YEAR_2040)
    vantor()
    assert root.profiling_log()[2:4] == [
        " Start: 2040-01-01 00:00:01.000042", " End: 2040-01-01 00:00:02.000042"]


def test_a_system_alert_after_2038(root, vantor, clock_from):
    if not os.path.exists(os.path.join(root.base.build, "lib", "libnvkctl.so")):
        pytest.skip("how the host's own library writes alerts is its own affair")
    clock_from(YEAR_2040)
    root.write(f"{PLUGINS}/libx.so", "no shared object")
    vantor()
    [alert] = root.read(SYSTEM_ALERTS).splitlines()
    assert alert.startswith("2040-01-01T00:00:02Z exception occurred whilst loading plugin libx.so")


@pytest.fixture(name="host")
def fixture_host(root):
    """A host of which the program reads, looks for, or replaces every file that it can."""
    describe_notes(root)
    root.native("native", apply=3, provides=["ready"], run_once=True, plugin_version="1")
    write_plugin(root, "json", apply=["test note --text=json"], requires=["ready"],
                 provides=["steady"])
    root.debug_configuration("marked:steady:go:echo debug >>/tmp/ran")
    root.write(HOST_PROFILE)
    root.write(PROFILING_LOG, "the report of an earlier boot\n", mode=0o644)
    root.write(RUN_ONCE_RECORD, "the record of an earlier boot\n")
    return root


def assert_all_was_done(root, result):
    assert (result.status, result.messages) == (0, [
        (INFO, "executing host profile plugin: native"),
        (ERR, "execution failure in context 'native', returncode 3"),
        (INFO, "executing host profile plugin: json"), *starting("marked")])
    assert [line.split()[0] for line in root.ran()] == ["apply", "end", "json", "debug"]
    assert root.alerts() == []
    assert root.profiling_log()[0].startswith("NVKernel Initialization Time: ")
    assert root.mode(PROFILING_LOG) == 0o644
    assert root.run_once_record() == "vantor.run-once=native1,\n"


def test_the_host_of_these_tests(host, vantor):
    assert_all_was_done(host, vantor())


def set_times(path, seconds):
    """As os.utime(), which on 32 bits knows narrow times only."""
    libc = ctypes.CDLL(None, use_errno=True)
    call = libc.__utimensat64 if hasattr(libc, "__utimensat64") else libc.utimensat
    times = (ctypes.c_int64 * 4)(seconds, 0, seconds, 0)
    if call(-100, os.fsencode(path), times, 0) != 0:  # AT_FDCWD
        error = ctypes.get_errno()
        raise OSError(error, os.strerror(error), path)


def has_time(path, seconds):
    """Whether the file system has kept a time, which os.stat() cannot tell on 32 bits."""
    try:
        return os.stat(path).st_mtime == seconds
    except OSError as error:
        return error.errno == errno.EOVERFLOW


@pytest.fixture(name="dated")
def fixture_dated(host):
    """dated(time) gives that time to all the host's files, until the test is over."""
    folders = [PLUGINS, "/etc/nuvex", "/usr/lib/nuvex/nvcli", "/var/log", "/bootbank"]
    paths = []
    for folder in folders:
        for place, _, files in os.walk(host.path(folder)):
            paths += [place, *(os.path.join(place, name) for name in files)]

    def dated(seconds):
        for path in paths:
            set_times(path, seconds)
            if not has_time(path, seconds):
                pytest.skip("this file system knows no such times")
    yield dated
    # What removes the files need not know such times.
    for path in paths:
        set_times(path, 0)


@pytest.mark.parametrize("seconds", [LAST_OF_32_BITS + 1, YEAR_2040, 5000000000], ids=named)
def test_files_of_the_time_after_2038(host, vantor, dated, seconds):
    dated(seconds)
    assert_all_was_done(host, vantor())


@pytest.mark.parametrize("size", [1 << 31, (1 << 32) + 1, 5 << 30])
@pytest.mark.parametrize("name", [
    f"{PLUGINS}/libnative.so", f"{PLUGINS}/other.debug", HOST_PROFILE, PROFILING_LOG,
    RUN_ONCE_RECORD,
])
def test_a_large_file(host, vantor, name, size):
    if not host.exists(name):
        host.write(name)
    os.truncate(host.path(name), size)
    assert_all_was_done(host, vantor())


@pytest.mark.parametrize("size", [1 << 31, (1 << 32) + 1, 5 << 30])
def test_a_large_file_in_place_of_the_drawing(root, vantor, size):
    root.write("/tmp/graph.dot")
    os.truncate(root.path("/tmp/graph.dot"), size)
    result = vantor("--dump-dependency-tree=/tmp/graph.dot")
    assert (result.status, root.read("/tmp/graph.dot")) == (0, "digraph g {\n}\n")


def give_large_inode_numbers(root, folder):
    """Moves the folder's files to where their inode numbers need more than 32 bits.

    An overlay tells the files of its layers apart by the highest bits of their inode numbers.
    """
    layers = [f"/tmp/layers{folder}/{name}" for name in ("lower", "upper", "work")]
    for name in layers:
        root.folder_at(name)
    lower, upper, work = (root.path(name) for name in layers)
    place = root.path(folder)
    try:
        subprocess.run(["mount", "-t", "tmpfs", "tmpfs", lower], check=True, capture_output=True)
        subprocess.run(["cp", "-a", place + "/.", lower], check=True)
        subprocess.run([
            "mount", "-t", "overlay", "overlay", "-o",
            f"lowerdir={lower},upperdir={upper},workdir={work},xino=on", place],
            check=True, capture_output=True)
    except (OSError, subprocess.CalledProcessError) as error:
        pytest.skip(f"no overlay can be mounted here: {error}")


def test_large_inode_numbers(host, vantor):
    if host.isolation.way != "mount":
        pytest.skip("nothing can be mounted here")
    for folder in (PLUGINS, "/etc/nuvex", "/var/log", "/bootbank", "/usr/lib/nuvex/nvcli"):
        give_large_inode_numbers(host, folder)
    for name in (f"{PLUGINS}/libnative.so", f"{PLUGINS}/json.json", HOST_PROFILE, PROFILING_LOG,
                 RUN_ONCE_RECORD, DEBUG_CONFIGURATION):
        if os.stat(host.path(name)).st_ino < 1 << 32:
            pytest.skip("this overlay numbers its files otherwise")
    assert_all_was_done(host, vantor())


def wide_forms(name):
    """What the call of that name is called where sizes, inode numbers and times have 64 bits."""
    forms = {name + "64", f"__{name}64", f"__{name}_time64", f"__{name}64_time64"}
    return forms | ({f"__{name[:-2]}64_r"} if name.endswith("_r") else set())


def test_no_call_is_a_narrow_one(session):
    program = session.base.program
    if word_size_of(program) == 8:
        pytest.skip("on 64 bits every call is wide")
    [libc] = [path for path in linked_files(program) if os.path.basename(path) == "libc.so.6"]
    offered = plain(exports(libc))
    assert wide_forms("stat") & offered, "the C library offers both"
    libraries = os.path.join(session.base.build, "lib")
    for path in [program, *(os.path.join(libraries, name) for name in os.listdir(libraries))]:
        narrow = [name for name in plain(imports(path)) if wide_forms(name) & offered]
        assert narrow == [], path
    assert plain(imports(program)) >= {
        "__gettimeofday64", "__time64", "__gmtime64_r", "__stat64_time64", "open64"}
