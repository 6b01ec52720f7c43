"""Simulates the load of a fleet on the platform, with the intervals that the agent itself draws.

An interval depends only on the second of the day at which it is drawn, and long timers fire at full seconds.
Two agents that draw in the same second therefore poll together from then on, until one of them draws late
because its reply arrived in the next second. So the simulation only counts the agents that poll in each
second and does not follow single agents.
"""

from __future__ import annotations

import subprocess
from dataclasses import dataclass
from math import inf

DAY = 24 * 60 * 60
# The share of draws that happen in the second after the poll's.
LATE = 0.05
_MORNING = 8 * 60 * 60  # second of the day at which the first one starts
# For how many seconds platforms keep an idle connection; the agent itself closes none.
KEPT = {"60 s": 60.0, "200 s": 200.0, "for ever": inf}


@dataclass(frozen=True)
class Intervals:
    """Whole seconds until the first poll and between later ones, by the second of the day of the draw."""

    first: list[int]
    later: list[int]


@dataclass(frozen=True)
class Load:
    """The shares of a fleet that start, poll, and reconnect for a poll, by seconds after the first start. A
    start is one request on its own connection."""

    starts: list[float]
    polls: list[float]
    reconnects: list[float]


def drawn_intervals(program: str) -> Intervals:
    """The intervals from the agent's own function, in full seconds, at which Qt fires long timers."""
    printed = subprocess.run([program], capture_output=True, text=True, check=True).stdout
    pairs = [line.split() for line in printed.splitlines()]
    assert len(pairs) == DAY, "one pair for each second of the day"
    first, later = ([(int(pair[part]) + 500) // 1000 for pair in pairs] for part in (0, 1))
    return Intervals(first, later)


def simulate(drawn: Intervals, span: int, late: float = LATE, seconds: int = DAY, kept: float = inf) -> Load:
    """Simulate a fleet whose terminals start evenly over `span` seconds, all with an active session. The
    platform closes connections that have been idle for `kept` seconds."""
    load = Load([0.0] * seconds, [0.0] * seconds, [0.0] * seconds)

    def schedule(now: int, table: list[int], share: float) -> None:
        for delay, part in ((0, 1 - late), (1, late)):
            interval = table[(_MORNING + now + delay) % DAY]
            due = now + delay + interval
            if due < seconds:
                load.polls[due] += share * part
                load.reconnects[due] += share * part if interval >= kept else 0.0

    for now in range(seconds):
        if now < span:
            load.starts[now] = 1 / span
            schedule(now, drawn.first, 1 / span)
        if load.polls[now]:
            schedule(now, drawn.later, load.polls[now])
    return load
