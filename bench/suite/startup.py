"""Group "startup": a run that has nothing to do, and what each linked library adds to it."""

import os
import statistics
import subprocess

from harness.base_root import linked_files
from harness.elf import needed

from suite.host import VANTOR
from suite.results import BenchError

GROUP = "startup"


def _libraries_in_order(program):
    """Names and paths of the libraries that a program links, each after those it needs itself."""
    paths = {os.path.basename(path): path for path in linked_files(program)}
    order = []

    def visit(name):
        if name in paths and name not in order:
            for other in needed(paths[name]):
                visit(other)
            order.append(name)

    for name in needed(program):
        visit(name)
    return [paths[name] for name in order if not name.startswith("ld-linux")]


def _link_costs(host, libraries):
    """Microseconds for each library, in the order of the list."""
    done = subprocess.run([host.program("link-cost"), *libraries], capture_output=True, text=True,
                          check=False)
    if done.returncode != 0:
        raise BenchError(done.stderr.strip())
    return [int(line.split()[0]) / 1000 for line in done.stdout.splitlines()]


def measure(host, results):
    host.clear_plugins()
    runs = 5 if results.quick else 20
    figures = results.alternate(GROUP, {
        "help": lambda: host.median(VANTOR, "--help", runs=runs) / 1000,
        "empty": lambda: host.median(VANTOR, runs=runs) / 1000,
        "true": lambda: host.median("/usr/bin/true", runs=runs) / 1000,
    })
    true = ("/bin/true", figures["true"])
    results.compare(GROUP, "vantor --help", "us", ("vantor", figures["help"]), true)
    results.compare(GROUP, "boot of an empty directory", "us", ("vantor", figures["empty"]), true)
    libraries = _libraries_in_order(host.program("vantor"))
    costs = [_link_costs(host, libraries) for _ in range(5 * results.rounds)]
    by_library = dict(zip(libraries, zip(*costs)))
    for path in sorted(by_library, key=lambda one: -statistics.median(by_library[one])):
        results.figure(GROUP, f"loading and binding {os.path.basename(path)}", "dynamic linker",
                       by_library[path], "us")
