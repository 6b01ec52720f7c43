"""The time that the agent sees."""

from __future__ import annotations

import time

from sandbox.events import Event


class AgentTime:
    """Seconds since the agent's start, `speed` times as fast as real ones; if `speed` is 0, only `move`
    advances them."""

    def __init__(self, speed: int) -> None:
        self.speed = speed
        self._start: float | None = None
        self._moves: list[tuple[float, int]] = []

    def started(self, event: Event) -> None:
        """Restart the count at this event."""
        self._start = event.time
        self._moves.clear()

    def move(self, seconds: int) -> None:
        """Add seconds from now on."""
        self._moves.append((time.monotonic(), seconds))

    def now(self) -> float:
        """The current agent time."""
        return self.at(time.monotonic())

    def at(self, moment: float) -> float:
        """The agent time of a moment on the host's monotonic clock, 0 before the agent's start."""
        if self._start is None:
            return 0.0
        moved = sum(seconds for when, seconds in self._moves if when <= moment)
        return (moment - self._start) * self.speed + moved


def minutes(seconds: float) -> str:
    """Seconds as mm:ss."""
    return f"{int(seconds) // 60:02}:{int(seconds) % 60:02}"
