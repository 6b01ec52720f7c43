"""docs/performance.md from a report: the tables that are looked at first, and those of the groups."""

from __future__ import annotations

from bench import days
from bench.figures import Figure, Goal, Report
from bench.page import page

_KNOWN = {
    "date": "2026-11-22",
    "others": 0.25,
    "stolen": 0.0,
    "processors": 2,
    "processor": "P",
    "kernel": "6",
}


def day(name: str, value: float, unit: str = "") -> Figure:
    """A figure of a day."""
    return Figure(f"day.{name}", "title", "count", unit, [value])


def neighbour(name: str, what: str, value: float) -> Figure:
    """A figure of a program beside the agent."""
    return Figure(f"neighbours.{name}.{what}", f"words, {name} 1.0, a daemon", "count", "KiB", [value])


def test_every_place_of_the_template_is_filled_in() -> None:
    assert "@" not in page(Report({}))


def test_page_has_the_figures_of_each_group_and_how_noisy_it_was() -> None:
    figure = Figure("start.local.time", "a start", "time", "ms", [5, 5], [4, 4], Goal("at most", 2))

    lines = page(Report({"start": _KNOWN}, [figure])).splitlines()

    assert "| a start | 5 ms | ± 0% | 4 ms | 1.25 × | ≤ 2 × | reached |" in lines
    assert "| start | 2026-11-22 | 25% | 0% | 2 × P, Linux 6 |" in lines


def test_a_day_stands_beside_the_other_users() -> None:
    lines = days.tables(
        [day("local.cpu", 2, "s"), day("domain.cpu", 3, "s"), day("domain.bytes.list", 7, "kB")]
    )

    assert "| processor time of the agent | 2 s | 3 s |" in lines
    assert "| on the network: polls and message lists | none | 7 kB |" in lines


def test_fleets_of_domain_users_ask_as_often_as_each_of_them() -> None:
    known = [
        day("domain.requests.list", 600),
        day("domain.requests.read", 264),
        day("domain.bytes.list", 500),
    ]

    lines = days.tables(known).splitlines()

    assert lines[-1] == "| 1,000,000 | 864,000,000 | 10,000 | 500 |"


def test_neighbours_have_a_row_each() -> None:
    columns = {"start": 1, "Rss": 2, "Private_Dirty": 3, "wakeups": 4}
    known = [neighbour(name, what, value) for name in ("one", "other") for what, value in columns.items()]

    lines = page(Report({}, known)).splitlines()

    for name in ("one", "other"):
        assert f"| {name} 1.0, a daemon | 1 KiB | 2 KiB | 3 KiB | 4 KiB |" in lines
