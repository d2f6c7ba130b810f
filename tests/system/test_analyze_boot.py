"""What vantor-analyze tells of a boot that has taken place, from its log and a drawing."""

import fcntl
import json
import os
import pty
import struct
import termios
import threading

import pytest

from harness.analyze import run_analyze

TREE = "/var/log/tree.dot"

SLEEPER = """
#include <stddef.h>
#include <time.h>
#include <vantor/plugin.h>
VANTOR_METHOD(start) {
    const struct timespec pause = {%(milliseconds)d / 1000, %(milliseconds)d %% 1000 * 1000000L};
    return nanosleep(&pause, NULL);
}
static const char* const needs[] = {%(requires)s NULL};
static const char* const gives[] = {%(provides)s NULL};
VANTOR_OPERATIONS(start);
VANTOR_METADATA_1(needs, gives);
"""

#  disks --> [storage] --+--> datastore --> [datastores] --> guests
#                        +--> scrub
#  nics ---> [nics] ---> network              logs, clock, keys, users: on their own
SLEEPERS = {
    "disks": (400, [], ["storage"]), "datastore": (500, ["storage"], ["datastores"]),
    "guests": (600, ["datastores"], []), "scrub": (300, ["storage"], []),
    "nics": (300, [], ["nics"]), "network": (400, ["nics"], []), "logs": (500, [], []),
    "clock": (300, [], []), "keys": (400, [], []), "users": (300, [], []),
}
LONGEST = 400 + 500 + 600
WORK = sum(milliseconds for milliseconds, _, _ in SLEEPERS.values())

#  disks 0-40 --> [storage] --> look 50-90       slow 0-30
LOG = """NVKernel Initialization Time: 12000000
[2024-03-05 07:08:09.001000 - 2024-03-05 07:08:09.041000] sysboot: disks
[2024-03-05 07:08:09.051000 - 2024-03-05 07:08:09.091000] sysboot: look
[2024-03-05 07:08:09.001000 - 2024-03-05 07:08:09.031000] sysboot: slow
=== Vantor configuration info ===
 Start: 2024-03-05 07:08:09.000000
 End: 2024-03-05 07:08:09.100000
 Verbose: 0
 Parallel: 1
 Randomize: 0
 Interactive Mode: 0
 Random Seed: 5
"""
DOT = """digraph g {
1 [label="disks"];
1 -> 4;
2 [label="look"];
3 [label="slow"];
4 [label="storage" shape=box];
4 -> 2;
}
"""


@pytest.fixture
def analyze(root):
    """analyze(argument..., **how) runs the program on this machine, where the logs are."""
    return lambda *arguments, **how: run_analyze(root, *arguments, **how)


@pytest.fixture
def boot(tmp_path):
    """The arguments that name the log and the drawing above."""
    (tmp_path / "boot.log").write_text(LOG, encoding="utf-8")
    (tmp_path / "tree.dot").write_text(DOT, encoding="utf-8")
    return [str(tmp_path / "boot.log"), "--dot", str(tmp_path / "tree.dot")]


def lay_out(root):
    for name, (milliseconds, required, provided) in SLEEPERS.items():
        root.compiled(name, SLEEPER % {
            "milliseconds": milliseconds,
            "requires": "".join(f'"{barrier}", ' for barrier in required),
            "provides": "".join(f'"{barrier}", ' for barrier in provided)})


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


# A host whose plugins are not there, and what is said of that.
NO_HOST = "--root=/nonexistent"
NO_PLUGINS = ("note: /nonexistent/usr/libexec/vantor/plugins: No such file or directory: nothing is "
              "known of the plugins' barriers\n")


def test_without_the_plugins_of_the_host_the_log_alone_is_read(analyze, boot):
    done = analyze("blame", boot[0], NO_HOST)
    assert (done.status, done.stderr) == (
        0, "note: 'disks', 'look', 'slow': only in the log, taken to provide and require nothing\n"
        + NO_PLUGINS)
    assert len(done.stdout.splitlines()) == 5


def test_a_directory_that_is_named_must_be_there(analyze, boot):
    done = analyze("blame", boot[0], "--directory=/nonexistent")
    assert (done.status, done.stdout, done.stderr) == (
        3, "", "vantor-analyze: /nonexistent: No such file or directory\n")


def test_the_log_of_a_host_stays_within_the_host(analyze, root):
    lay_out(root)
    root.write("/var/log/real.log", LOG)
    root.remove("/var/log/sysboot.log")
    root.symlink("/var/log/real.log", "/var/log/sysboot.log")
    done = analyze("blame", "--root", root.folder)
    assert done.status == 0
    assert "disks" in done.stdout
    root.remove("/var/log/sysboot.log")
    root.fifo("/var/log/sysboot.log")
    done = analyze("blame", "--root", root.folder)
    assert (done.status, done.stdout, done.stderr) == (
        3, "", f"vantor-analyze: {root.folder}/var/log/sysboot.log: not a regular file\n")


@pytest.mark.parametrize("option", ["LOG", "--dot"])
def test_no_more_is_read_than_a_boot_can_leave(analyze, boot, option):
    if not os.path.exists("/dev/zero"):
        pytest.skip("there is no /dev/zero here")
    arguments = ["/dev/zero"] if option == "LOG" else [boot[0], "--dot=/dev/zero"]
    done = analyze("blame", *arguments)
    assert (done.status, done.stdout, done.stderr) == (
        3, "", "vantor-analyze: /dev/zero: longer than any boot leaves: more than 268435456 "
        "bytes\n")


@pytest.mark.parametrize("verb", ["plot", "trace"])
def test_what_is_read_is_not_overwritten(analyze, boot, verb):
    drawing = boot[2]
    for path in (boot[0], drawing):
        with open(path, "rb") as file:
            content = file.read()
        done = analyze(verb, *boot, f"--output={path}")
        assert (done.status, done.stdout, done.stderr) == (
            3, "", f"vantor-analyze: {path}: is what the result is made from, not overwritten\n")
        with open(path, "rb") as file:
            assert file.read() == content


def test_what_a_host_says_is_not_overwritten_under_another_name(analyze, root, vantor):
    lay_out(root)
    assert vantor("--parallel").status == 0
    content = root.read("/var/log/sysboot.log")
    root.write("/data/boot.log", content)
    root.remove("/var/log/sysboot.log")
    root.symlink("/data/boot.log", "/var/log/sysboot.log")
    plugin = root.path("/usr/libexec/vantor/plugins/libdisks.so")
    for verb, path in (("plot", root.path("/data/boot.log")), ("trace", plugin), ("graph", plugin)):
        done = analyze(verb, "--root", root.folder, "--output", path)
        assert (done.status, done.stdout) == (3, ""), verb
        assert done.stderr.endswith(": is what the result is made from, not overwritten\n"), verb
    assert root.read("/data/boot.log") == content
    with open(plugin, "rb") as file:
        assert file.read(4) == b"\x7fELF"


def test_a_result_replaces_an_earlier_one_as_a_whole(analyze, boot, tmp_path):
    output = tmp_path / "boot.json"
    output.write_text("x" * 100000, encoding="utf-8")
    os.chmod(output, 0o640)
    assert analyze("trace", *boot, "--output", str(output)).status == 0
    assert output.read_text(encoding="utf-8") == analyze("trace", *boot).stdout
    assert os.stat(output).st_mode & 0o777 == 0o640
    assert sorted(os.listdir(tmp_path)) == ["boot.json", "boot.log", "tree.dot"]


def test_a_log_without_a_name_is_not_the_hosts(analyze):
    done = analyze("blame", "")
    assert (done.status, done.stdout) == (3, "")
    assert "the file has no name" in done.stderr


@pytest.mark.parametrize("option", ["--dot", "--output"])
def test_a_file_without_a_name_is_refused(analyze, boot, option):
    done = analyze("trace", boot[0], f"{option}=")
    assert (done.status, done.stdout) == (3, "")
    assert f"{option}: the file has no name" in done.stderr


@pytest.mark.parametrize("verb, what", [
    ("plot", b"drawing the boot"), ("blame", b"reading the boot"), ("chain", b"reading the boot"),
    ("trace", b"reading the boot"), ("simulate", b"reading the boot"),
    ("diff", b"comparing the boots")])
def test_a_verb_that_takes_long_says_so_on_a_terminal(analyze, boot, tmp_path, verb, what):
    os.mkfifo(tmp_path / "slow.log")
    ours, theirs = pty.openpty()
    said = b""

    def write_slowly():
        nonlocal said
        with open(tmp_path / "slow.log", "w", encoding="utf-8") as log:
            # The line stands there from the first second on; the log comes only behind it.
            while b")" not in said:
                said += os.read(ours, 4096)
            log.write(LOG)

    writer = threading.Thread(target=write_slowly)
    writer.start()
    other = boot[:1] if verb == "diff" else []
    done = analyze(verb, str(tmp_path / "slow.log"), *other, *boot[1:], stderr=theirs)
    writer.join()
    os.close(theirs)
    rest = os.read(ours, 4096)
    os.close(ours)
    assert done.status == 0
    assert said == b"\r" + what + b" (1 s)"
    assert rest.endswith(b"\r\x1b[K")
    assert done.stdout != ""


@pytest.fixture
def logs(tmp_path):
    """logs(name, end of look, end of the run, name of slow) writes another boot's log."""
    def write(name, look="091", end="100", slow="slow"):
        path = tmp_path / name
        path.write_text(LOG.replace("09.091", f"09.{look}").replace("09.100", f"09.{end}")
                        .replace(": slow", f": {slow}"), encoding="utf-8")
        return str(path)

    return write


def test_diff_of_two_boots(analyze, logs):
    done = analyze("diff", logs("old"), logs("new", look="151", end="160", slow="other"), NO_HOST)
    assert (done.status, done.stderr) == (0, NO_PLUGINS)
    assert done.stdout == (
        "1 boot before, 1 boot after; all times in ms, medians where there are several\n"
        "total: 100.000 before, 160.000 after, +60.000 (+60.0 %), slower\n"
        "CHANGE\tOLD\tNEW\tDIFFERENCE\tNOISE\tPLUGIN\n"
        "slower\t40.000\t100.000\t+60.000\t5.000\tlook\n"
        "added\t-\t-\t-\t-\tother\n"
        "removed\t-\t-\t-\t-\tslow\n"
        "unchanged: 1 plugin\n"
        "critical chain: not compared, as the plugins are not there (--directory, --dot)\n")


def test_diff_of_several_boots_a_side_goes_by_their_spread(analyze, logs):
    old = [logs("a", look="090"), logs("b", look="110")]
    new = [logs("c", look="105"), logs("d", look="112")]
    document = json.loads(
        analyze("diff", "--old", *old, "--new", *new, "--format=json").stdout)
    assert (document["slower"], document["unchanged"]) == ([], 3)
    new = [logs("c", look="125"), logs("d", look="130")]
    document = json.loads(
        analyze("diff", "--old", *old, "--new", *new, "--format=json").stdout)
    assert document["slower"] == [
        {"plugin": "look", "old": 49000, "new": 76500, "difference": 27500, "noise": 20000,
         "oldSpread": 20000, "newSpread": 5000}]


def test_diff_names_what_moved_onto_the_critical_chain(analyze, logs, boot):
    new = logs("new", look="055", end="060")
    done = analyze("diff", logs("old"), new, *boot[1:])
    assert "onto the critical chain: none\noff the critical chain: none\n" in done.stdout
    with open(new, encoding="utf-8") as file:
        text = file.read()
    with open(new, "w", encoding="utf-8") as file:
        file.write(text.replace("09.031", "09.059"))
    done = analyze("diff", logs("old"), new, *boot[1:])
    assert "onto the critical chain: slow\noff the critical chain: disks, look\n" in done.stdout


def test_diff_compares_the_chains_of_the_hosts_own_plugins(analyze, logs, root):
    lay_out(root)
    done = analyze("diff", logs("old"), logs("new"), "--root", root.folder)
    assert "onto the critical chain: none\noff the critical chain: none\n" in done.stdout


@pytest.mark.parametrize("limit, status", [("59.9", 2), ("60", 0), ("100", 0), ("0", 2)])
def test_diff_is_a_gate_for_the_total(analyze, logs, limit, status):
    done = analyze("diff", logs("old"), logs("new", end="160"), f"--fail-over={limit}")
    assert done.status == status


def test_diff_is_no_gate_for_noise(analyze, logs):
    old = [logs("old"), logs("old2", end="190")]
    new = [logs("new", end="110"), logs("new2", end="195")]
    done = analyze("diff", "--old", *old, "--new", *new, "--fail-over=1", NO_HOST)
    assert "within the noise" in done.stdout
    assert (done.status, done.stderr) == (0, NO_PLUGINS)


def test_diff_says_that_the_total_grew_too_much(analyze, logs):
    done = analyze("diff", logs("old"), logs("new", end="160"), "--fail-over=10", NO_HOST)
    assert done.stderr == NO_PLUGINS + "vantor-analyze: the total grew by more than 10 %\n"


@pytest.mark.parametrize("value", ["nan", "-1", "1e7", "inf", "1x", ""])
@pytest.mark.parametrize("option", ["--margin", "--fail-over"])
def test_diff_takes_no_share_that_is_none(analyze, logs, option, value):
    done = analyze("diff", logs("old"), logs("new"), f"{option}={value}")
    assert (done.status, done.stdout) == (3, "")
    assert f"{value} is no number from 0 to 1e+06" in done.stderr


def test_diff_needs_both_sides(analyze, logs):
    one = logs("one")
    for arguments in ([], [one], ["--old", one], [one, one, "--old", one]):
        done = analyze("diff", *arguments)
        assert (done.status, done.stdout) == (3, "")
        assert done.stderr.startswith("vantor-analyze: diff takes two logs, OLD and NEW"), done


def test_a_table_fits_the_terminal(analyze, boot, tmp_path):
    name = "a_plugin_of_a_name_much_longer_than_the_line_has_room_for"
    (tmp_path / "boot.log").write_text(LOG.replace("look", name), encoding="utf-8")
    ours, theirs = pty.openpty()
    fcntl.ioctl(theirs, termios.TIOCSWINSZ, struct.pack("HHHH", 24, 90, 0, 0))
    done = analyze("blame", *boot, stdout=theirs)
    os.close(theirs)
    lines = os.read(ours, 65536).decode().splitlines()
    os.close(ours)
    assert done.status == 0
    assert all(len(line) <= 90 for line in lines[1:]), lines
    assert lines[1].split("  ")[0] == "PLUGIN"
    assert any(line.startswith("a_plugin_of_") and "...  " in line for line in lines)
