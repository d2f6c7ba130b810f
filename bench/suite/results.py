"""What was measured: rows of a table and curves, and the way in which pairs are measured."""

import math
import statistics
import sys
import time
from dataclasses import dataclass, field


class BenchError(Exception):
    """A measured program that failed, or did not do what it was measured for."""


def _least_mean(values):
    """Three standard errors below the mean; 0 of a single value, which tells nothing."""
    if len(values) < 2:
        return 0.0
    return statistics.mean(values) - 3 * statistics.stdev(values) / math.sqrt(len(values))


@dataclass
class Row:
    """A figure of ours, with the figure it is compared with if there is one.

    ratios  ours divided by the other, one for each round
    limit   what the ratio is to stay at or below; None where nothing is asked
    growth  both figures are ours, at two sizes, and are to be the same: equal ones differ by chance,
            so that only a mean three standard errors beyond the limit is a growth
    """

    group: str
    work: str
    subject: str
    value: float
    unit: str
    reference: str = ""
    reference_value: float = 0.0
    ratios: list = field(default_factory=list)
    limit: float = None
    growth: bool = False

    @property
    def ratio(self):
        return statistics.median(self.ratios) if self.ratios else None

    @property
    def quartiles(self):
        if len(self.ratios) < 2:
            return (self.ratios * 2)[:2] or None
        low, _, high = statistics.quantiles(self.ratios, n=4, method="inclusive")
        return low, high

    @property
    def verdict(self):
        if self.limit is None or not self.ratios:
            return ""
        least = _least_mean(self.ratios) if self.growth else self.ratio
        return "kept" if least <= self.limit else "missed"


@dataclass
class Curve:
    """Lines over sizes: series maps a name to its points (size, value)."""

    name: str
    title: str
    x_label: str
    y_label: str
    series: dict


class Progress:
    """One line on standard error that says what is being measured."""

    def __init__(self):
        self._start, self._width = time.monotonic(), 0

    def say(self, text):
        seconds = int(time.monotonic() - self._start)
        line = f"bench: {seconds // 60}:{seconds % 60:02} {text}"
        if sys.stderr.isatty():
            sys.stderr.write("\r" + line.ljust(self._width))
            self._width = len(line)
        else:
            sys.stderr.write(line + "\n")
        sys.stderr.flush()

    def end(self):
        if sys.stderr.isatty():
            sys.stderr.write("\n")


def _mean(values):
    """Of figures, or of tuples of figures place by place."""
    if isinstance(values[0], tuple):
        return tuple(statistics.mean(figures) for figures in zip(*values))
    return statistics.mean(values)


class Results:
    """Collects the rows and curves of all groups; the groups measure through it."""

    def __init__(self, rounds, quick):
        self.rounds, self.quick = rounds, quick
        self.progress, self.rows, self.curves, self.failures = Progress(), [], [], []

    def alternate(self, what, candidates, often=None):
        """Measures the candidates in rounds, in turning order; a list of figures for each.

        candidates  name -> function that measures once and returns the figure, or a tuple of figures
        often       name -> how often a round measures it, once where nothing is said: in turn with
                    the others and spread over the round, whose figure is the mean
        """
        counts = {name: (often or {}).get(name, 1) for name in candidates}
        turns = max(counts.values())
        figures = {name: [] for name in candidates}
        for number in range(self.rounds):
            self.progress.say(f"{what}, round {number + 1} of {self.rounds}")
            taken = {name: [] for name in candidates}
            for turn in range(turns):
                order = [name for name, count in counts.items() if turn * count % turns < count]
                for name in order if (number + turn) % 2 == 0 else reversed(order):
                    taken[name].append(candidates[name]())
            for name, values in taken.items():
                figures[name].append(_mean(values))
        return figures

    def figure(self, group, work, subject, values, unit):
        """Reports a figure that is compared with nothing."""
        self.rows.append(Row(group, work, subject, statistics.median(values), unit))

    def compare(self, group, work, unit, ours, theirs, limit=None, growth=False):
        """Reports a pair. `ours` and `theirs` are (name, figures of the same rounds)."""
        ratios = [one / other for one, other in zip(ours[1], theirs[1])]
        self.rows.append(Row(group, work, ours[0], statistics.median(ours[1]), unit, theirs[0],
                             statistics.median(theirs[1]), ratios, limit, growth))
