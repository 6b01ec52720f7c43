"""The time that the agent lives by."""

from __future__ import annotations

import time

from sandbox.events import Event


class AgentTime:
    """Seconds since the start of the agent, which run `speed` times as fast as real ones; with a speed of 0
    they only pass when they are moved."""

    def __init__(self, speed: int) -> None:
        self.speed = speed
        self._start: float | None = None
        self._moves: list[tuple[float, int]] = []

    def started(self, event: Event) -> None:
        """Count from this event."""
        self._start = event.time
        self._moves.clear()

    def move(self, seconds: int) -> None:
        """Let so much time have passed as of now."""
        self._moves.append((time.monotonic(), seconds))

    def of(self, event: Event) -> float:
        """Agent time of an event, 0 before the agent's start."""
        return self.at(event.time)

    def now(self) -> float:
        """Agent time of this moment."""
        return self.at(time.monotonic())

    def at(self, moment: float) -> float:
        """Agent time of a moment of the host's monotonic clock."""
        if self._start is None:
            return 0.0
        moved = sum(seconds for when, seconds in self._moves if when <= moment)
        return (moment - self._start) * self.speed + moved


def minutes(seconds: float) -> str:
    """Seconds as mm:ss."""
    return f"{int(seconds) // 60:02}:{int(seconds) % 60:02}"
