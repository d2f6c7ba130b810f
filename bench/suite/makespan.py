"""Group "makespan": sleeping plugins on eight workers beside a simulation without overhead."""

import math
import os
import random

from harness.private_root import PLUGINS

from suite import simulation
from suite.host import VANTOR
from suite.results import BenchError
from suite.simulation import SleepingPlugin

WORKERS = 8
# Seed of a graph -> how many levels a step of it takes: in the first the work decides, and in the
# last the longest path does. In all but the first, plugins that were taken in the order in which they
# become ready would end a twentieth later at least.
GRAPHS = {1: 8, 2: 4, 3: 3, 4: 2}
STAMP, ROOM = b"VANTOR BENCH SLEEPING PLUGIN", 1024


def _sleep(draw, longest):
    """Log-normal around a fifth of the longest; drawn again outside of 5 ms to the longest."""
    while True:
        value = round(draw.lognormvariate(math.log(longest / 5), 0.9))
        if 5000 <= value <= longest:
            return value


def random_plugins(seed, count, longest, step):
    """Plugins over levels of barriers; each requires up to two of the barriers a step below it.

    step  so many levels: the fewer, the longer the chains
    """
    draw = random.Random(seed)
    barriers = count // 8
    plugins = []
    for number in range(count):
        level = number if number < barriers else draw.randrange(barriers + 1)
        plugin = SleepingPlugin(f"p{number:03}", _sleep(draw, longest))
        nearby = range(level - level % step - step, level - level % step)
        below = [f"b{other:02}" for other in nearby if other >= 0]
        plugin.requires = draw.sample(below, min(len(below), draw.randint(0, 2)))
        plugin.provides = [f"b{level:02}"] if level < barriers else []
        plugins.append(plugin)
    return plugins


def _lay_out(host, plugins):
    """Writes the plugins; they come back in the order in which the directory lists them."""
    host.clear_plugins()
    with open(os.path.join(host.build, "bench", "plugins", "SleepingPlugin.so"), "rb") as file:
        content = file.read()
    start = content.index(STAMP)
    for plugin in plugins:
        words = [str(plugin.microseconds), *plugin.requires, "|", *plugin.provides]
        text = " ".join(words).encode().ljust(len(STAMP), b"\0") + b"\0"
        if len(text) > ROOM:
            raise BenchError("a description does not fit into the plugin")
        host.root.write(f"{PLUGINS}/lib{plugin.name}.so",
                        content[:start] + text + content[start + len(text):], 0o755)
    by_name = {plugin.name: plugin for plugin in plugins}
    return [by_name[name] for name in host.root.plugins_in_order()]


def _check(spans, plugins):
    """Every plugin took at least its time, after the last that provides what it requires."""
    times = {name: (start, end) for name, start, end in spans}
    ends = {}
    for plugin in plugins:
        start, end = times[plugin.name]
        if end - start < plugin.microseconds - 1:
            raise BenchError(f"{plugin.name} took {end - start} us")
        for barrier in plugin.provides:
            ends[barrier] = max(end, ends.get(barrier, 0))
    for plugin in plugins:
        for barrier in plugin.requires:
            if barrier in ends and times[plugin.name][0] < ends[barrier]:
                raise BenchError(f"{plugin.name} did not wait for {barrier}")


def _boot(host, plugins):
    """Milliseconds from the first start to the last end of a plugin."""
    host.forget_last_boot()
    host.time(VANTOR, "--parallel")
    spans = host.plugin_spans()
    _check(spans, plugins)
    return (max(end for _, _, end in spans) - min(start for _, start, _ in spans)) / 1000


def measure(host, results):
    seeds, count, longest = ([1], 40, 50000) if results.quick else (GRAPHS, 200, 200000)
    candidates, ideals, bounds = {}, {}, {}
    for seed in seeds:
        drawn = random_plugins(seed, count, longest, GRAPHS[seed])

        def boot(seed=seed, drawn=drawn):
            # The directory's order is that of the loading, and the simulation has to follow it.
            plugins = _lay_out(host, drawn)
            for figures, value in (
                    (ideals, simulation.makespan(plugins, WORKERS)),
                    (bounds, simulation.lower_bound(plugins, WORKERS))):
                figures.setdefault(seed, []).append(value / 1000)
            return _boot(host, plugins)

        candidates[seed] = boot
    measured = results.alternate("makespan", candidates)
    for seed in seeds:
        for label, figures, limit in (("simulation", ideals, 1.03),
                                      ("max(longest path, work/8)", bounds, None)):
            results.compare("makespan", f"{count} sleeping plugins, random graph {seed}", "ms",
                            ("vantor --parallel", measured[seed]), (label, figures[seed]), limit)
    host.clear_plugins()
