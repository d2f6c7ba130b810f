"""Graphs of plugins for the tests: random ones, text ones, and a model of their serial order."""

import random
from dataclasses import dataclass, field


@dataclass
class PluginNode:
    """What a plugin of a graph is made from."""

    name: str
    requires: list = field(default_factory=list)
    provides: list = field(default_factory=list)


def parse(*lines):
    """Plugins from lines such as "giver: wants a b, gives c"."""
    plugins = []
    for line in lines:
        name, _, rest = line.partition(":")
        plugin = PluginNode(name)
        for part in filter(None, (part.strip() for part in rest.split(","))):
            verb, *barriers = part.split()
            {"wants": plugin.requires, "gives": plugin.provides}[verb].extend(barriers)
        plugins.append(plugin)
    return plugins


def random_graph(seed, plugins, barriers):
    """So many plugins over so many barriers "b00", "b01", ...; every barrier has a provider.

    A plugin of level n gives barrier n and wants some of the barriers below n; those of the lowest
    level want the barrier "open", so that a plugin that gives it holds all the others back.
    """
    draw = random.Random(seed)
    made = []
    for number in range(plugins):
        level = number if number < barriers else draw.randrange(barriers + 1)
        plugin = PluginNode(f"p{number:03}")
        plugin.provides = [f"b{level:02}"] if level < barriers else []
        below = draw.sample(range(level), min(level, draw.randint(1, 3)))
        plugin.requires = [f"b{number:02}" for number in below] or ["open"]
        made.append(plugin)
    draw.shuffle(made)
    return made


class _Node:
    def __init__(self, name, is_plugin):
        self.name, self.is_plugin = name, is_plugin
        self.state, self.known_height = "idle", None
        self.dependencies, self.dependents = [], []

    def height(self):
        if self.known_height is None:
            self.known_height = 1 + max((node.height() for node in self.dependents), default=0)
        return self.known_height


class SerialModel:
    """The order of one worker that finds every plugin requested: highest first, oldest first."""

    def __init__(self, plugins):
        barriers, self._plugins, self._queue = {}, [], []
        for plugin in plugins:
            node = _Node(plugin.name, True)
            self._plugins.append(node)
            for name in plugin.provides:
                barrier = barriers.setdefault(name, _Node(name, False))
                self._link(node, barrier)
            for name in plugin.requires:
                barrier = barriers.setdefault(name, _Node(name, False))
                self._link(barrier, node)

    @staticmethod
    def _link(first, then):
        first.dependents.append(then)
        then.dependencies.append(first)

    def _request(self, node):
        if node.state in ("queued", "done"):
            return
        node.state = "waiting"
        ready = True
        for other in node.dependencies:
            if other.state == "idle":
                self._request(other)
                ready = False
            elif other.state != "done":
                ready = False
        if ready:
            node.state = "queued"
            self._queue.append(node)

    def order(self):
        """The names of the plugins as they are run."""
        for node in self._plugins:
            self._request(node)
        names = []
        while self._queue:
            node = max(self._queue, key=_Node.height)  # the first of the highest
            self._queue.remove(node)
            if node.is_plugin:
                names.append(node.name)
            node.state = "done"
            for other in node.dependents:
                if other.state == "waiting":
                    self._request(other)
        return names


def assert_each_once_after_its_providers(plugins, ran):
    """Checks the lines that stamped plugins noted ("start <name> ...", "end <name> ...")."""
    position = {}
    for number, line in enumerate(ran):
        what, name = line.split()[:2]
        assert (what, name) not in position, f"{what} {name} twice"
        position[what, name] = number
    expected = {(what, plugin.name) for plugin in plugins for what in ("start", "end")}
    assert set(position) == expected
    providers = {}
    for plugin in plugins:
        for barrier in plugin.provides:
            providers.setdefault(barrier, []).append(plugin.name)
    for plugin in plugins:
        for barrier in plugin.requires:
            for provider in providers[barrier]:
                assert position["end", provider] < position["start", plugin.name], (
                    f"{plugin.name} does not wait for {provider}, which provides {barrier}")
