"""Boots the sample host in a private root and shows what the boots leave behind.

Run by scripts/demo, which builds the program first. Everything is made below build/demo; the
private root is gone afterwards, the drawn graph stays.
"""

import os
import pathlib
import shlex
import signal
import sys
import tempfile

CHECKOUT = pathlib.Path(__file__).resolve().parents[2]
# The system tests' own way of making and entering a private root.
sys.path.insert(0, str(CHECKOUT / "tests" / "system"))

from harness.base_root import BaseRoot
from harness.isolation import Isolation
from harness.private_root import HOST_PROFILE, PrivateRoot

import boots
import facts
import graph as graphs
import sample_host

PRIORITIES = {3: "error", 4: "warning", 6: "info", 7: "debug"}
KEPT = CHECKOUT / "build" / "demo"


def show(title, lines):
    print(f"\n== {title}")
    for line in lines:
        print("   " + line)


def syslog_lines(messages):
    return [f"{PRIORITIES.get(message.priority % 8, message.priority):<8} {message.text}"
            for message in messages]


def show_boot(boot, root):
    show("vantor --init --parallel --trace", boot.output.splitlines())
    show("Its syslog messages", syslog_lines(boot.messages))
    show("The system alerts: /var/run/nuvex/system-alerts",
         root.read("/var/run/nuvex/system-alerts").splitlines())
    show("The profiling log: /var/log/sysboot.log", boot.profile)
    show("The run-once record: gzip -dc /bootbank/vantorbk.gz", boot.record.splitlines())
    show("What the services were asked to do", boot.services)


def show_json(root):
    """What the commands of the JSON plugins left."""
    for name in (*facts.SETTING_FILES, sample_host.JOURNAL, f"{sample_host.STATE}/routes"):
        show(f"Changed by commands of JSON plugins: {name}", root.read(name).splitlines())


def by_hand(host, *words):
    """Runs nvcli and shows all that it says; a Result."""
    result = host.by_hand(*words)
    show(f"By hand: {shlex.join(('nvcli', *words))} (exit status {result.status})",
         (result.stdout + result.stderr).splitlines())
    return result


def show_nvcli(root, host):
    """The facts of an administrator's tries with the commands that the plugins use."""
    listed = by_hand(host)
    helped = by_hand(host, "network", "route", "load", "--help")
    by_hand(host, "system", "setting", "set", "--name=motd", "--value=Set by hand")
    settings = by_hand(host, "system", "setting", "list")
    failed = by_hand(host, "network", "route", "load", "--table=guests")
    mistyped = by_hand(host, "network", "route", "lode", "--table=uplink")
    return facts.of_nvcli(listed, helped, settings, failed, mistyped, root)


def show_graph(root):
    """Draws the dump below build/demo; the graph, read."""
    dump, picture = KEPT / "graph.dot", KEPT / "graph.svg"
    dump.write_text(root.read("/tmp/graph.dot"), encoding="utf-8")
    graph = graphs.Graph(dump.read_text(encoding="utf-8"))
    graphs.draw(dump, picture)
    show("The graph: vantor --dump-dependency-tree=/tmp/graph.dot", graphs.as_text(graph))
    show("Drawn with Graphviz", [str(picture)])
    return graph


def run_demo(root, isolation, folder):
    """The facts of all runs."""
    sample_host.lay_out(root, sample_host.compile_plugins(os.path.join(folder, "plugins")))
    host = boots.Host(root, isolation, folder)

    first = host.run("--init", "--parallel", "--trace")
    show_boot(first, root)
    show_json(root)
    dumped = host.run("--dump-dependency-tree=/tmp/graph.dot")
    graph = show_graph(root)
    found = [*facts.of_first_boot(first, graph, root), *facts.of_commands(first, root),
             *facts.of_graph(dumped, graph)]

    root.write(HOST_PROFILE, "<profile/>\n")
    recorded = first.record.strip().partition("=")[2]
    options = ["--parallel", "--trace", "--plugin-flags=noroutes", f"--run-once={recorded}"]
    second = host.run(*options)
    show(f"The next boot, with a host profile: vantor {' '.join(options)}",
         second.output.splitlines())
    show("Its syslog messages", syslog_lines(second.messages))
    show_json(root)
    found += [*facts.of_second_boot(second, root), *facts.of_next_commands(second, first, root)]
    return found + list(show_nvcli(root, host))


def main():
    # A terminated demo cleans up as an interrupted one does.
    signal.signal(signal.SIGTERM, signal.default_int_handler)
    KEPT.mkdir(parents=True, exist_ok=True)
    isolation = Isolation(os.environ.get("VANTOR_TEST_ISOLATION", ""))
    folder = tempfile.mkdtemp(prefix="root-", dir=KEPT)
    try:
        base = BaseRoot(os.path.join(folder, "base"), os.environ["VANTOR_BUILD_DIR"])
        root = PrivateRoot(base, isolation, os.path.join(folder, "host"))
        try:
            found = run_demo(root, isolation, folder)
        finally:
            root.remove_all()
    finally:
        Isolation.remove_tree(folder)

    show("What this shows", [f"{'yes' if holds else 'NO!':<4} {fact}" for fact, holds in found])
    wrong = [fact for fact, holds in found if not holds]
    print(f"\ndemo: {len(found) - len(wrong)} of {len(found)} facts hold")
    return 1 if wrong else 0


if __name__ == "__main__":
    sys.exit(main())
