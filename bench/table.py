"""Figures as tables, on the terminal and for a page."""

from __future__ import annotations

from typing import Sequence

from rich.table import Table

from bench.comparison import Change
from bench.figures import Figure, number, spread

_HEADERS = ("figure", "agent", "spread", "floor", "ratio", "to reach", "")
_VERDICTS = {True: "reached", False: "**missed**", None: ""}


def terminal_table(figures: Sequence[Figure]) -> Table:
    """For a person who waits for it."""
    table = Table(_HEADERS[0])
    for header in _HEADERS[1:]:
        table.add_column(header, justify="right", no_wrap=True)
    for figure in figures:
        style = "red" if figure.is_met is False else None
        table.add_row(*(cell.replace("*", "") for cell in _cells(figure)), style=style)
    return table


def page_table(figures: Sequence[Figure]) -> str:
    """In Markdown."""
    rows = [_HEADERS, ("---",) * len(_HEADERS), *(_cells(figure) for figure in figures)]
    return "\n".join("| " + " | ".join(row) + " |" for row in rows)


def comparison_table(changes: Sequence[Change]) -> Table:
    """What is different from an earlier run."""
    table = Table("figure", "before", "now", "change")
    for change in changes:
        table.add_row(*_comparison_cells(change), style="red" if change.is_rise else None)
    return table


def _cells(figure: Figure) -> tuple[str, ...]:
    floor, ratio = figure.floor_middle, figure.ratio
    return (
        figure.title + (", instructions" if figure.kind == "instructions" else ""),
        _value(figure.middle, figure.unit),
        f"{spread(figure.values):.0%}" if len(figure.values) > 1 else "",
        "" if floor is None else _value(floor, figure.unit),
        "" if ratio is None else f"{ratio:.2f} ×",
        figure.goal.text(figure.unit) if figure.goal else "",
        _VERDICTS[figure.is_met],
    )


def _comparison_cells(change: Change) -> tuple[str, ...]:
    figure, before, factor = change.figure, change.before, change.factor
    return (
        f"{figure.title} ({figure.kind})",
        "" if before is None else _value(before.middle, before.unit),
        _value(figure.middle, figure.unit),
        "new" if before is None else "" if factor is None else f"{factor - 1:+.1%}",
    )


def _value(value: float, unit: str) -> str:
    return f"{number(value)} {unit}".rstrip()
