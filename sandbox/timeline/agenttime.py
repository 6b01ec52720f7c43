"""The time that the agent lives by."""

from __future__ import annotations

import time

from sandbox.events import Event


class AgentTime:
    """Seconds since the start of the agent, which run `speed` times as fast as real ones."""

    def __init__(self, speed: int) -> None:
        self.speed = speed
        self._start: float | None = None

    def started(self, event: Event) -> None:
        """Count from this event."""
        self._start = event.time

    def of(self, event: Event) -> float:
        """Agent time of an event, 0 before the agent's start."""
        return self._since_start(event.time)

    def now(self) -> float:
        """Agent time of this moment."""
        return self._since_start(time.monotonic())

    def _since_start(self, moment: float) -> float:
        return 0.0 if self._start is None else (moment - self._start) * self.speed


def minutes(seconds: float) -> str:
    """Seconds as mm:ss."""
    return f"{int(seconds) // 60:02}:{int(seconds) % 60:02}"
