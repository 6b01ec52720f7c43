"""The arithmetic of the bench: medians, ratios, goals, and what counts as a rise."""

from __future__ import annotations

from pathlib import Path
from typing import Sequence

import pytest

from bench.comparison import Change, changes, missing
from bench.figures import Figure, Goal, Kind, Report, load, number


def figure(
    values: Sequence[float] = (1,),
    floor: Sequence[float] = (),
    goal: Goal | None = None,
    kind: Kind = "memory",
    name: str = "group.figure",
) -> Figure:
    """A figure of which only this matters."""
    return Figure(name, "title", kind, "KiB", values, floor, goal)


@pytest.mark.parametrize(
    ("values", "floor", "ratio"),
    [([3, 100, 2], [1, 2, 0], 3), ([3], [], None), ([0], [0], 1), ([1], [0], float("inf"))],
    ids=["of the medians", "none without a floor", "nothing to nothing", "anything to nothing"],
)
def test_ratio_to_the_floor(values: list[float], floor: list[float], ratio: float | None) -> None:
    assert figure(values, floor).ratio == ratio


@pytest.mark.parametrize(
    ("goal", "values", "reached"),
    [
        (Goal("at most", 1.5), [3], True),
        (Goal("at most", 1.4), [3], False),
        (Goal("at least", 1.5), [3], True),
        (Goal("at least", 1.6), [3], False),
        (Goal("at most", 3, "value"), [3], True),
        (Goal("at most", 2, "value"), [3], False),
        (Goal("at most", 1, "above floor"), [3], True),
        (Goal("at most", 0.5, "above floor"), [3], False),
    ],
)
def test_goal_is_a_bound_of_the_ratio_the_value_or_the_difference(
    goal: Goal, values: list[float], reached: bool
) -> None:
    assert figure(values, [2], goal).is_met is reached


def test_goal_against_a_floor_is_missed_where_there_is_no_floor() -> None:
    assert figure([1], [], Goal("at most", 2)).is_met is False


@pytest.mark.parametrize(
    ("value", "text"), [(1234567.8, "1,234,568"), (12.345, "12.3"), (2.0, "2"), (0.0456, "0.0456")]
)
def test_numbers_show_three_digits_that_count(value: float, text: str) -> None:
    assert number(value) == text


def test_report_comes_back_from_its_file_as_it_was(tmp_path: Path) -> None:
    report = Report({"start": {"others": 0.5}}, [figure([1, 2], [3], Goal("at most", 2)), figure()])
    report.save(tmp_path / "report.json")

    read = load(tmp_path / "report.json")

    assert read.circumstances == report.circumstances
    assert [(one.ratio, one.goal, one.middle) for one in read.figures] == [
        (one.ratio, one.goal, one.middle) for one in report.figures
    ]


def test_report_of_an_older_form_is_refused(tmp_path: Path) -> None:
    Report({"start": {"load": 1}}).save(tmp_path / "report.json")

    with pytest.raises(ValueError, match="older form"):
        load(tmp_path / "report.json")


@pytest.mark.parametrize(
    ("kind", "now", "is_rise"),
    [("memory", 111, True), ("instructions", 111, True), ("memory", 109, False), ("time", 300, False)],
)
def test_only_instructions_and_memory_more_than_a_tenth_above_are_a_rise(
    kind: Kind, now: float, is_rise: bool
) -> None:
    assert Change(figure([now], kind=kind), figure([100], kind=kind)).is_rise is is_rise


def test_what_has_risen_with_its_floor_is_no_rise() -> None:
    before = figure([100], [50])

    assert not Change(figure([130], [65]), before).is_rise
    assert Change(figure([130], [50]), before).is_rise


def test_figures_are_compared_by_their_names() -> None:
    (one, new) = changes([figure([2]), figure(name="group.new")], [figure([1]), figure(name="group.gone")])

    assert (one.factor, new.before) == (2, None)
    assert missing([figure()], [figure(), figure(name="group.gone")]) == ["group.gone"]
