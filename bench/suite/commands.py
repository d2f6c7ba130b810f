"""Group "commands": whole boots of debug plugins beside bare threads, ninja and make."""

import statistics

from harness.private_root import DEBUG_CONFIGURATION

from suite.command_graphs import CommandGraph
from suite.host import VANTOR, WORK
from suite.results import BenchError, Curve

GROUP = "commands"
LOG = "/tmp/ran"


class _Case:
    """One graph, and the programs that run it.

    Each operation is one whole run: microseconds a command by the clock, and of processor time.
    """

    def __init__(self, host, shape, count, command="true"):
        self._host, self.graph = host, CommandGraph(shape, count)
        self.command, self.count = command, count
        self._laid_out = {"vantor": (DEBUG_CONFIGURATION, self.graph.debug_configuration(command)),
                          "ninja": (f"{WORK}/build.ninja", self.graph.ninja(command)),
                          "make": (f"{WORK}/Makefile", self.graph.make(command))}

    def _prepare(self, program):
        """Neither finds what an earlier run left, and nothing lies in vantor's plugin directory."""
        self._host.root.write(*self._laid_out[program])
        for name in (".ninja_log", ".ninja_deps"):
            self._host.root.remove(f"{WORK}/{name}")

    def _time(self, *command):
        timing = self._host.time(*command)[0]
        return timing.nanoseconds / 1000 / self.count, timing.processor / 1000 / self.count

    def vantor(self, *options):
        self._prepare("vantor")
        self._host.forget_last_boot()
        taken = self._time(VANTOR, *options)
        ran = [name for name, start, _ in self._host.plugin_spans() if start > 0]
        if len(ran) != self.count:
            raise BenchError(f"vantor ran {len(ran)} of {self.count} commands")
        return taken

    def ninja(self):
        self._prepare("ninja")
        return self._time("/usr/bin/ninja", "--quiet", "-C", WORK, "-j8")

    def make(self):
        self._prepare("make")
        return self._time("/usr/bin/make", "-s", "-r", "-C", WORK, "-j8")

    def bare(self, threads):
        return self._time("/usr/bin/bare-commands", str(threads), str(self.count))


def _check(host, shape, count):
    """All three run every command of the graph: each command notes that it ran."""
    case = _Case(host, shape, count, f"echo >>{LOG}")
    for name, run in (("vantor", lambda: case.vantor("--parallel")),
                      ("ninja", case.ninja), ("make", case.make)):
        host.root.remove(LOG)
        run()
        ran = len(host.root.ran())
        if ran != count:
            raise BenchError(f"{name} ran {ran} of {count} commands ({shape})")
    host.root.remove(LOG)


def _side_by_side(host, results, shape, counts):
    """Graphs that eight commands at a time work on, all sizes in the same rounds.

    A machine has quick and slow seconds: the median of short runs is that of the quick ones, and a
    long run is a mean of both. Sizes can be compared when a round of each sees as many of them: it
    boots the largest one once.
    """
    candidates, often = {}, {}
    for count in counts:
        case = _Case(host, shape, count)
        candidates["vantor", count] = lambda case=case: case.vantor("--parallel")
        candidates["bare", count] = lambda case=case: case.bare(8)
        candidates["ninja", count] = case.ninja
        candidates["make", count] = case.make
        often["vantor", count] = often["bare", count] = counts[-1] // count
    measured = results.alternate(f"{GROUP}: {shape}", candidates, often=often)
    figures, processor = _by_clock(measured), _by_processor(measured)
    for count in counts:
        ours = ("vantor --parallel", figures["vantor", count])
        for name, label, limit in (("bare", "8 bare threads", 1.08), ("ninja", "ninja -j8", 1.0),
                                   ("make", "make -j8", 1.0)):
            results.compare(GROUP, f"{count:,} {shape} commands", "us/command", ours,
                            (label, figures[name, count]), limit)
        results.compare(GROUP, f"{count:,} {shape} commands, processor time", "us/command",
                        ("vantor --parallel", processor["vantor", count]),
                        ("8 bare threads", processor["bare", count]))
    _growth(results, f"{shape}, from {counts[0]:,} to {counts[-1]:,} commands", counts, figures)
    return figures


def _growth(results, work, counts, figures):
    """By the clock, and in times of the bare threads, which take longer for more commands too."""
    bare = {count: [ours / theirs for ours, theirs in zip(figures["vantor", count],
                                                          figures["bare", count])]
            for count in counts}
    clock = {count: figures["vantor", count] for count in counts}
    for what, unit, taken in (("", "us/command", clock),
                              (", beside the bare threads", "times theirs", bare)):
        results.compare(GROUP, work + what, unit, (f"vantor, {counts[-1]:,}", taken[counts[-1]]),
                        (f"vantor, {counts[0]:,}", taken[counts[0]]), 1.0, growth=True)


def _by_clock(figures):
    return {key: [clock for clock, _ in values] for key, values in figures.items()}


def _by_processor(figures):
    return {key: [processor for _, processor in values] for key, values in figures.items()}


def _curve(results, shape, counts, figures):
    labels = {"vantor": "vantor", "bare": "8 bare threads", "ninja": "ninja", "make": "make"}
    series = {label: [(count, statistics.median(figures[name, count])) for count in counts]
              for name, label in labels.items()}
    results.curves.append(Curve(f"commands-{shape}", f"Shell commands, {shape}, 8 at a time",
                                "commands", "us a command", series))


def _one_by_one(host, results, count):
    chain, alone = _Case(host, "chain", count), _Case(host, "independent", count)
    measured = results.alternate(f"{GROUP}: one at a time", {
        "chain": lambda: chain.vantor("--parallel"),
        "bare": lambda: chain.bare(1),
        "serial": alone.vantor,
        "ninja": chain.ninja,
        "make": chain.make,
    }, often={"chain": 5, "bare": 5, "serial": 5, "ninja": 5})
    figures, processor = _by_clock(measured), _by_processor(measured)
    for name, label, limit in (("bare", "1 bare thread", 1.08), ("ninja", "ninja -j8", 1.03),
                               ("make", "make -j8", None)):
        results.compare(GROUP, f"chain of {count:,} commands", "us/command",
                        ("vantor --parallel", figures["chain"]), (label, figures[name]), limit)
    results.compare(GROUP, f"{count:,} independent commands, one worker", "us/command",
                    ("vantor", figures["serial"]), ("1 bare thread", figures["bare"]), 1.05)
    for work, name, subject in (
            (f"chain of {count:,} commands", "chain", "vantor --parallel"),
            (f"{count:,} independent commands, one worker", "serial", "vantor")):
        results.compare(GROUP, f"{work}, processor time", "us/command", (subject, processor[name]),
                        ("1 bare thread", processor["bare"]))


def measure(host, results):
    host.clear_plugins()
    counts = [100, 300] if results.quick else [1000, 5000]
    for shape in ("independent", "layered", "chain"):
        _check(host, shape, 100)
    for shape in ("independent", "layered"):
        _curve(results, shape, counts, _side_by_side(host, results, shape, counts))
    _one_by_one(host, results, counts[0])
    host.clear_plugins()
