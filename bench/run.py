"""Measures vantor beside other programs and prints ratios; started by scripts/bench."""

import argparse
import os
import pathlib
import signal
import sys
import tempfile
import time

CHECKOUT = pathlib.Path(__file__).resolve().parent.parent
# The system tests' own way of making a private root.
sys.path.insert(0, str(CHECKOUT / "tests" / "system"))

# pylint: disable=wrong-import-position
from harness.base_root import BuildError  # noqa: E402
from harness.isolation import Isolation, IsolationError  # noqa: E402

from suite import (commands, graph, instructions, loading, machine, makespan,  # noqa: E402
                   report, startup)
from suite.host import Host  # noqa: E402
from suite.results import BenchError, Results  # noqa: E402

GROUPS = {
    "commands": lambda host, results, folder: commands.measure(host, results),
    "graph": lambda host, results, folder: graph.measure(host, results),
    "memory": lambda host, results, folder: graph.measure_memory(host, results),
    "loading": lambda host, results, folder: loading.measure(host, results),
    "json": loading.measure_json,
    "lines": lambda host, results, folder: loading.measure_lines(host, results),
    "makespan": lambda host, results, folder: makespan.measure(host, results),
    "startup": lambda host, results, folder: startup.measure(host, results),
    "instructions": instructions.measure,
}
PAGE = CHECKOUT / "docs" / "performance.md"


def parse_arguments():
    parser = argparse.ArgumentParser(prog="scripts/bench", description=__doc__)
    parser.add_argument("--quick", action="store_true",
                        help="small sizes and two rounds: whether everything works, not how fast")
    parser.add_argument("--only", metavar="GROUP", nargs="+", choices=GROUPS, default=list(GROUPS),
                        help="of " + ", ".join(GROUPS))
    parser.add_argument("--rounds", metavar="N", type=int, help="7 unless given; 2 with --quick")
    parser.add_argument("--output", metavar="DIR",
                        help="where the report goes; build/bench/report unless given, "
                             "build/bench/report-quick with --quick")
    parser.add_argument("--update-docs", action="store_true",
                        help="put the figures into docs/performance.md too")
    arguments = parser.parse_args()
    if arguments.update_docs and arguments.only != list(GROUPS):
        parser.error("--update-docs takes a run of all groups")
    if arguments.output is None:
        report_name = "report-quick" if arguments.quick else "report"
        arguments.output = str(CHECKOUT / "build/bench" / report_name)
    return arguments


def measure(arguments, results):
    """Measures the groups; the greatest load that others put on the machine meanwhile."""
    load = 0.0
    # Mounts are made in a namespace that ends with this process: nothing stays mounted.
    isolation = Isolation(os.environ.get("VANTOR_TEST_ISOLATION", ""))
    folder = tempfile.mkdtemp(prefix="vantor-bench-")
    host = None
    try:
        isolation.mount_tmpfs(folder)
        build = os.path.realpath(os.environ.get("VANTOR_BUILD_DIR", CHECKOUT / "build/bench"))
        host = Host(folder, build, isolation)
        for group in arguments.only:
            load = max(load, machine.other_load())
            place = os.path.join(folder, group)
            os.mkdir(place)
            try:
                GROUPS[group](host, results, place)
            except BenchError as error:
                results.failures.append(f"{group}: {error}")
                results.progress.say(f"{group} failed: {error}")
    finally:
        try:
            if host:
                host.close()
        finally:
            Isolation.remove_tree(folder)
    results.progress.end()
    return load


def main():
    signal.signal(signal.SIGTERM, signal.default_int_handler)
    arguments = parse_arguments()
    results = Results(arguments.rounds or (2 if arguments.quick else 7), arguments.quick)
    start = time.monotonic()
    load = measure(arguments, results)
    meta = {
        "machine": machine.description(), "rounds": results.rounds, "other_load": round(load, 3),
        "command": " ".join(["scripts/bench", *(["--quick"] if arguments.quick else [])]),
        "seconds": round(time.monotonic() - start), "failures": results.failures,
    }
    print(report.write(results, meta, arguments.output))
    if arguments.update_docs:
        report.update_page(results, meta, PAGE)
    return 1 if results.failures else 0


if __name__ == "__main__":
    try:
        sys.exit(main())
    except KeyboardInterrupt:
        sys.exit("bench: interrupted")
    except (BuildError, IsolationError) as failure:
        sys.exit(f"bench: {failure}")
