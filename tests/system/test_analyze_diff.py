"""vantor-analyze diff: two boots beside each other, or several on a side."""

import json

import pytest

from harness.sample_boot import LOG, NO_HOST, NO_PLUGINS, lay_out


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
