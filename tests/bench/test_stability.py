"""When a figure has been measured often enough, and what becomes of one that is too noisy."""

from __future__ import annotations

from itertools import cycle

import pytest

from bench.plan import Plan
from bench.programs import Program
from bench.stability import is_stable, uncertainty


def plan(runs: int, quick: bool = False) -> Plan:
    """One that says nothing."""
    return Plan(runs, quick, 0, lambda text: None)


def test_uncertainty_is_the_notch_of_a_box_plot() -> None:
    assert uncertainty([90, 95, 100, 105, 110]) == pytest.approx(1.57 * 10 / 5**0.5 / 100)


def test_one_value_far_away_does_not_count() -> None:
    assert uncertainty([100, 100, 100, 100, 1000]) == 0


@pytest.mark.parametrize("values", [[100], [0, 0, 0], [0, 0, 0, 7]])
def test_single_values_and_nothings_are_stable(values: list[float]) -> None:
    assert is_stable(values)


def test_the_same_noise_is_stable_after_more_runs() -> None:
    assert not is_stable([90, 95, 100, 105, 110])
    assert is_stable([90, 95, 100, 105, 110] * 5)


def test_stable_figure_is_measured_as_often_as_was_asked_for() -> None:
    assert plan(4).repeat("", lambda: (1, 2)) == [[1] * 4, [2] * 4]


def test_noisy_figure_is_measured_until_it_is_stable() -> None:
    values = iter([100, 150, 200, *[101] * 20])

    (measured,) = plan(4).repeat("", lambda: (next(values),))

    assert 4 < len(measured) < 12
    assert is_stable(measured) and not is_stable(measured[:-1])


@pytest.mark.parametrize("noisy", [0, 1])
def test_figure_that_never_becomes_stable_is_given_up_after_three_times_as_many_runs(noisy: int) -> None:
    values = cycle([50, 100, 200])

    columns = plan(3).repeat("", lambda: (next(values), 7) if noisy == 0 else (7, next(values)))

    assert [len(column) for column in columns] == [9, 9]


def test_quick_run_repeats_nothing() -> None:
    values = cycle([50, 100])
    assert plan(1, quick=True).repeat("", lambda: (next(values),)) == [[50]]


def test_agent_and_floor_are_measured_in_turn() -> None:
    order: list[str] = []

    def one(program: Program) -> float:
        order.append(program.name)
        return 1

    plan(3).pairs("", Program("agent", []), Program("floor", []), one)

    assert order == ["agent", "floor"] * 3
