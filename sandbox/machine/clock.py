"""Clocks that an agent can be started with."""

from __future__ import annotations

import os
from datetime import datetime, timedelta
from pathlib import Path

from sandbox.ending import CannotRun
from sandbox.machine import layout


class Clock:
    """The time that a program sees: the host's, unchanged."""

    def environment(self) -> dict[str, str]:
        """Environment variables that make a program use this clock."""
        return {}


class MovableClock(Clock):
    """Time that can be moved ahead. A sleeping program notices that only when it wakes up; see
    Terminal.advance."""

    def environment(self) -> dict[str, str]:
        """Preload libfaketime, which reads the time from a file at each call; raises CannotRun without it."""
        return {
            "LD_PRELOAD": _library(),
            "FAKETIME_TIMESTAMP_FILE": str(layout.CLOCK),
            "FAKETIME_NO_CACHE": "1",
        }

    def jump(self, seconds: int) -> None:
        """Move the clock ahead."""
        raise NotImplementedError

    def _set(self, text: str) -> None:
        fresh = layout.CLOCK.with_suffix(".new")
        fresh.write_text(f"{text}\n")
        os.replace(fresh, layout.CLOCK)


class Accelerated(MovableClock):
    """Time that runs `factor` times as fast, including the timeouts of D-Bus calls and transfers."""

    def __init__(self, factor: int) -> None:
        self.factor = factor
        self._ahead = 0
        self.jump(0)

    def jump(self, seconds: int) -> None:
        """Move the clock ahead; it continues to run."""
        self._ahead += seconds
        self._set(f"+{self._ahead} x{self.factor}")


class ManualClock(MovableClock):
    """Time that stands still until it is moved, so that a timer fires at its exact second or not at all.

    It begins at `begin`, by default the host's time; certificates must be valid then.
    """

    def __init__(self, begin: datetime | None = None) -> None:
        self._now = (begin or datetime.now()).replace(microsecond=0)
        self.jump(0)

    def jump(self, seconds: int) -> None:
        """Move the clock ahead; it stands still again."""
        self._now += timedelta(seconds=seconds)
        self._set(f"{self._now:%Y-%m-%d %H:%M:%S}")


def _library() -> str:
    found = sorted(Path("/usr/lib").glob("*/faketime/libfaketimeMT.so.1"))
    if not found:
        raise CannotRun("libfaketime is missing; install it with: apt-get install libfaketime")
    return str(found[0])
