"""The private root in which whole processes are measured, each in the same surroundings."""

import json
import os
import shutil
import statistics
import subprocess
from dataclasses import dataclass

from harness.base_root import BaseRoot
from harness.private_root import DEBUG_CONFIGURATION, PLUGINS, PROFILING_LOG, PrivateRoot

from suite.results import BenchError

VANTOR = "/usr/sbin/vantor"
WORK = "/bench"  # what the other programs read
_OWN = ["bare-commands", "bare-loading", "bare-lines"]
_DEBIAN = ["ninja", "make"]
_VALGRIND = "/usr/libexec/valgrind"
_SYMBOLS = "/usr/lib/debug/.build-id"  # those of the C library and the linker


@dataclass
class Timing:
    """One whole run of a program."""

    nanoseconds: float
    user: int
    system: int
    resident: int

    @property
    def processor(self):
        """Nanoseconds of processor time, that of the children included."""
        return (self.user + self.system) * 1000


class _Base(BaseRoot):
    """The system tests' base root with the programs that vantor is compared with."""

    def __init__(self, folder, build):
        super().__init__(folder, build)
        for name in _OWN:
            self._add(os.path.join(build, "bin", name), "usr/bin/" + name)
        for name in _DEBIAN:
            found = shutil.which(name, path="/usr/bin:/bin")
            self._add(found, "usr/bin/" + name)
        self._add_valgrind()

    def _add_valgrind(self):
        # The program behind Debian's script; by the linker's symbols it finds what it replaces.
        self._add("/usr/bin/valgrind.bin", "usr/bin/valgrind")
        os.makedirs(self.path(_VALGRIND))
        for name in os.listdir(_VALGRIND):
            if name.startswith(("callgrind-", "vgpreload_core-", "default.supp")):
                shutil.copy2(os.path.join(_VALGRIND, name), self.path(_VALGRIND))
        shutil.copytree(_SYMBOLS, self.path(_SYMBOLS))


class _SyslogSink:
    """A system log that throws everything away, in the place of the root's recorder."""

    def __init__(self, program, socket):
        if os.path.lexists(socket):
            os.unlink(socket)
        self._process = subprocess.Popen([program, socket], stdout=subprocess.PIPE, text=True)
        if self._process.stdout.readline() != "ready\n":
            raise BenchError("the system log does not start")

    def close(self):
        self._process.kill()
        self._process.wait()
        self._process.stdout.close()


class Host:
    """A private root, a system log that drains, and a stopwatch for programs in it."""

    def __init__(self, folder, build, isolation):
        self.build = build
        self.root = PrivateRoot(_Base(os.path.join(folder, "base"), build), isolation,
                                os.path.join(folder, "root"))
        # The tests' recorder keeps every message and is a program of Python: it would be measured.
        self.root.syslog.close()
        self.root.syslog = _SyslogSink(self.program("syslog-sink"), self.root.path("/dev/log"))
        self.root.folder_at(WORK)

    def close(self):
        self.root.remove_all()

    def program(self, name):
        return os.path.join(self.build, "bin", name)

    def time(self, *command, runs=1, limit=120):
        """Whole runs of a command in the root; fails when one fails. The timings, one a run."""
        return self._stopwatch(command, runs, limit)[0]

    def median(self, *command, runs=1, limit=120):
        """The median of the runs' nanoseconds."""
        return statistics.median(one.nanoseconds for one in self.time(*command, runs=runs,
                                                                       limit=limit))

    def errors_of(self, *command, limit=300):
        """What one run of a command writes to standard error."""
        return self._stopwatch(command, 1, limit)[1]

    def _stopwatch(self, command, runs, limit):
        done = subprocess.run(
            [self.program("stopwatch"), self.root.folder, str(limit), str(runs), *command],
            capture_output=True, text=True, check=False)
        if done.returncode != 0:
            raise BenchError(f"{' '.join(command)}: {done.stderr.strip()}")
        return [Timing(float(line.split()[0]), *map(int, line.split()[1:]))
                for line in done.stdout.splitlines()], done.stderr

    def clear_plugins(self):
        """An empty plugin directory and no debug configuration."""
        shutil.rmtree(self.root.path(PLUGINS))
        self.root.folder_at(PLUGINS)
        self.root.remove(DEBUG_CONFIGURATION)

    def plugin_spans(self):
        """Name, start and end of every plugin of the last boot, in microseconds of its day."""
        spans = []
        for line in self.root.profiling_log():
            if line.startswith("[") and "] sysboot: " in line:
                times, _, name = line[1:].partition("] sysboot: ")
                spans.append((name, *map(_microseconds, times.split(" - "))))
        return spans

    def forget_last_boot(self):
        self.root.remove(PROFILING_LOG)

    def run_own(self, program, *arguments):
        """Runs one of the measuring programs outside the root; its lines "name value" as a dict."""
        return {name: float(value) for name, value in
                (line.split() for line in self._output_of(program, *arguments).splitlines())}

    def run_benchmark(self, program, *arguments):
        """Runs one of our programs with Google Benchmark outside the root; what it reports of its
        one benchmark, with the times in nanoseconds."""
        report = json.loads(self._output_of(program, "--benchmark_format=json", *arguments))
        return one_benchmark(report, " ".join(map(str, (program, *arguments)))[:80])

    def _output_of(self, program, *arguments, limit=300):
        command = [self.program(program), *map(str, arguments)]
        try:
            done = subprocess.run(command, capture_output=True, text=True, check=False,
                                  timeout=limit)
        except subprocess.TimeoutExpired:
            raise BenchError(f"{program} {' '.join(map(str, arguments))[:80]}: "
                             f"not done within {limit} s") from None
        if done.returncode != 0:
            last = (done.stderr.splitlines() or [""])[-1]
            raise BenchError(f"{program} {' '.join(map(str, arguments))[:80]}: "
                             f"status {done.returncode} {last}")
        return done.stdout


def one_benchmark(report, what):
    """The entry of the only benchmark in a report of Google Benchmark's.

    Where it was repeated, the entry is that of the median.
    """
    for entry in report["benchmarks"]:
        if entry.get("error_occurred"):
            raise BenchError(f"{what}: {entry['error_message']}")
    found = [entry for entry in report["benchmarks"]
             if entry.get("aggregate_name", "median") == "median"]
    if len(found) != 1 or found[0]["time_unit"] != "ns":
        raise BenchError(f"{what}: not one benchmark in nanoseconds, but "
                         f"{[entry['name'] for entry in found]}")
    return found[0]


def _microseconds(text):
    hours, minutes, seconds = text.split()[1].split(":")
    return int(hours) * 3600000000 + int(minutes) * 60000000 + round(float(seconds) * 1000000)
