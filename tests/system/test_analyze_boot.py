"""What vantor-analyze tells of a boot that has taken place, from its log and a drawing."""

import fcntl
import json
import os
import pty
import struct
import termios

import pytest

from harness.sample_boot import DOT, LOG, SLEEPERS, lay_out
from harness.terminal import written_on

TREE = "/var/log/tree.dot"
LONGEST = 400 + 500 + 600
WORK = sum(milliseconds for milliseconds, _, _ in SLEEPERS.values())


def simulated(analyze, root, *arguments):
    """Measured makespan in milliseconds, and the predictions by their number of workers."""
    done = analyze("simulate", root.path("/var/log/sysboot.log"), "--dot", root.path(TREE),
                   "--format=json", *arguments)
    assert (done.status, done.stderr) == (0, "")
    document = json.loads(done.stdout)
    assert document["remarks"] == []
    return document["measured"]["makespan"] / 1000, {
        prediction["workers"]: prediction["makespan"] / 1000
        for prediction in document["predictions"]}


def is_near(predicted, real):
    """Within a twentieth, and what waking up ten threads may take on a machine under load."""
    return abs(predicted - real) <= real / 20 + 500


def test_a_serial_boot_predicts_the_parallel_one_and_the_reverse(root, vantor, analyze):
    lay_out(root)
    assert vantor(f"--dump-dependency-tree={TREE}").status == 0
    assert vantor().status == 0
    serial, from_serial = simulated(analyze, root, "--workers=1,8")
    assert vantor("--parallel").status == 0
    parallel, from_parallel = simulated(analyze, root, "--workers=1,8")
    assert serial >= WORK and parallel >= LONGEST
    assert is_near(from_serial[1], serial) and is_near(from_serial[8], parallel)
    assert is_near(from_parallel[1], serial) and is_near(from_parallel[8], parallel)
    assert from_serial[8] < from_serial[1] / 2


def test_the_chain_of_a_real_boot_is_the_longest_one(root, vantor, analyze):
    lay_out(root)
    assert vantor(f"--dump-dependency-tree={TREE}").status == 0
    assert vantor("--parallel").status == 0
    done = analyze("chain", root.path("/var/log/sysboot.log"), "--dot", root.path(TREE),
                   "--format=json")
    links = json.loads(done.stdout)["chain"]
    assert links[-1]["plugin"] == "guests"
    assert [link["plugin"] for link in links[-3:]] == ["disks", "datastore", "guests"]
    assert [link.get("barrier") for link in links[-2:]] == ["storage", "datastores"]


def test_the_plugin_directory_serves_as_well_as_a_drawing(root, vantor, analyze):
    lay_out(root)
    assert vantor(f"--dump-dependency-tree={TREE}").status == 0
    assert vantor("--parallel").status == 0
    log = root.path("/var/log/sysboot.log")
    for verb in ("blame", "chain", "trace", "simulate"):
        drawn = analyze(verb, log, "--dot", root.path(TREE))
        read = analyze(verb, "--root", root.folder)
        assert (read.stdout, read.status) == (drawn.stdout, 0), verb


def test_blame(analyze, boot):
    done = analyze("blame", *boot)
    assert (done.status, done.stderr) == (0, "")
    assert done.stdout == (
        "3 plugins on 8 workers: 90.000 ms from the first start to the last end, 110.000 ms of "
        "work; all times in ms\n"
        "PLUGIN\tFOR BARRIERS\tFOR A WORKER\tRAN\tSLACK\tSAVES AT MOST\n"
        "disks\t0.000\t0.000\t40.000\t10.000\t50.000\n"
        "look\t40.000\t10.000\t40.000\t0.000\t50.000\n"
        "slow\t0.000\t0.000\t30.000\t60.000\t10.000\n")


def test_blame_as_json(analyze, boot):
    document = json.loads(analyze("blame", *boot, "--format=json").stdout)
    assert document["plugins"][1] == {
        "plugin": "look", "waitedForBarriers": 40000, "waitedForWorker": 10000, "ran": 40000,
        "slack": 0, "savesAtMost": 50000}
    assert (document["workers"], document["makespan"], document["work"], document["remarks"]) == (
        8, 90000, 110000, [])


def test_chain(analyze, boot):
    assert analyze("chain", *boot).stdout == (
        "2 of 3 plugins decided when the boot ended: they ran for 80.000 of 90.000 ms; all times "
        "in ms\n"
        "START\tGAP\tRAN\tPLUGIN\tWAITED LAST FOR\n"
        "1.000\t0.000\t40.000\tdisks\tnothing\n"
        "51.000\t10.000\t40.000\tlook\tbarrier storage\n")


def test_simulate(analyze, boot):
    done = analyze("simulate", *boot, "--workers=1,8", "--what-if", "slow=0.5")
    assert (done.status, done.stderr) == (0, "")
    assert done.stdout == (
        "measured with 8 workers: 90.000 ms; simulated: 580.000 ms of work, longest chain "
        "500.000 ms; all times in ms\n"
        "WORKERS\tMAKESPAN\tLOWER BOUND\tEFFICIENCY\n"
        "1\t580.000\t580.000\t100.0 %\n"
        "8\t500.000\t500.000\t14.5 %\n")


def test_simulate_without_an_edge(analyze, boot):
    document = json.loads(
        analyze("simulate", *boot, "--workers=8", "--drop-edge=storage:look",
                "--format=json").stdout)
    assert document["predictions"] == [
        {"workers": 8, "makespan": 40000, "lowerBound": 40000, "efficiency": 0.34375}]


@pytest.mark.parametrize("option, reason", [
    ("--what-if=nobody=1", "no plugin 'nobody' was run by this boot"),
    ("--what-if=slow=fast", "--what-if=slow=fast: it takes NAME=SECONDS, from 0 to 10 years"),
    ("--what-if=slow=-1", "--what-if=slow=-1: it takes NAME=SECONDS, from 0 to 10 years"),
    ("--what-if=slow=nan", "--what-if=slow=nan: it takes NAME=SECONDS, from 0 to 10 years"),
    ("--drop-edge=slow:look", "no edge 'slow:look': no plugin provides or requires a barrier so"),
])
def test_simulate_refuses_what_it_does_not_know(analyze, boot, option, reason):
    done = analyze("simulate", *boot, option)
    assert (done.status, done.stdout) == (3, "")
    assert done.stderr == f"vantor-analyze: {reason}\n"


@pytest.mark.parametrize("workers", ["0", "-1", "1.5", "many", "8,0"])
def test_simulate_needs_a_worker(analyze, boot, workers):
    done = analyze("simulate", *boot, f"--workers={workers}")
    assert (done.status, done.stdout) == (3, "")
    assert done.stderr.startswith("vantor-analyze: --workers: ")


def test_a_circle_is_told(analyze, boot, tmp_path):
    (tmp_path / "tree.dot").write_text(
        DOT.replace('3 [label="slow"];', '2 -> 5;\n3 [label="slow"];\n5 [label="x" shape=box];\n'
                    '5 -> 1;'), encoding="utf-8")
    done = analyze("simulate", *boot)
    assert (done.status, done.stdout) == (3, "")
    assert done.stderr == (
        "vantor-analyze: the plugins wait for each other in a circle, so the log is not that of a "
        "boot with them: 'disks' -> [storage] -> 'look' -> [x] -> 'disks'\n")


def test_trace(analyze, boot, tmp_path):
    printed = analyze("trace", *boot)
    assert (printed.status, printed.stderr) == (0, "")
    events = json.loads(printed.stdout)["traceEvents"]
    slices = {event["name"]: event for event in events if event["ph"] == "X"}
    assert {name: (event["ts"], event["dur"], event["tid"]) for name, event in slices.items()} == {
        "disks": (1000, 40000, 2), "look": (51000, 40000, 2), "slow": (1000, 30000, 1)}
    [begin], [end] = ([event for event in events if event["ph"] == phase] for phase in "sf")
    assert (begin["id"], begin["tid"], begin["ts"]) == (end["id"], 2, 40999)
    assert (end["bp"], end["tid"], end["ts"]) == ("e", 2, 51000)
    output = tmp_path / "trace.json"
    assert analyze("trace", *boot, "--output", str(output)).stdout == ""
    assert output.read_text(encoding="utf-8") == printed.stdout


def test_a_trace_that_cannot_be_written_is_told(analyze, boot):
    done = analyze("trace", *boot, "--output=/dev/full")
    assert done.status == 3
    assert done.stderr == (
        "vantor-analyze: /dev/full: cannot be written: No space left on device\n")


def test_what_only_one_side_knows_is_told(analyze, boot, tmp_path):
    (tmp_path / "tree.dot").write_text(DOT.replace("slow", "fast"), encoding="utf-8")
    done = analyze("chain", *boot)
    assert done.status == 0
    assert done.stderr == (
        "note: 'slow': only in the log, taken to provide and require nothing\n"
        "note: 'fast': not in the log, left out\n")
    document = json.loads(analyze("chain", *boot, "--format=json").stdout)
    assert document["remarks"] == [line[len("note: "):] for line in done.stderr.splitlines()]


@pytest.mark.parametrize("verb", ["blame", "chain", "trace", "simulate"])
def test_a_file_that_is_no_log_is_refused(analyze, boot, tmp_path, verb):
    (tmp_path / "boot.log").write_text(LOG.replace("09.041000", "09.04"), encoding="utf-8")
    done = analyze(verb, *boot)
    assert (done.status, done.stdout) == (3, "")
    assert done.stderr == (
        f"vantor-analyze: {tmp_path}/boot.log:2: expected microseconds, not \"] sysboot: disks\" "
        "at column 53\n")


def test_a_log_that_is_not_there_is_told(analyze):
    done = analyze("blame", "/nonexistent/log")
    assert (done.status, done.stdout) == (3, "")
    assert done.stderr == (
        "vantor-analyze: /nonexistent/log: cannot be opened: No such file or directory\n")


def test_a_table_fits_the_terminal(analyze, boot, tmp_path):
    name = "a_plugin_of_a_name_much_longer_than_the_line_has_room_for"
    (tmp_path / "boot.log").write_text(LOG.replace("look", name), encoding="utf-8")
    ours, theirs = pty.openpty()
    fcntl.ioctl(theirs, termios.TIOCSWINSZ, struct.pack("HHHH", 24, 90, 0, 0))
    done = analyze("blame", *boot, stdout=theirs)
    os.close(theirs)
    lines = written_on(ours).decode().splitlines()
    assert done.status == 0
    assert all(len(line) <= 90 for line in lines[1:]), lines
    assert lines[1].split("  ")[0] == "PLUGIN"
    assert any(line.startswith("a_plugin_of_") and "...  " in line for line in lines)
