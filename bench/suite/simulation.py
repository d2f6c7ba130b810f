"""What a boot would take if nothing but the plugins' own work took time.

Written from the rules alone: of the nodes that are ready a free worker takes the highest, among
equals the one that has been ready longest; a node is ready when all that it waits for is done.
"""

import heapq
from dataclasses import dataclass, field


@dataclass
class SleepingPlugin:
    """A plugin of a random graph."""

    name: str
    microseconds: int
    requires: list = field(default_factory=list)
    provides: list = field(default_factory=list)


class _Graph:
    """Nodes are plugins by name and barriers by ("barrier", name)."""

    def __init__(self, plugins):
        self.time, self.waits_for, self.followers = {}, {}, {}
        for plugin in plugins:
            self._add(plugin.name, plugin.microseconds)
            for name in plugin.requires:
                self._link(self._add(("barrier", name), 0), plugin.name)
            for name in plugin.provides:
                self._link(plugin.name, self._add(("barrier", name), 0))
        self.height, self.length = {}, {}
        for node in self.time:
            self._measure(node)

    def _add(self, node, time):
        self.time.setdefault(node, time)
        self.waits_for.setdefault(node, [])
        self.followers.setdefault(node, [])
        return node

    def _link(self, first, then):
        self.followers[first].append(then)
        self.waits_for[then].append(first)

    def _measure(self, node):
        """The nodes on the longest way down from here, and the time on the slowest one."""
        if node not in self.height:
            below = [self._measure(other) for other in self.followers[node]]
            self.height[node] = 1 + max((one[0] for one in below), default=0)
            self.length[node] = self.time[node] + max((one[1] for one in below), default=0)
        return self.height[node], self.length[node]


def lower_bound(plugins, workers):
    """No schedule is quicker: the slowest way through the graph, or all work shared out evenly."""
    graph = _Graph(plugins)
    return max(max(graph.length.values()), sum(graph.time.values()) / workers)


def makespan(plugins, workers):
    """Microseconds from the first start to the last end; `plugins` in the order of their loading.

    All plugins are requested, with what they wait for, before a worker looks at any.
    """
    graph = _Graph(plugins)
    left = {node: len(others) for node, others in graph.waits_for.items()}
    ready, arrivals, running = [], 0, []

    def becomes_ready(node):
        nonlocal arrivals
        heapq.heappush(ready, (-graph.height[node], arrivals, node))
        arrivals += 1

    def take():
        while ready and len(running) < workers:
            _, number, node = heapq.heappop(ready)
            heapq.heappush(running, (now + graph.time[node], number, node))

    now = 0
    for node in _in_order_of_request(graph, [plugin.name for plugin in plugins]):
        if left[node] == 0:
            becomes_ready(node)
    take()
    while running:
        now, _, done = heapq.heappop(running)
        for node in graph.followers[done]:
            left[node] -= 1
            if left[node] == 0:
                becomes_ready(node)
        take()
    return now


def _in_order_of_request(graph, names):
    """Nodes without anything to wait for, in the order in which requests reach them."""
    seen, order = set(), []

    def request(node):
        if node not in seen:
            seen.add(node)
            for other in graph.waits_for[node]:
                request(other)
            order.append(node)

    for name in names:
        request(name)
    return order
