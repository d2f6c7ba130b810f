"""Reads the program's DOT dump and draws it: as text here, as SVG by Graphviz."""

import re
import subprocess
from dataclasses import dataclass, field

NODE = re.compile(r'(\d+) \[label="(.*)"( shape=box)?\];')
EDGE = re.compile(r"(\d+) -> (\d+);")


@dataclass
class Vertex:
    """A plugin or a barrier, with the names on both sides of it."""

    name: str
    barrier: bool
    before: list = field(default_factory=list)
    after: list = field(default_factory=list)


@dataclass
class Graph:
    """The vertices in the order of the dump, by their ids: two plugins may share a name."""

    vertices: dict

    def plugins(self):
        return [vertex for vertex in self.vertices.values() if not vertex.barrier]

    def barriers(self):
        return [vertex for vertex in self.vertices.values() if vertex.barrier]

    def orders(self):
        """Every pair (earlier, later) of plugin names that a barrier puts in order."""
        return [
            (earlier.name, later.name)
            for barrier in self.barriers()
            for earlier in barrier.before
            for later in barrier.after
        ]


def parse(text):
    """The graph of a dump; ValueError names the first line that no dump holds."""
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
        vertices[source].after.append(vertices[target])
        vertices[target].before.append(vertices[source])
    return Graph(vertices)


def level(vertex):
    """How many barriers must be reached before this vertex's own turn."""
    return max((level(other) + other.barrier for other in vertex.before), default=0)


def render(graph):
    """The graph as text: the barriers in the order they can be reached, then the loose plugins."""
    names = lambda vertices: ", ".join(sorted(vertex.name for vertex in vertices)) or "(nobody)"
    lines = []
    ordered = sorted(graph.barriers(), key=lambda barrier: (level(barrier), barrier.name))
    width = max((len(barrier.name) for barrier in ordered), default=0) + 2
    left = max((len(names(barrier.before)) for barrier in ordered), default=0)
    for barrier in ordered:
        box = f"[{barrier.name}]".center(width)
        lines.append(f"{names(barrier.before):>{left}} --> {box} --> {names(barrier.after)}")
    loose = [plugin for plugin in graph.plugins() if not plugin.before and not plugin.after]
    if loose:
        lines.append(f"{names(loose):>{left}}     (no barrier)")
    return lines


def draw(dump, picture):
    """Lets Graphviz draw the dump file as SVG; CalledProcessError when it cannot read it."""
    subprocess.run(["dot", "-Tsvg", str(dump), "-o", str(picture)], check=True)
