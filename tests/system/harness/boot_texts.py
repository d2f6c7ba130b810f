"""Boots that have taken place, made up: the profiling log and the drawn graph of as many plugins as a
test needs, which real boots would take long to leave."""

import datetime
import heapq
import random

BEGIN = datetime.datetime(2026, 11, 22, 1, 7, 6)


def moment(microseconds):
    """A time as the log writes it."""
    time = BEGIN + datetime.timedelta(microseconds=microseconds)
    return time.strftime("%Y-%m-%d %H:%M:%S.%f")


def log(runs, end, parallel=True):
    """The log of runs, each (name, start, end) in microseconds since the boot began; bytes."""
    lines = [f"[{moment(start)} - {moment(stop)}] sysboot: {name}" for name, start, stop in runs]
    return "\n".join([
        "NVKernel Initialization Time: 12000000", *lines, "=== Vantor configuration info ===",
        f" Start: {moment(0)}", f" End: {moment(end)}", " Verbose: 0",
        f" Parallel: {int(parallel)}", " Randomize: 0", " Interactive Mode: 0", " Random Seed: 1",
        ""]).encode("utf-8", "surrogateescape")


def drawing(names, barriers, provided, required):
    """The drawn graph; `provided` and `required` hold the barriers' places, a list a plugin."""
    lines = ["digraph g {"]
    for number, name in enumerate(names):
        lines.append(f'{1000 + number} [label="{name}"];')
        lines += [f"{1000 + number} -> {900000 + barrier};" for barrier in provided[number]]
    for number, name in enumerate(barriers):
        lines.append(f'{900000 + number} [label="{name}" shape=box];')
        lines += [f"{900000 + number} -> {1000 + plugin};" for plugin in range(len(names))
                  if number in required[plugin]]
    return "\n".join([*lines, "}", ""]).encode("utf-8", "surrogateescape")


def random_boot(plugins, workers):
    """The log and the drawing of a boot that runs each plugin when its barriers are reached and a
    worker is free; the same at every call."""
    rng = random.Random(plugins)
    words = ["storage", "network", "firewall", "clock", "identity", "datastore", "journal", "guest"]
    layers = 6
    layer = sorted(rng.randrange(layers) for _ in range(plugins))
    names = [f"{rng.choice(words)}-{rng.choice(words)}-{number}" for number in range(plugins)]
    barriers = [f"{rng.choice(words)}.ready.{number}" for number in range(max(6, plugins // 8))]
    provided = [[rng.choice([b for b in range(len(barriers)) if b % layers == layer[p]])]
                if rng.random() < 0.6 else [] for p in range(plugins)]
    reached = [{b for p in range(plugins) for b in provided[p] if layer[p] < one}
               for one in range(layers)]
    required = [rng.sample(sorted(reached[layer[p]]), min(2, len(reached[layer[p]])))
                for p in range(plugins)]
    waiting = [{q for q in range(plugins) if set(provided[q]) & set(required[p])}
               for p in range(plugins)]
    ready = [p for p in range(plugins) if not waiting[p]]
    now, running, runs = 8000, [], [None] * plugins
    while ready or running:
        while ready and len(running) < workers:
            plugin = ready.pop(0)
            start = now + rng.randrange(5, 40)
            stop = start + int(rng.lognormvariate(9.5, 1.3))
            runs[plugin] = (names[plugin], start, stop)
            heapq.heappush(running, (stop, plugin))
        now, done = heapq.heappop(running)
        for plugin in range(plugins):
            if done in waiting[plugin]:
                waiting[plugin].remove(done)
                if not waiting[plugin]:
                    ready.append(plugin)
    end = max(stop for _, _, stop in runs) + 900
    return log(runs, end, workers > 1), drawing(names, barriers, provided, required)
