"""Tests of what the figures rest on: python3 -B -m pytest -p no:cacheprovider bench"""

import os
import re
import sys

import pytest

HERE = os.path.dirname(os.path.abspath(__file__))
sys.path[:0] = [HERE, os.path.join(HERE, "..", "tests", "system")]

# pylint: disable=wrong-import-position
from suite import graph  # noqa: E402
from suite.command_graphs import CommandGraph  # noqa: E402
from suite.host import one_benchmark  # noqa: E402
from suite.instructions import collected  # noqa: E402
from suite.makespan import GRAPHS, random_plugins  # noqa: E402
from suite.plot import svg  # noqa: E402
from suite.report import summary  # noqa: E402
from suite.results import BenchError, Curve, Results, Row  # noqa: E402
from suite.simulation import SleepingPlugin, lower_bound, makespan  # noqa: E402


def chain_beside_two():
    """One plugin of 10 that another of 20 waits for, loaded after two of 15 that stand alone."""
    return [SleepingPlugin("alone", 15), SleepingPlugin("other", 15),
            SleepingPlugin("first", 10, provides=["b"]), SleepingPlugin("then", 20, ["b"])]


def test_the_highest_goes_first():
    # With two workers "first" and "alone" begin. At 10 "other" is as high as "then" and older, so
    # "then" begins at 15, when "alone" is done. With three, "then" begins at 10.
    assert makespan(chain_beside_two(), 1) == 60
    assert makespan(chain_beside_two(), 2) == 15 + 20
    assert makespan(chain_beside_two(), 3) == 10 + 20


def test_a_barrier_waits_for_all_who_provide_it():
    plugins = [SleepingPlugin("quick", 1, provides=["b"]),
               SleepingPlugin("slow", 9, provides=["b"]), SleepingPlugin("last", 5, ["b"])]
    assert makespan(plugins, 8) == 14


def test_no_schedule_is_quicker_than_the_lower_bound():
    assert lower_bound(chain_beside_two(), 2) == 30
    assert lower_bound(chain_beside_two(), 8) == 30
    assert lower_bound(chain_beside_two(), 1) == 60
    for seed in range(20):
        plugins = random_plugins(seed, 100, 200000, 8)
        assert lower_bound(plugins, 8) <= makespan(plugins, 8)


def test_a_seed_gives_the_same_plugins_again():
    assert random_plugins(3, 50, 200000, 8) == random_plugins(3, 50, 200000, 8)
    assert random_plugins(3, 50, 200000, 8) != random_plugins(4, 50, 200000, 8)


def test_the_longest_path_decides_in_the_last_random_graph_and_the_work_in_the_first():
    for seed, path_decides in ((1, False), (4, True)):
        plugins = random_plugins(seed, 200, 200000, GRAPHS[seed])
        work = sum(plugin.microseconds for plugin in plugins) / 8
        assert (lower_bound(plugins, 8) > work) is path_decides


@pytest.mark.parametrize("shape, line", [
    ("independent", "p1: : :true"), ("chain", "p1:b0:b1:true"), ("layered", "p25:b0:b1:true")])
def test_a_debug_configuration_puts_a_barrier_between_groups(shape, line):
    lines = CommandGraph(shape, 60).debug_configuration("true").splitlines()
    assert len(lines) == 60
    assert line in lines


def test_ninja_and_make_get_the_same_barriers():
    graph = CommandGraph("layered", 40)
    assert "build p20: run | b0\n" in graph.ninja("true")
    assert "p20: b0\n\ttrue;\n" in graph.make("true")


def test_a_ratio_is_the_median_over_the_rounds():
    row = Row("group", "work", "ours", 3, "us", "theirs", 2, [1.0, 2.0, 9.0], limit=2.0)
    assert row.ratio == 2.0
    assert row.quartiles == (1.5, 5.5)
    assert row.verdict == "kept"
    row.limit = 1.9
    assert row.verdict == "missed"


def growth_row(*ratios):
    return Row("group", "work", "ours", 3, "us", "ours", 2, list(ratios), limit=1.0, growth=True)


def test_what_is_to_stay_the_same_has_grown_only_when_chance_is_not_enough():
    assert growth_row(1.06, 0.99, 1.02, 1.07, 1.15, 1.07, 0.97).verdict == "kept"
    assert growth_row(1.06, 1.02).verdict == "kept"
    assert growth_row(1.2).verdict == "kept"


def test_a_small_growth_in_quiet_rounds_and_a_large_one_in_others_is_one():
    assert growth_row(1.02, 1.02, 1.01, 1.02, 1.03, 1.02, 1.01).verdict == "missed"
    assert growth_row(1.20, 1.18, 1.22, 1.15, 1.19, 1.21, 0.99).verdict == "missed"


def test_candidates_take_turns_in_turning_order():
    order = []
    results = Results(rounds=2, quick=True)
    figures = results.alternate("turns", {name: lambda name=name: order.append(name) or len(order)
                                          for name in "abc"})
    assert order == list("abccba")
    assert figures == {"a": [1, 6], "b": [2, 5], "c": [3, 4]}


def test_the_figure_of_a_round_is_the_mean_of_its_turns():
    order = []
    results = Results(rounds=1, quick=True)
    figures = results.alternate("turns", {name: lambda name=name: order.append(name) or len(order)
                                          for name in "abc"}, often={"a": 3, "c": 2})
    assert order == list("abc" "a" "ac")
    assert figures == {"a": [(1 + 4 + 5) / 3], "b": [2], "c": [4.5]}


def test_candidates_change_their_places_from_round_to_round_however_many_turns_there_are():
    order = []
    results = Results(rounds=2, quick=True)
    results.alternate("turns", {name: lambda name=name: order.append(name) or len(order)
                                for name in "ab"}, often={"a": 2})
    assert order == list("ab" "a" "ba" "a")


def test_figures_that_belong_together_are_averaged_place_by_place():
    runs = iter([(1, 10), (3, 30)])
    results = Results(rounds=1, quick=True)
    assert results.alternate("pairs", {"a": lambda: next(runs)}, often={"a": 2}) == {"a": [(2, 20)]}


def test_of_a_repeated_benchmark_the_median_counts():
    report = {"benchmarks": [
        {"name": f"work_{kind}", "aggregate_name": kind, "real_time": time, "time_unit": "ns"}
        for kind, time in (("mean", 5.0), ("median", 4.0), ("stddev", 1.0))]}
    assert one_benchmark(report, "work")["real_time"] == 4.0


def test_a_benchmark_that_failed_has_no_figure():
    report = {"benchmarks": [{"name": "work", "error_occurred": True, "real_time": 0.0,
                              "error_message": "not every node ran", "time_unit": "ns"}]}
    with pytest.raises(BenchError, match="^work: not every node ran$"):
        one_benchmark(report, "work")


@pytest.mark.parametrize("entries", [
    [], [{"name": "one", "time_unit": "ns"}, {"name": "two", "time_unit": "ns"}],
    [{"name": "one", "time_unit": "ms"}]])
def test_a_report_of_anything_but_one_benchmark_in_nanoseconds_is_refused(entries):
    with pytest.raises(BenchError, match="not one benchmark in nanoseconds"):
        one_benchmark({"benchmarks": entries}, "work")


@pytest.mark.parametrize("name, chosen", [
    ("boot/vantor/chain/nodes:1000/workers:1/iterations:1/manual_time", True),
    ("boot/vantor/chain/nodes:10000/workers:1/iterations:1/manual_time", False),
    ("boot/vantor/chain/nodes:1000/workers:16/iterations:1/manual_time", False),
    ("again/boot/vantor/chain/nodes:1000/workers:1/iterations:1/manual_time", False)])
def test_a_benchmark_is_chosen_by_its_whole_name_and_size(name, chosen):
    option, _, pattern = graph.only("boot/vantor/chain", 1000, 1).partition("=")
    assert option == "--benchmark_filter"
    assert bool(re.search(pattern, name)) == chosen


def test_instructions_that_were_not_counted_are_no_figure():
    assert collected("==7== Collected : 1234\n") == 1234
    for text in ("==7== Collected : 0\n", ""):
        with pytest.raises(BenchError, match="^callgrind counted nothing: "):
            collected(text)


def test_the_report_begins_with_the_limits_that_were_missed():
    kept = Row("group", "quick", "ours", 1, "us", "theirs", 1, [1.0], limit=1.0)
    free = Row("group", "whatever", "ours", 9, "us", "theirs", 1, [9.0])
    missed = Row("group", "slow", "ours", 3, "us", "theirs", 2, [1.5], limit=1.25)
    assert summary([kept, free]) == ["Of 1 ratios with a limit, none missed it."]
    assert summary([kept, missed, free]) == [
        "Of 2 ratios with a limit, 1 missed it:", "",
        "- slow, beside theirs: 1.50, the limit is 1.25"]


def test_a_drawing_holds_every_point():
    drawn = svg(Curve("name", "A < B", "x", "y", {"one": [(1, 2), (10, 20)], "two": [(1, 3)]}))
    assert drawn.count("<circle") == 3
    assert "A &lt; B" in drawn
