"""What a poll without messages costs on the wire, with and without a new connection."""

from __future__ import annotations

from typing import Iterator

from bench.bed import Bed
from bench.figures import Figure
from bench.plan import Plan
from bench.programs import agent
from sandbox.machine.clock import ManualClock

_POLLS = 16
_STEP = 20  # seconds
_BETWEEN_STEPS = 0.05
_PATIENCE = 0.2


def measure(plan: Plan) -> Iterator[Figure]:
    """Bytes of TCP payload in both directions. A connection that was idle for too long is not used again."""
    if plan.quick:
        return
    plan.tell(f"{_POLLS} polls on the wire")
    kept: list[float] = []
    fresh: list[float] = []
    clock = ManualClock()
    with Bed(platform=True) as bed, bed.start_and_wait(agent(), clock.environment()) as process:

        def counts() -> tuple[int, int]:
            bed.platform.tell("counts")
            handshakes, *_, transferred = bed.platform.wait_for("counts")
            return handshakes, transferred

        handshakes, transferred = counts()
        for _ in range(_POLLS):
            bed.move_clock(clock, _STEP)
            while bed.platform.await_line("listed", _PATIENCE) is None:
                bed.move_clock(clock, _STEP)
            process.await_calm(_BETWEEN_STEPS)
            handshakes_before, before = handshakes, transferred
            handshakes, transferred = counts()
            (kept if handshakes == handshakes_before else fresh).append(transferred - before)
    yield Figure("wire.kept", "poll over a kept connection", "count", "B", kept)
    yield Figure("wire.fresh", "poll with a new handshake", "count", "B", fresh)
