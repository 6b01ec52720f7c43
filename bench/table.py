"""Figures as tables, for the terminal and for a page."""

from __future__ import annotations

from typing import Iterable, Sequence

from rich import box
from rich.table import Table

from bench.comparison import Change
from bench.figures import Figure, number
from bench.stability import WORST_WRITTEN, is_stable

_HEADERS = ("figure", "agent", "known to", "floor", "ratio", "to reach", "")
_VERDICTS = {True: "reached", False: "**missed**", None: ""}
# On a terminal of 80 columns the numbers stay whole, the titles share what is left.
_TERMINAL_HEADERS = ("figure", "agent", "±", "floor", "ratio", "to reach", "")
_NARROW = {"reached": "", "**missed**": "missed"}
_LEAST_TITLE = 14


def terminal_table(figures: Sequence[Figure]) -> Table:
    """The table of a group that is printed after a run, without columns that would be empty."""
    table = Table(box=box.SIMPLE_HEAD, padding=(0, 1, 0, 0), pad_edge=False)
    rows = [_terminal_cells(figure) for figure in figures]
    used = [place for place in range(len(_TERMINAL_HEADERS)) if any(row[place] for row in rows)]
    for place in used:
        if place == 0:
            table.add_column(_TERMINAL_HEADERS[place], min_width=_LEAST_TITLE, overflow="fold")
        else:
            table.add_column(_TERMINAL_HEADERS[place], justify="right", no_wrap=True)
    for figure, row in zip(figures, rows):
        style = "red" if figure.is_met is False else None
        table.add_row(*(row[place] for place in used), style=style)
    return table


def _terminal_cells(figure: Figure) -> list[str]:
    *cells, verdict = _cells(figure)
    return [*(cell.replace("± ", "") for cell in cells), _NARROW.get(verdict, "")]


def page_table(figures: Sequence[Figure]) -> str:
    """In Markdown. A figure that is not known well enough keeps its place, without its numbers; under the
    table stands why a goal was missed."""
    lines = markdown([_HEADERS, *map(_page_cells, figures)])
    reasons = [
        f"- Missed, {figure.title}: {figure.goal.otherwise or 'the cause is not known yet'}."
        for figure in figures
        if figure.goal and figure.is_met is False and _is_known(figure)
    ]
    return "\n".join([lines, *([""] if reasons else []), *reasons])


def markdown(rows: Iterable[Sequence[str]]) -> str:
    """A table whose first row is the head; numbers stand on the right."""
    head, *body = rows
    lines = [head, ("---", *("---:",) * (len(head) - 1)), *body]
    return "\n".join(f"| {' | '.join(line)} |" for line in lines)


def unstable(figures: Sequence[Figure]) -> list[str]:
    """A line for each figure whose median did not become stable."""
    return [
        f"not stable after {len(figure.values)} runs: {figure.title}, known to {_known_to(figure)}"
        for figure in figures
        if not (is_stable(figure.values) and (not figure.floor or is_stable(figure.floor)))
    ]


def _is_known(figure: Figure) -> bool:
    return figure.uncertainty <= WORST_WRITTEN


def _known_to(figure: Figure) -> str:
    return f"± {figure.uncertainty:.0%}" if len(figure.values) > 1 else ""


def _page_cells(figure: Figure) -> tuple[str, ...]:
    cells = _cells(figure)
    if _is_known(figure):
        return cells
    return cells[0], "too noisy", cells[2], "", "", cells[5], ""


def comparison_table(changes: Sequence[Change]) -> Table:
    """The changes since an earlier run."""
    table = Table("figure", "before", "now", "change")
    for change in changes:
        table.add_row(*_comparison_cells(change), style="red" if change.is_rise else None)
    return table


def _cells(figure: Figure) -> tuple[str, ...]:
    floor, ratio = figure.floor_middle, figure.ratio
    return (
        figure.title + (", instructions" if figure.kind == "instructions" else ""),
        _value(figure.middle, figure.unit),
        _known_to(figure),
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
