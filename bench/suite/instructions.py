"""Group "instructions": how many instructions the parts execute that one thread works on at a time.

Counted by callgrind, so a noisy machine does not change them: a regression shows at once.
"""

import re
import subprocess

from harness.private_root import PLUGINS

from suite.graph import MIXED, only
from suite.host import VANTOR
from suite.loading import lay_out_plugins, write_documents
from suite.results import BenchError

GROUP = "instructions"
_VALGRIND = ["--tool=callgrind", "--callgrind-out-file=/dev/null"]


def collected(errors):
    """The count in what callgrind writes to standard error."""
    found = re.search(r"Collected\s*:\s*([1-9]\d*)", errors)
    if not found:
        raise BenchError(f"callgrind counted nothing: {errors[-300:]}")
    return int(found[1])


def _count_part(host, program, *arguments):
    """Instructions of the part that a measuring program marks."""
    command = ["valgrind", *_VALGRIND, "--instr-atstart=no", host.program(program),
               *map(str, arguments)]
    done = subprocess.run(command, capture_output=True, text=True, check=False)
    if done.returncode != 0:
        raise BenchError(f"{program} under callgrind: {done.stderr[-300:]}")
    return collected(done.stderr)


def _count_graph(host, name, count, workers=None):
    return _count_part(host, "bench-graph", only(name, count, workers)) / count


def _count_whole(host, *command):
    """Instructions of a whole run in the private root, its children not included."""
    return collected(host.errors_of("/usr/bin/valgrind", "--vgdb=no", *_VALGRIND, *command))


def _graph(host, results, count):
    for shape in ("independent", "layered", "chain"):
        results.progress.say(f"{GROUP}: {shape} graph")
        ours, theirs = ([_count_graph(host, f"boot/{program}/{shape}", count, 1)]
                        for program in ("vantor", "flow"))
        results.compare(GROUP, f"{count:,} empty nodes, {shape}, 1 worker", "per node",
                        ("vantor", ours), ("oneTBB", theirs))
    results.progress.say(f"{GROUP}: {MIXED}")
    large, small = ((f"vantor, {size:,}", [_count_graph(host, "boot/vantor/mixed", size, 1)])
                    for size in (10 * count, count))
    results.compare(GROUP, f"{MIXED}, 1 worker", "per node", large, small, 1.01)
    for what, name in (("requested from its first node", "schedule/near"),
                       ("requested from its last node", "schedule/far"),
                       ("height of its first node", "height")):
        results.figure(GROUP, f"chain of {count:,} nodes, {what}", "vantor",
                       [_count_graph(host, name, count)], "per node")


def _json(host, results, folder):
    small, large = write_documents(folder, 100, 200000)
    for label, paths in (("100 documents of 0.5 to 4 KB", small), ("a document of 0.2 MB", large)):
        results.progress.say(f"{GROUP}: {label}")
        size = host.run_benchmark("bench-json", "reader", 1, *paths)["bytes"]
        ours, theirs = ([_count_part(host, "bench-json", reader, 1, *paths) / size]
                        for reader in ("reader", "dom"))
        results.compare(GROUP, f"{label}, read from files", "per byte", ("vantor's reader", ours),
                        ("nlohmann-json", theirs))


def _native_plugins(host, results, count, empty):
    bare_empty = _count_whole(host, "/usr/bin/bare-loading", PLUGINS, "0")
    lay_out_plugins(host, count)
    ours = (_count_whole(host, VANTOR) - empty) / count
    theirs = (_count_whole(host, "/usr/bin/bare-loading", PLUGINS, str(count)) - bare_empty) / count
    results.compare(GROUP, f"{count} native plugins, loaded and run", "per plugin",
                    ("vantor", [ours]), ("bare dlopen loop", [theirs]))
    host.clear_plugins()


def _debug_plugins(host, results, counts, empty):
    """All names are of one length, so that both sizes have the same to do for each."""
    taken = []
    for count in counts:
        results.progress.say(f"{GROUP}: boot of {count:,} debug plugins")
        host.root.debug_configuration(*(f"p{number:04}: : :true" for number in range(count)))
        taken.append((_count_whole(host, VANTOR) - empty) / count)
    host.clear_plugins()
    results.compare(GROUP, "debug plugins, loaded and run", "per plugin",
                    (f"vantor, {counts[1]:,}", taken[1:]), (f"vantor, {counts[0]:,}", taken[:1]),
                    1.01)


def _boots(host, results, native, debug):
    host.clear_plugins()
    results.progress.say(f"{GROUP}: whole boots")
    empty = _count_whole(host, VANTOR)
    results.figure(GROUP, "boot of an empty directory", "vantor", [empty], "a run")
    _native_plugins(host, results, native, empty)
    _debug_plugins(host, results, debug, empty)


def measure(host, results, folder):
    _graph(host, results, 1000 if results.quick else 10000)
    _json(host, results, folder)
    _boots(host, results, 20 if results.quick else 200, [20, 100] if results.quick else [1000, 5000])
