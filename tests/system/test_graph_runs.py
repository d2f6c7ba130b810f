"""Whole graphs: every plugin once, each after its providers, and the order of the serial run."""

import re

import pytest

from harness.graph_model import (
    PluginNode, SerialModel, assert_each_once_after_its_providers, parse, random_graph)
from harness.messages import starting

GATE = PluginNode("gate", provides=["open"])


def lay_out(root, plugins):
    for plugin in plugins:
        root.native(plugin.name, requires=plugin.requires, provides=plugin.provides)


def lay_out_behind_a_gate(root, plugins):
    """All plugins wait for the gate, which waits for run_behind_the_gate() to open it."""
    lay_out(root, plugins)
    root.fifo("/tmp/gate")
    root.native(GATE.name, provides=GATE.provides, opens_to_read="/tmp/gate")
    return [GATE, *plugins]


@pytest.fixture
def run_behind_the_gate(root, start):
    """Runs and opens the gate once every plugin has been requested, so that order is no race."""

    def run_it(*arguments):
        root.remove("/tmp/ran")
        run = start(*arguments)
        run.wait_until(lambda: root.started() == ["gate"], "the gate is reached")
        run.wait_until_asleep()
        with open(root.path("/tmp/gate"), "wb"):
            result = run.wait()
        assert result.status == 0
        return result

    return run_it


def in_load_order(root, plugins):
    by_name = {plugin.name: plugin for plugin in plugins}
    return [by_name[name] for name in root.plugins_in_order()]


def test_one_provider_before_all_that_wait(root, vantor):
    #          +--> one
    # giver ---+--> two --> last
    plugins = parse("last: wants twice", "two: wants ready, gives twice", "one: wants ready",
                    "giver: gives ready")
    lay_out(root, plugins)
    assert vantor().status == 0
    assert_each_once_after_its_providers(plugins, root.ran())


def test_a_barrier_waits_for_every_provider(root, vantor):
    plugins = parse("taker: wants ready", "first: gives ready", "second: gives ready",
                    "third: gives ready other, wants more", "fourth: gives more")
    lay_out(root, plugins)
    for options in ([], ["--parallel"], ["--randomize"]):
        root.remove("/tmp/ran")
        assert vantor(*options).status == 0
        assert_each_once_after_its_providers(plugins, root.ran())


def test_the_longest_chain_goes_first_and_among_equals_the_oldest(root, run_behind_the_gate):
    #                 +--> early
    # gate --> open --+--> late --> x --> last
    #                 +--> other
    lay_out_behind_a_gate(root, parse(
        "early: wants open", "late: wants open, gives x", "other: wants open", "last: wants x"))
    result = run_behind_the_gate(
        "--plugin=libgate.so,libearly.so,liblate.so,libother.so,liblast.so")
    assert result.messages == starting("gate", "late", "early", "other", "last")


@pytest.mark.parametrize("seed", [1, 2, 3])
def test_the_serial_order_of_200_plugins_is_the_models(root, run_behind_the_gate, seed):
    plugins = lay_out_behind_a_gate(root, random_graph(seed, 200, 20))
    result = run_behind_the_gate()
    expected = SerialModel(in_load_order(root, plugins)).order()
    assert result.messages == starting(*expected)
    assert root.started() == expected
    assert_each_once_after_its_providers(plugins, root.ran())


def test_the_serial_order_with_selected_plugins_is_the_models(root, run_behind_the_gate):
    plugins = lay_out_behind_a_gate(root, random_graph(4, 60, 10))
    plugins = plugins[1:] + plugins[:1]
    selection = ",".join(f"lib{plugin.name}.so" for plugin in plugins)
    run_behind_the_gate(f"--plugin={selection}")
    assert root.started() == SerialModel(plugins).order()


def times(root):
    """Start and end of every plugin as the profiling log tells them."""
    found = re.findall(r"^\[(.*) - (.*)\] sysboot: (.*)$", root.read("/var/log/sysboot.log"),
                       re.MULTILINE)
    return {name: (start, end) for start, end, name in found}


@pytest.mark.parametrize("seed", [5, 6, 7])
def test_200_plugins_in_parallel_run_once_each_after_their_providers(root, vantor, seed):
    plugins = random_graph(seed, 200, 20) + [GATE]
    lay_out(root, plugins)
    result = vantor("--parallel", "--trace")
    assert (result.status, result.stderr, root.alerts()) == (0, "", [])
    assert_each_once_after_its_providers(plugins, root.ran())
    lines = re.sub(r"\(took \d+ us\)", "(took N us)", result.stdout).splitlines()
    assert sorted(lines) == sorted(
        [f"starting execution of plugin: {plugin.name}" for plugin in plugins]
        + [f"completed execution of plugin: {plugin.name} (took N us)" for plugin in plugins])
    assert sorted(result.messages) == sorted(starting(*(plugin.name for plugin in plugins)))
    assert list(times(root)) == root.plugins_in_order()
    for start, end in times(root).values():
        assert "1970" < start <= end


def test_randomised_runs_draw_the_same_order_whatever_the_seed(root, run_behind_the_gate):
    plugins = lay_out_behind_a_gate(root, random_graph(8, 200, 20))
    orders = []
    for option in ("--randomize", "--randomize", "--randomize=1", "--randomize=2"):
        run_behind_the_gate(option)
        assert_each_once_after_its_providers(plugins, root.ran())
        orders.append(root.started())
    assert orders[1:] == orders[:1] * 3
    assert orders[0] != SerialModel(in_load_order(root, plugins)).order()


def test_randomised_parallel_runs_keep_the_edges(root, vantor):
    plugins = random_graph(9, 200, 20) + [GATE]
    lay_out(root, plugins)
    assert vantor("--parallel", "--randomize").status == 0
    assert_each_once_after_its_providers(plugins, root.ran())


def test_debug_commands_take_their_place_among_200_plugins(root, vantor):
    plugins = random_graph(10, 200, 20) + [GATE]
    for plugin in plugins:
        if plugin.provides == ["b10"]:
            plugin.requires.append("injected")
    lay_out(root, plugins)
    root.debug_configuration("inject:open:injected:echo start inject >>/tmp/ran;"
                             "echo end inject >>/tmp/ran")
    plugins.append(PluginNode("inject", ["open"], ["injected"]))
    assert vantor("--parallel").status == 0
    assert_each_once_after_its_providers(plugins, root.ran())


def test_thousands_of_edges_between_few_barriers(root, vantor):
    barriers = [f"b{number}" for number in range(100)]
    plugins = [PluginNode(f"giver{number}", provides=barriers) for number in range(10)]
    plugins += [PluginNode(f"taker{number}", requires=barriers) for number in range(10)]
    lay_out(root, plugins)
    assert vantor("--parallel").status == 0
    assert_each_once_after_its_providers(plugins, root.ran())


@pytest.mark.parametrize("options", [[], ["--parallel"], ["--randomize"]])
def test_a_long_chain_runs_from_end_to_end(root, vantor, options):
    links = 150
    plugins = [PluginNode(f"p{number:03}", [f"b{number}"] if number else [], [f"b{number + 1}"])
               for number in range(links)]
    lay_out(root, plugins)
    assert vantor(*options).status == 0
    assert root.started() == [plugin.name for plugin in plugins]
