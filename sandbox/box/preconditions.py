"""What `demo`, `box` and `soak` check before they open a terminal."""

from __future__ import annotations

from sandbox import REPOSITORY, agent
from sandbox.ending import CannotRun
from sandbox.machine.clock import Accelerated, ManualClock, MovableClock


def require_agent() -> None:
    """Raise CannotRun if the agent is not built."""
    binary = agent.default_binary()
    if binary.exists():
        return
    is_own = binary.is_relative_to(REPOSITORY)
    shown = binary.relative_to(REPOSITORY) if is_own else binary
    raise CannotRun(f"there is no agent at {shown}; build it with: ./dev build")


def clock(speed: int) -> MovableClock:
    """A clock that runs `speed` times as fast as the real one, or stands still if `speed` is 0; raises
    CannotRun if the host lacks the library for it."""
    chosen = Accelerated(speed) if speed else ManualClock()
    chosen.environment()  # raises
    return chosen
