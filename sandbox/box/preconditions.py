"""What the programs for people need in the box before they open a terminal."""

from __future__ import annotations

from sandbox import REPOSITORY, agent
from sandbox.box.outside import Trouble
from sandbox.machine.clock import Accelerated, ManualClock, MovableClock


def require_agent() -> None:
    """Trouble when there is no agent to start."""
    binary = agent.default_binary()
    if binary.exists():
        return
    is_own = binary.is_relative_to(REPOSITORY)
    shown = binary.relative_to(REPOSITORY) if is_own else binary
    raise Trouble(f"there is no agent at {shown}; build it with: ./dev build")


def clock(speed: int) -> MovableClock:
    """A clock that runs `speed` times as fast as the real one, or stands still with a speed of 0; Trouble
    when the host lacks what it takes."""
    chosen = Accelerated(speed) if speed else ManualClock()
    try:
        chosen.environment()
    except RuntimeError as error:
        raise Trouble(str(error)) from error
    return chosen
