"""Curves as SVG, both axes logarithmic."""

import math
from xml.sax.saxutils import escape

WIDTH, HEIGHT = 640, 400
LEFT, RIGHT, TOP, BOTTOM = 70, 190, 40, 50
COLOURS = ["#1b6ca8", "#c8553d", "#3a7d44", "#7b4b94", "#b8860b", "#555555"]


class _Axis:
    """Maps values to places between two ends, which stand at round values."""

    def __init__(self, values, first, last):
        low, high = math.log10(min(values)), math.log10(max(values))
        self._low, self._high = low - 0.05, max(high, low + 0.1) + 0.05
        self._first, self._last = first, last

    def place(self, value):
        share = (math.log10(value) - self._low) / (self._high - self._low)
        return self._first + share * (self._last - self._first)

    def ticks(self):
        """1, 2 and 5 of every power of ten; only the powers where the axis is long."""
        steps = (1,) if self._high - self._low > 2.5 else (1, 2, 5)
        for power in range(math.floor(self._low), math.ceil(self._high) + 1):
            for step in steps:
                value = step * 10 ** power
                if self._low <= math.log10(value) <= self._high:
                    yield value


def _line(x1, y1, x2, y2, colour, width=1):
    return (f'<line x1="{x1:.1f}" y1="{y1:.1f}" x2="{x2:.1f}" y2="{y2:.1f}" '
            f'stroke="{colour}" stroke-width="{width}"/>')


def _words(x, y, text, anchor="middle", more=""):
    return f'<text x="{x:.1f}" y="{y:.1f}" text-anchor="{anchor}"{more}>{escape(text)}</text>'


def _grid(x_axis, y_axis):
    right, bottom = WIDTH - RIGHT, HEIGHT - BOTTOM
    for value in x_axis.ticks():
        x = x_axis.place(value)
        yield _line(x, TOP, x, bottom, "#dddddd")
        yield _words(x, bottom + 18, f"{value:,g}" if value < 1e6 else f"{value:,.0f}")
    for value in y_axis.ticks():
        y = y_axis.place(value)
        yield _line(LEFT, y, right, y, "#dddddd")
        yield _words(LEFT - 8, y + 4, f"{value:,g}" if value < 1e6 else f"{value:,.0f}", "end")


def _series(x_axis, y_axis, series):
    for number, (name, points) in enumerate(series.items()):
        colour = COLOURS[number % len(COLOURS)]
        places = [(x_axis.place(x), y_axis.place(y)) for x, y in points]
        path = " ".join(f"{x:.1f},{y:.1f}" for x, y in places)
        yield f'<polyline points="{path}" fill="none" stroke="{colour}" stroke-width="2"/>'
        for x, y in places:
            yield f'<circle cx="{x:.1f}" cy="{y:.1f}" r="3" fill="{colour}"/>'
        y = TOP + 12 + 18 * number
        yield _line(WIDTH - RIGHT + 12, y - 4, WIDTH - RIGHT + 32, y - 4, colour, 2)
        yield _words(WIDTH - RIGHT + 38, y, name, "start")


def svg(curve):
    """The drawing of a curve."""
    points = [point for line in curve.series.values() for point in line]
    x_axis = _Axis([x for x, _ in points], LEFT, WIDTH - RIGHT)
    y_axis = _Axis([y for _, y in points], HEIGHT - BOTTOM, TOP)
    middle = (TOP + HEIGHT - BOTTOM) / 2
    parts = [
        f'<svg xmlns="http://www.w3.org/2000/svg" width="{WIDTH}" height="{HEIGHT}" '
        f'viewBox="0 0 {WIDTH} {HEIGHT}" font-family="sans-serif" font-size="12">',
        f'<rect width="{WIDTH}" height="{HEIGHT}" fill="white"/>',
        _words((LEFT + WIDTH - RIGHT) / 2, 22, curve.title, more=' font-size="14"'),
        *_grid(x_axis, y_axis), *_series(x_axis, y_axis, curve.series),
        _words((LEFT + WIDTH - RIGHT) / 2, HEIGHT - 12, curve.x_label),
        _words(18, middle, curve.y_label, more=f' transform="rotate(-90 18 {middle:.0f})"'),
        "</svg>"]
    return "\n".join(parts) + "\n"
