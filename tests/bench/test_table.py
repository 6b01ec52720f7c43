"""The bench's tables: on 80 columns, through a pipe, and on a page."""

from __future__ import annotations

import io
from typing import Any

from rich.console import Console

from bench import table
from bench.figures import Figure, Goal

_TITLE = "resident, growth from 10,000 to 100,000 policies"
_NARROW = 80


def figure(**other: Any) -> Figure:
    """One with the longest texts that there are."""
    known: dict[str, Any] = {
        "name": "memory.growth",
        "title": _TITLE,
        "kind": "memory",
        "unit": "KiB",
        "values": [1_234_567] * 5,
        "floor": [1_000_000] * 5,
        "goal": Goal("at most", 4_096, "above floor"),
    }
    return Figure(**{**known, **other})


def piped(figures: list[Figure]) -> list[str]:
    """What a pipe gets."""
    stream = io.StringIO()
    Console(file=stream, width=_NARROW).print(table.terminal_table(figures))
    return stream.getvalue().splitlines()


def test_lines_fit_into_80_columns() -> None:
    assert max(map(len, piped([figure()]))) <= _NARROW


def test_numbers_stay_whole_beside_a_long_title() -> None:
    text = "\n".join(piped([figure()]))

    for cell in ("1,234,567 KiB", "1,000,000 KiB", "1.23 ×", "≤ +4,096 KiB"):
        assert cell in text


def test_words_of_a_title_stay_whole() -> None:
    words = "\n".join(piped([figure()])).split()
    assert set(_TITLE.split()) <= set(words)


def test_missed_goal_is_marked_without_colours() -> None:
    lines = piped([figure(goal=Goal("at most", 0.5), unit="KiB", values=[2], floor=[1], title="memory")])
    assert "missed" in next(line for line in lines if "memory" in line)


def test_columns_that_would_be_empty_leave_their_place_to_the_titles() -> None:
    lines = piped([figure(floor=(), goal=None, values=[1])])
    assert any(_TITLE in line and "1 KiB" in line for line in lines)


def test_page_gives_the_cause_of_a_missed_goal() -> None:
    goal = Goal("at most", 0.5, otherwise="it does more; half of it would reach it")

    page = table.page_table([figure(goal=goal, title="start")])

    assert page.endswith("\n\n- Missed, start: it does more; half of it would reach it.")


def test_page_of_reached_goals_gives_no_cause() -> None:
    assert "Missed" not in table.page_table([figure(goal=Goal("at most", 5, otherwise="no"))])


def test_page_has_no_numbers_that_are_not_known() -> None:
    noisy = figure(title="start", unit="ms", values=[100, 1000, 5000], floor=[7], goal=Goal("at most", 1))

    (row,) = table.page_table([noisy]).splitlines()[2:]

    assert row == "| start | too noisy | ± 222% |  |  | ≤ 1 × |  |"


def test_unstable_figures_are_named_with_their_runs() -> None:
    lines = table.unstable([figure(title="start", values=[100, 200, 300], floor=[7]), figure()])
    assert lines == ["not stable after 3 runs: start, known to ± 45%"]
