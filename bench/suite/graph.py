"""Groups "graph" and "memory": the graph and its executor alone, beside oneTBB's flow graph."""

import statistics

from suite.results import Curve

GROUP = "graph"
SHAPES = ["independent", "layered", "chain"]
MIXED = "chains of 1 to 100 nodes side by side"
PROGRAMS = {"vantor": "vantor", "flow": "oneTBB"}
LARGEST_AGAIN = 100000  # nodes of a graph that is also run again and again in one process
FIRST_RUNS = {1000: 27, 10000: 9}  # a small graph is over soon: it is seen in so many processes


def _limit(shape, workers):
    if shape == "independent":
        return 0.5
    return 1.5 if workers == 1 else 3.0


def only(name, count, workers=None):
    """The option by which bench-graph runs one of its benchmarks."""
    return f"--benchmark_filter=^{name}/nodes:{count}/" + (f"workers:{workers}/" if workers else "")


def _per_node(host, name, count, workers=None):
    return host.run_benchmark("bench-graph", only(name, count, workers))["real_time"] / count


def _first_run(host, processes, program, shape, count, workers):
    """The first run of a process: the median of several processes."""
    return statistics.median(_per_node(host, f"boot/{program}/{shape}", count, workers)
                             for _ in range(processes))


def _check(host, count):
    for shape in [*SHAPES, "mixed"]:
        for program in PROGRAMS:
            for workers in (1, 8):
                _per_node(host, f"check/{program}/{shape}", count, workers)


def _beside_one(results, count, what, eight, one, limit):
    results.compare(GROUP, f"chain of {count:,} nodes, 8 workers beside 1{what}", "ns/node",
                    ("vantor, 8 workers", eight), ("vantor, 1 worker", one), limit)


def _measure_shape(host, results, shape, counts):
    keys = [(program, workers, count)
            for count in counts for workers in (1, 8) for program in PROGRAMS]
    figures = results.alternate(f"{GROUP}: {shape}", {
        key: lambda key=key: _first_run(host, 1 if results.quick else FIRST_RUNS.get(key[2], 1),
                                        key[0], shape, key[2], key[1]) for key in keys})
    _compare(results, shape, counts, figures)
    small, large = _grown_sizes(counts)
    for workers in (1, 8):
        results.compare(GROUP, f"{shape}, {_workers(workers)}, from {small:,} to {large:,} nodes",
                        "ns/node", (f"vantor, {large:,}", figures["vantor", workers, large]),
                        (f"vantor, {small:,}", figures["vantor", workers, small]), 2.0)
    series = {f"{PROGRAMS[program]}, {_workers(workers)}":
              [(count, statistics.median(figures[program, workers, count])) for count in counts]
              for program in PROGRAMS for workers in (1, 8)}
    results.curves.append(Curve(f"graph-{shape}", f"Empty nodes, {shape}", "nodes", "ns a node",
                                series))


def _measure_again(host, results, shape, counts):
    keys = [(program, workers, count)
            for count in counts for workers in (1, 8) for program in PROGRAMS]
    figures = results.alternate(f"{GROUP}: {shape}, again", {
        key: lambda key=key: _per_node(host, f"again/{key[0]}/{shape}", key[2], key[1])
        for key in keys})
    # For independent nodes oneTBB has its tasks' memory at hand, which no boot's first run finds.
    _compare(results, shape, counts, figures, ", again and again", shape != "independent")


def _compare(results, shape, counts, figures, what="", limited=True):
    for count in counts:
        for workers in (1, 8):
            results.compare(GROUP, f"{count:,} nodes, {shape}, {_workers(workers)}{what}",
                            "ns/node", ("vantor", figures["vantor", workers, count]),
                            ("oneTBB", figures["flow", workers, count]),
                            _limit(shape, workers) if limited else None)
        if shape == "chain":
            _beside_one(results, count, what, figures["vantor", 8, count],
                        figures["vantor", 1, count], 3.0 if limited else None)


def _grown_sizes(counts):
    """Two sizes a hundredfold apart, or as far as there are."""
    return counts[-1] // 100 if counts[-1] // 100 in counts else counts[0], counts[-1]


def _workers(count):
    return "1 worker" if count == 1 else f"{count} workers"


def _measure_heights(host, results, counts):
    """Chains of many lengths side by side: the queue has to order what is ready."""
    sizes = _grown_sizes(counts)
    figures = results.alternate(f"{GROUP}: mixed", {
        (workers, count): lambda workers=workers, count=count:
            _first_run(host, 1, "vantor", "mixed", count, workers)
        for workers in (1, 8) for count in sizes})
    for workers in (1, 8):
        small, large = ((f"vantor, {count:,}", figures[workers, count]) for count in sizes)
        results.compare(GROUP, f"{MIXED}, {_workers(workers)}, "
                               f"from {sizes[0]:,} to {sizes[1]:,} nodes", "ns/node",
                        large, small)


def _measure_life(host, results, count):
    """What the other rows leave out: to start and to join the executor's threads."""
    processes = 1 if results.quick else FIRST_RUNS[count]
    figures = results.alternate(f"{GROUP}: threads", {
        workers: lambda workers=workers: statistics.median(
            _per_node(host, "life/chain", count, workers) for _ in range(processes))
        for workers in (1, 8)})
    for workers, values in figures.items():
        results.figure(GROUP, f"chain of {count:,} nodes, {_workers(workers)}, its threads started "
                              "and joined too", "vantor", values, "ns/node")


def _measure_long_chain(host, results, count):
    figures = results.alternate(f"{GROUP}: chain of {count:,}", {
        "requested from its first node": lambda: _per_node(host, "schedule/near", count),
        "requested from its last node": lambda: _per_node(host, "schedule/far", count),
        "height of its first node": lambda: _per_node(host, "height", count),
    })
    for what, values in figures.items():
        results.figure(GROUP, f"chain of {count:,} nodes, {what}", "vantor", values, "ns/node")


def measure(host, results):
    counts = [1000, 10000] if results.quick else [1000, 10000, 100000, 1000000]
    results.progress.say(f"{GROUP}: check")
    _check(host, 1000)
    for shape in SHAPES:
        _measure_shape(host, results, shape, counts)
        _measure_again(host, results, shape, [count for count in counts if count <= LARGEST_AGAIN])
    _measure_heights(host, results, counts)
    _measure_life(host, results, counts[0])
    _measure_long_chain(host, results, counts[-1])


def measure_memory(host, results):
    """The bytes by which the process grows, beside those that the nodes and names are made of."""
    count = 10000 if results.quick else 100000
    for kind, label in (("plugin", "debug plugins"), ("barrier", "barriers"),
                        ("graph", "plugins and barriers, linked")):
        grown, own = [], []
        for number in range(results.rounds):
            results.progress.say(f"memory: {label}, round {number + 1} of {results.rounds}")
            figures = host.run_own("bench-memory", kind, count)
            grown.append(figures["resident"] / count)
            own.append(figures["own"] / count)
        results.compare("memory", f"{count:,} {label}", "bytes/node", ("resident", grown),
                        ("nodes and names", own), 1.2)
