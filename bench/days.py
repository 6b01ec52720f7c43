"""What a day costs, in tables that are looked at first."""

from __future__ import annotations

from typing import Iterator, Sequence

from bench.figures import Figure, number
from bench.table import markdown

USERS = {"local": "a local user", "domain": "a domain user"}
_SECONDS_PER_DAY = 24 * 60 * 60
_FLEETS = (1_000, 10_000, 1_000_000)
# What is asked of the platform, in the words of the page, by the simulated platform's name of the route.
REQUESTS = {
    "list": "polls and message lists",
    "read": "messages marked read",
    "tips": "password checks",
    "report": "software reports, which the daemon sends",
}
_ROWS = {
    "cpu": "processor time of the agent",
    "tools": "processor time of its children, the package tools",
    "children": "children started",
    "wakeups": "wake-ups",
    "resting": "resting memory",
    "peak": "peak memory",
    **{f"bytes.{route}": f"on the network: {title}" for route, title in REQUESTS.items()},
}

_Known = dict[str, Figure]


def tables(figures: Sequence[Figure]) -> str:
    """What one session costs, and what fleets ask of the platform; a sentence where no day is known."""
    known = {figure.name.removeprefix("day."): figure for figure in figures if figure.name.startswith("day.")}
    if not known:
        return "Not measured yet."
    return f"{markdown(_sessions(known))}\n\n{markdown(_fleets(known))}"


def _sessions(known: _Known) -> Iterator[tuple[str, ...]]:
    yield ("in 24 hours", *USERS.values())
    for name, title in _ROWS.items():
        if any(f"{user}.{name}" in known for user in USERS):
            yield (title, *(_cell(known.get(f"{user}.{name}")) for user in USERS))


def _cell(figure: Figure | None) -> str:
    return "none" if figure is None else f"{number(figure.middle)} {figure.unit}".rstrip()


def _fleets(known: _Known) -> Iterator[tuple[str, ...]]:
    """Domain users alone ask the platform; the daemon sends the reports of all."""
    requests, kilobytes = (_sum(known, f"domain.{what}.") for what in ("requests", "bytes"))
    yield ("terminals of domain users", "requests a day", "requests a second, in the mean", "GB a day")
    for size in _FLEETS:
        day = size * requests
        yield (f"{size:,}", number(day), number(day / _SECONDS_PER_DAY), number(size * kilobytes / 1e6))


def _sum(known: _Known, prefix: str) -> float:
    return sum(figure.middle for name, figure in known.items() if name.startswith(prefix))
