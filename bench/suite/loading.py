"""Groups "loading", "json" and "lines": what reading plugins costs before any of them runs."""

import json
import os
import random
import statistics

from harness.private_root import DEBUG_CONFIGURATION, PLUGINS

from suite.host import VANTOR
from suite.results import BenchError, Curve

SEED = 20260


def lay_out_plugins(host, count):
    """Fills the plugin directory with copies of the smallest plugin, each a file of its own."""
    host.clear_plugins()
    path = os.path.join(host.build, "bench", "plugins", "EmptyPlugin.so")
    with open(path, "rb") as file:
        content = file.read()
    for number in range(count):
        host.root.write(f"{PLUGINS}/libplugin{number:05}.so", content, 0o755)


def _boot(host, count):
    host.forget_last_boot()
    taken = host.median(VANTOR)
    ran = sum(start > 0 for _, start, _ in host.plugin_spans())
    if ran != count:
        raise BenchError(f"vantor ran {ran} of {count} native plugins")
    return taken / 1000 / count


def _loop(host, count, *duties):
    return host.median("/usr/bin/bare-loading", PLUGINS, str(count), *duties) / 1000 / count


def measure(host, results):
    counts = [50, 100] if results.quick else [100, 1000, 5000]
    loop, duties = "bare dlopen loop", "the loop with the log and the checks"
    series = {"vantor": [], loop: [], duties: []}
    for count in counts:
        lay_out_plugins(host, count)
        candidates = {"vantor": lambda count=count: _boot(host, count),
                      loop: lambda count=count: _loop(host, count),
                      duties: lambda count=count: _loop(host, count, "duties")}
        # A run of a thousand takes but a tenth of a second: another process may disturb all of it.
        figures = results.alternate(f"loading: {count:,} native plugins", candidates,
                                    often=dict.fromkeys(candidates, counts[-1] // count))
        # A process of its own costs more than a hundred plugins: only the others say what one does.
        limit = 1.1 if count >= 1000 else None
        results.compare("loading", f"{count:,} native plugins, loaded and run", "us/plugin",
                        ("vantor", figures["vantor"]), (loop, figures[loop]), limit)
        results.compare("loading", f"{count:,} native plugins, loaded and run", "us/plugin",
                        ("vantor", figures["vantor"]), (duties, figures[duties]), None)
        for program, points in series.items():
            points.append((count, statistics.median(figures[program])))
    host.clear_plugins()
    results.curves.append(Curve("loading", "Native plugins, loaded and run", "plugins",
                                "us a plugin", series))


def _text(draw):
    words = ["network", "firewall", "system", "folder", "create", "--path=/var/log", "storage",
             "set", "--name=vmk0", "\"quoted\"", "rule\tset", "enabled", "été"]
    return " ".join(draw.choice(words) for _ in range(draw.randint(1, 6)))


def _value(draw, depth):
    kind = draw.randrange(8 if depth > 0 else 5)
    if kind == 0:
        return draw.randint(-100000, 100000)
    if kind == 1:
        return round(draw.uniform(-1000, 1000), 3)
    if kind == 2:
        return draw.choice([True, False, None])
    if kind <= 4:
        return _text(draw)
    if kind <= 6:
        return {f"{_text(draw)[:12]}{number}": _value(draw, depth - 1)
                for number in range(draw.randint(1, 6))}
    return [_value(draw, depth - 1) for _ in range(draw.randint(1, 8))]


def _document(draw, size):
    """A plugin document that has grown to about `size` bytes."""
    document = {
        "metadata": {"version": 1, "requires": [_text(draw)], "provides": [_text(draw)]},
        "operations": {"start": [_text(draw)]}, "extra": []}
    # What is there already counts with the blanks and brackets of the indented form.
    left = size - len(json.dumps(document, indent=2, ensure_ascii=False).encode())
    while left > 0:
        value = _value(draw, 2)
        document["extra"].append(value)
        left -= len(json.dumps([value], indent=2, ensure_ascii=False).encode()) * 1.3
    return json.dumps(document, indent=2, ensure_ascii=False)


def write_documents(folder, count, large):
    """Writes `count` documents of 0.5 to 4 KB and one of `large` bytes; their two lists of paths.
    """
    draw = random.Random(SEED)
    small = []
    for number in range(count):
        small.append(os.path.join(folder, f"{number:04}.json"))
        with open(small[-1], "w", encoding="utf-8") as file:
            file.write(_document(draw, draw.randint(512, 4096)))
    path = os.path.join(folder, "large.json")
    with open(path, "w", encoding="utf-8") as file:
        file.write(_document(draw, large))
    return small, [path]


def _read(host, reader, repeats, paths, contents):
    figures = host.run_benchmark("bench-json", reader, repeats, *paths)
    contents.append((figures["values"], figures["text"], round(figures["sum"], 3)))
    if contents[-1] != contents[0]:
        raise BenchError(f"the two JSON readers read different things: {contents[0]} and "
                         f"{contents[-1]}")
    return figures["real_time"] / figures["bytes"]


def measure_json(host, results, folder):
    count, large = (100, 200000) if results.quick else (1000, 10000000)
    small, big = write_documents(folder, count, large)
    for label, repeats, paths in ((f"{count:,} documents of 0.5 to 4 KB", 10, small),
                                  (f"a document of {large / 1e6:g} MB", 2, big)):
        contents = []
        figures = results.alternate(f"json: {label}", {
            reader: lambda reader=reader, repeats=repeats, paths=paths, contents=contents:
                _read(host, reader, repeats, paths, contents) for reader in ("reader", "dom")})
        results.compare("json", f"{label}, read from files", "ns/byte",
                        ("vantor's reader", figures["reader"]), ("nlohmann-json", figures["dom"]),
                        round(1 / 1.5, 3))
        for reader, name in (("reader", "vantor's reader"), ("dom", "nlohmann-json")):
            results.figure("json", f"{label}, speed", name,
                           [1000 / value for value in figures[reader]], "MB/s")


def measure_lines(host, results):
    """Files of no kind that a plugin has: for each the debug configuration is read afresh."""
    count = 100 if results.quick else 1000
    host.clear_plugins()
    for number in range(count):
        host.root.write(f"{PLUGINS}/file{number:04}.data")
    host.root.debug_configuration(
        *(f"debug{number:04}:first{number % 7},second:third,fourth{number}:echo {number}"
          for number in range(count)))
    # Drawn to nowhere: everything is loaded and nothing is run.
    figures = results.alternate("lines: debug configuration", {
        "vantor": lambda: host.median(VANTOR, "--dump-dependency-tree") / 1e6,
        "bare": lambda: host.median("/usr/bin/bare-lines", DEBUG_CONFIGURATION, str(count),
                                    str(count)) / 1e6})
    results.compare("lines", f"{count:,} files beside a debug configuration of {count:,} lines",
                    "ms", ("vantor", figures["vantor"]), ("plain loop", figures["bare"]), 3.0)
    host.clear_plugins()
