"""What a fleet means for the platform: simulated with the intervals that the agent itself draws.

An interval depends on nothing but the second of the day at which it is drawn, and long timers fire at full
seconds. So agents that once draw in the same second poll together from then on, until one of them draws late:
its reply has taken so long that the next second has begun. A fleet is known from how many of its agents poll
in each second: no agent has to be followed by itself.
"""

from __future__ import annotations

import subprocess
from dataclasses import dataclass
from math import inf

DAY = 24 * 60 * 60
# Share of the draws that fall into the second after the poll's.
LATE = 0.05
_MORNING = 8 * 60 * 60  # second of the day at which the first one starts
# For how many seconds platforms keep an idle connection; the agent itself drops none.
KEPT = {"60 s": 60.0, "200 s": 200.0, "for ever": inf}


@dataclass(frozen=True)
class Intervals:
    """Whole seconds until the first poll and until a later one, by the second of the day of the draw."""

    first: list[int]
    later: list[int]


@dataclass(frozen=True)
class Load:
    """Shares of a fleet by second after the first start: that start, that poll, and that connect anew for a
    poll. A start is one request, on a connection of its own."""

    starts: list[float]
    polls: list[float]
    reconnects: list[float]


def drawn_intervals(program: str) -> Intervals:
    """Those of the agent, from its own function; Qt fires such long timers at full seconds."""
    printed = subprocess.run([program], capture_output=True, text=True, check=True).stdout
    pairs = [line.split() for line in printed.splitlines()]
    assert len(pairs) == DAY, "one pair for each second of the day"
    first, later = ([(int(pair[part]) + 500) // 1000 for pair in pairs] for part in (0, 1))
    return Intervals(first, later)


def simulate(drawn: Intervals, span: int, late: float = LATE, seconds: int = DAY, kept: float = inf) -> Load:
    """A fleet whose terminals start spread evenly over `span` seconds, all with an active session. The
    platform closes connections that have been idle for `kept` seconds."""
    load = Load([0.0] * seconds, [0.0] * seconds, [0.0] * seconds)

    def go_on(now: int, table: list[int], share: float) -> None:
        for delay, part in ((0, 1 - late), (1, late)):
            interval = table[(_MORNING + now + delay) % DAY]
            due = now + delay + interval
            if due < seconds:
                load.polls[due] += share * part
                load.reconnects[due] += share * part if interval >= kept else 0.0

    for now in range(seconds):
        if now < span:
            load.starts[now] = 1 / span
            go_on(now, drawn.first, 1 / span)
        if load.polls[now]:
            go_on(now, drawn.later, load.polls[now])
    return load
