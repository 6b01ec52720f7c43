"""The text of docs/performance.md, from a report."""

from __future__ import annotations

import re
from pathlib import Path
from typing import Iterator

from bench import days
from bench.figures import Figure, Report, number
from bench.table import markdown, page_table

_TEMPLATE = Path(__file__).with_name("performance.md.in")
# Columns of the table of neighbours, by the figures' names.
_NEIGHBOURS = {
    "start": "processor time of the start",
    "Rss": "resident",
    "Private_Dirty": "private dirty",
    "wakeups": "wake-ups in an idle minute",
}


def page(report: Report) -> str:
    """The template with "@table GROUP@", "@day@", "@neighbours@" and "@circumstances@" filled in."""
    parts = {
        "circumstances": _circumstances(report),
        "day": days.tables(report.figures),
        "neighbours": _neighbours(report),
    }
    text = _TEMPLATE.read_text()
    for name, part in parts.items():
        text = text.replace(f"@{name}@", part)
    return re.sub(r"@table (\w+)@", lambda found: page_table(report.group(found[1])), text)


def _neighbours(report: Report) -> str:
    known = {figure.name: figure for figure in report.group("neighbours")}
    if not known:
        return "Not measured yet: `./dev bench neighbours`."
    return markdown([("program", *_NEIGHBOURS.values()), *_neighbour_rows(known)])


def _neighbour_rows(known: dict[str, Figure]) -> Iterator[tuple[str, ...]]:
    """The first figure of each program has its name and version behind the first comma of its title."""
    for name, figure in known.items():
        prefix, _, what = name.rpartition(".")
        if what == next(iter(_NEIGHBOURS)):
            cells = (known[f"{prefix}.{column}"] for column in _NEIGHBOURS)
            title = figure.title.partition(", ")[2]
            yield (title, *(f"{number(cell.middle)} {cell.unit}".rstrip() for cell in cells))


def _circumstances(report: Report) -> str:
    head = ("group", "measured", "used by others", "taken by the host", "on")
    lines = [f"| {' | '.join(head)} |", "| --- | --- | ---: | ---: | --- |"]
    for group, known in report.circumstances.items():
        machine = f"{known['processors']} × {known['processor']}, Linux {known['kernel']}"
        noise = f"{known['others']:.0%} | {known['stolen']:.0%}"
        lines.append(f"| {group} | {known['date']} | {noise} | {machine} |")
    return "\n".join(lines)
