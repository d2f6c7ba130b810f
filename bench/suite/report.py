"""The table as Markdown and as JSON, the curves as SVG, and the page of the documents."""

import dataclasses
import json
import os
import re

from suite.plot import svg

TITLES = {
    "commands": "Boots of shell commands",
    "graph": "The graph and its executor alone",
    "memory": "Memory",
    "loading": "Loading native plugins",
    "json": "Reading JSON",
    "lines": "Reading the debug configuration",
    "makespan": "Makespan",
    "startup": "Start-up",
    "instructions": "Instruction counts",
}
BUSY = 0.05  # share of the processors in use by others from which figures are called doubtful
_MARKS = ("<!-- figures: written by scripts/bench --update-docs -->", "<!-- end of figures -->")


def figure(value):
    """Three digits, or all before the point."""
    if value >= 100:
        return f"{value:,.0f}"
    return f"{value:.3g}" if value >= 0.001 else f"{value:.1g}"


def _row(row):
    ours = f"{figure(row.value)} {row.unit}"
    if not row.ratios:
        return f"| {row.work} | {row.subject} {ours} | | | | |"
    low, high = row.quartiles
    spread = f"{low:.2f} to {high:.2f}" if len(row.ratios) > 1 else ""
    limit = f"no growth beyond chance: {row.verdict}" if row.growth else \
        f"{row.limit:g} {row.verdict}" if row.verdict else ""
    cells = [row.work, f"{row.subject} {ours}", f"{row.reference} {figure(row.reference_value)}",
             f"{row.ratio:.2f}", spread, limit]
    return "| " + " | ".join(cells).rstrip() + " |"


def _conditions(meta):
    lines = [
        f"Machine: {meta['machine']}. Made by `{meta['command']}`, {meta['rounds']} rounds, "
        f"in {meta['seconds'] // 60} min {meta['seconds'] % 60} s."]
    if meta["other_load"] > BUSY:
        lines += ["", f"**The machine was busy**: up to {meta['other_load']:.0%} of its processors "
                  "were in use by other work between the measurements. Ratios may be off by as "
                  "much, and absolute figures are of little worth."]
    for text in meta["failures"]:
        lines += ["", f"**Not measured**: {text}"]
    return lines


def summary(rows):
    """How many limits there are, and the rows that miss theirs."""
    verdicts = [row.verdict for row in rows if row.verdict]
    missed = [f"- {row.work}, beside {row.reference}: {row.ratio:.2f}, the limit is {row.limit:g}"
              for row in rows if row.verdict == "missed"]
    line = f"Of {len(verdicts)} ratios with a limit, {len(missed) or 'none'} missed it"
    return [line + ":", "", *missed] if missed else [line + "."]


def table(results, meta, level=2):
    """The whole report as Markdown."""
    lines = [*_conditions(meta), "", *summary(results.rows)]
    for group, title in TITLES.items():
        rows = [row for row in results.rows if row.group == group]
        if rows:
            lines += ["", "#" * level + " " + title, "",
                      "| Work | vantor | Beside it | Ratio | Quartiles | Limit |",
                      "|---|---|---|---|---|---|", *map(_row, rows)]
            for curve in results.curves:
                if curve.name.split("-")[0] == group:
                    lines += ["", f"![{curve.title}]({meta['drawings']}{curve.name}.svg)"]
    return "\n".join(lines) + "\n"


def _json(results, meta):
    rows = []
    for row in results.rows:
        rows.append({**dataclasses.asdict(row), "ratio": row.ratio, "quartiles": row.quartiles,
                     "verdict": row.verdict})
    return {"run": meta, "rows": rows,
            "curves": [dataclasses.asdict(curve) for curve in results.curves]}


def _write(path, text):
    with open(path, "w", encoding="utf-8") as file:
        file.write(text)


def _draw(results, folder):
    os.makedirs(folder, exist_ok=True)
    for curve in results.curves:
        _write(os.path.join(folder, curve.name + ".svg"), svg(curve))


def write(results, meta, folder):
    """Writes report.md, report.json and the drawings; the Markdown."""
    _draw(results, folder)
    text = table(results, {**meta, "drawings": ""})
    _write(os.path.join(folder, "report.md"), "# Measured\n\n" + text)
    _write(os.path.join(folder, "report.json"), json.dumps(_json(results, meta), indent=1) + "\n")
    return text


def update_page(results, meta, page):
    """Replaces the figures of the page of the documents, and its drawings."""
    drawings = os.path.splitext(page)[0]
    _draw(results, drawings)
    with open(page, encoding="utf-8") as file:
        text = file.read()
    inside = table(results, {**meta, "drawings": os.path.basename(drawings) + "/"}, level=3)
    pattern = re.escape(_MARKS[0]) + ".*" + re.escape(_MARKS[1])
    replaced, count = re.subn(pattern, lambda _: f"{_MARKS[0]}\n\n{inside}\n{_MARKS[1]}", text,
                              flags=re.DOTALL)
    if count != 1:
        raise ValueError(f"{page} has no place for the figures")
    _write(page, replaced)
