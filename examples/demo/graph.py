"""Reads the program's DOT dump and draws it: as text here, as SVG by Graphviz."""

import re
import subprocess
from dataclasses import dataclass, field

NODE = re.compile(r'(\d+) \[label="(.*)"( shape=box)?\];')
EDGE = re.compile(r"(\d+) -> (\d+);")


@dataclass
class Vertex:
    """A plugin or a barrier, with the vertices on both sides of it."""

    name: str
    barrier: bool
    before: list = field(default_factory=list)
    after: list = field(default_factory=list)

    def level(self):
        """How many barriers must be reached before this vertex's own turn."""
        return max((other.level() + other.barrier for other in self.before), default=0)


class Graph:
    """A dump, read; ValueError names the first line that no dump holds."""

    def __init__(self, text):
        lines = text.splitlines()
        if lines[:1] != ["digraph g {"] or lines[-1:] != ["}"]:
            raise ValueError("the dump is not framed as a digraph")
        vertices, edges = {}, []
        for line in lines[1:-1]:
            node, edge = NODE.fullmatch(line), EDGE.fullmatch(line)
            if node:
                vertices[node[1]] = Vertex(node[2], bool(node[3]))
            elif edge:
                edges.append((edge[1], edge[2]))
            else:
                raise ValueError(f"not a line of a dump: {line}")
        for source, target in edges:
            # A plugin that a filter kept out has no line of its own, but its barriers know it.
            if target in vertices:
                vertices[source].after.append(vertices[target])
                vertices[target].before.append(vertices[source])
        self.plugins = [vertex for vertex in vertices.values() if not vertex.barrier]
        self.barriers = [vertex for vertex in vertices.values() if vertex.barrier]

    def orders(self):
        """Every pair (earlier, later) of plugin names with a barrier between them."""
        return [
            (earlier.name, later.name)
            for barrier in self.barriers
            for earlier in barrier.before
            for later in barrier.after
        ]


def _names(vertices):
    return ", ".join(sorted(vertex.name for vertex in vertices)) or "(nobody)"


def as_text(graph):
    """A line a barrier, in an order in which they can be reached: who is before it, who after."""
    barriers = sorted(graph.barriers, key=lambda barrier: (barrier.level(), barrier.name))
    left = max((len(_names(barrier.before)) for barrier in barriers), default=0)
    middle = max((len(barrier.name) for barrier in barriers), default=0) + 2
    return [
        f"{_names(barrier.before):>{left}} --> {f'[{barrier.name}]':^{middle}} --> "
        f"{_names(barrier.after)}"
        for barrier in barriers
    ]


def draw(dump, picture):
    """Lets Graphviz draw the dump file as SVG; CalledProcessError when it cannot read it."""
    subprocess.run(["dot", "-Tsvg", dump, "-o", picture], check=True)
