"""The simulation of a fleet, with intervals that are easy to reckon with."""

from __future__ import annotations

import pytest

from bench.fleet.simulation import DAY, Intervals, simulate


def test_agents_that_start_together_poll_together() -> None:
    load = simulate(Intervals([100] * DAY, [60] * DAY), span=1, late=0, seconds=300)

    assert [second for second, share in enumerate(load.polls) if share] == [100, 160, 220, 280]
    assert load.polls[100] == 1


def test_start_is_one_request_of_each_agent() -> None:
    load = simulate(Intervals([100] * DAY, [60] * DAY), span=10, late=0, seconds=90)

    assert load.starts[:11] == [0.1] * 10 + [0.0]
    assert sum(load.polls) == 0


def test_agents_that_draw_in_the_same_second_stay_together() -> None:
    first = [100] * DAY
    first[8 * 3600 + 1] = 99  # the second one catches up with the first one
    load = simulate(Intervals(first, [60] * DAY), span=2, late=0, seconds=200)

    assert load.polls[100] == load.polls[160] == 1


def test_late_draw_comes_a_second_later() -> None:
    load = simulate(Intervals([100] * DAY, [60] * DAY), span=1, late=0.25, seconds=150)

    assert (load.polls[100], load.polls[101]) == (0.75, 0.25)


def test_only_polls_after_the_platform_has_closed_connect_anew() -> None:
    load = simulate(Intervals([118] * DAY, [119] * DAY), span=1, late=0, seconds=400, kept=119)

    assert sum(load.polls) == pytest.approx(3)
    assert sum(load.reconnects) == pytest.approx(2)


def test_agents_connect_once_to_a_platform_that_keeps_connections() -> None:
    load = simulate(Intervals([118] * DAY, [100_000] * DAY), span=1, late=0, seconds=DAY)

    assert sum(load.reconnects) == 0
