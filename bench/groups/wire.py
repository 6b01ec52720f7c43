"""The traffic of polls without messages, by how long the platform keeps an idle connection."""

from __future__ import annotations

from collections import defaultdict
from typing import Iterator, NamedTuple

from bench.testbed import Testbed
from bench.figures import Figure
from bench.fleet.simulation import KEPT
from bench.plan import Plan
from bench.programs import Process, agent
from sandbox.machine.clock import ManualClock

_POLLS = 12
_STEP = 20  # seconds
_BETWEEN_STEPS = 0.05
_PATIENCE = 0.2
_TITLES = {
    "kept": "poll over a kept connection",
    "resumed": "poll over a new connection, TLS session resumed",
    "full": "request over a new connection, full handshake",
}


class _Counts(NamedTuple):
    handshakes: int
    resumed: int
    transferred: int


def measure(plan: Plan) -> Iterator[Figure]:
    """Measures the TCP payload in both directions, and the share of polls that need a handshake."""
    if plan.quick:
        return
    costs: dict[str, list[float]] = defaultdict(list)
    for name, seconds in KEPT.items():
        plan.show_step(f"{_POLLS} polls of a platform that keeps connections {name}")
        polls = _polls(seconds)
        for way, cost in polls:
            costs[way].append(cost)
        connected = 100 * sum(way != "kept" for way, _ in polls[1:]) / _POLLS
        title = f"polls with a handshake, connections kept {name}"
        yield Figure(f"wire.handshakes {name}", title, "count", "%", [connected])
    for way, title in _TITLES.items():
        if costs[way]:
            yield Figure(f"wire.{way}", title, "count", "B", costs[way])


def _polls(kept: float) -> list[tuple[str, float]]:
    """The kind of connection and the bytes of an agent's start and of each of its first polls."""
    clock = ManualClock()
    with Testbed(platform=True) as testbed, testbed.start_and_wait(agent(), clock.environment()) as process:
        found = [("full", float(_counts(testbed).transferred))]
        for _ in range(_POLLS):
            before = _counts(testbed)
            _let_poll(testbed, clock, process, kept)
            after = _counts(testbed)
            found.append((_way(before, after), after.transferred - before.transferred))
    return found


def _let_poll(testbed: Testbed, clock: ManualClock, process: Process, kept: float) -> None:
    """Move the clock to the next poll; the platform closes a connection that has been idle for so long."""
    idle = 0
    while idle == 0 or testbed.platform.await_line("listed", _PATIENCE) is None:
        idle += _STEP
        if idle >= kept:
            testbed.platform.send("close")
            _counts(testbed)  # its reply shows that the connections are closed
        testbed.move_clock(clock, _STEP)
    process.await_calm(_BETWEEN_STEPS)


def _way(before: _Counts, after: _Counts) -> str:
    if after.handshakes == before.handshakes:
        return "kept"
    return "resumed" if after.resumed > before.resumed else "full"


def _counts(testbed: Testbed) -> _Counts:
    testbed.platform.send("counts")
    handshakes, _lists, _reads, transferred, resumed = testbed.platform.wait_for("counts")
    return _Counts(handshakes, resumed, transferred)
