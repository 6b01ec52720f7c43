"""Clocks that an agent can be started with."""

from __future__ import annotations

import os
from datetime import datetime, timedelta
from pathlib import Path
from typing import Protocol

from sandbox.machine import layout


class Clock(Protocol):
    """Tells which environment makes a program live by this clock."""

    def environment(self) -> dict[str, str]:
        """Variables to start the program with."""


class RealTime:
    """The host's time, unchanged."""

    def environment(self) -> dict[str, str]:
        """Nothing to add."""
        return {}


class Accelerated:
    """Time that runs `factor` times as fast, time limits of D-Bus calls and transfers included."""

    def __init__(self, factor: int) -> None:
        self.factor = factor

    def environment(self) -> dict[str, str]:
        """Preloads the clock with its rate."""
        return {"LD_PRELOAD": _library(), "FAKETIME": f"+0 x{self.factor}"}


class ManualClock:
    """Time that stands still until it is moved, so that a timer fires at its exact second or not at all.

    It begins at the host's time, unless another is given; certificates must be valid then. A sleeping program
    does not see a move before it wakes up: see Terminal.advance.
    """

    def __init__(self, begin: datetime | None = None) -> None:
        self._now = (begin or datetime.now()).replace(microsecond=0)
        self._write()

    def environment(self) -> dict[str, str]:
        """Preloads the clock, which looks up the time each time that it is asked."""
        return {
            "LD_PRELOAD": _library(),
            "FAKETIME_TIMESTAMP_FILE": str(layout.CLOCK),
            "FAKETIME_NO_CACHE": "1",
        }

    def jump(self, seconds: int) -> None:
        """Move the clock ahead."""
        self._now += timedelta(seconds=seconds)
        self._write()

    def _write(self) -> None:
        fresh = layout.CLOCK.with_suffix(".new")
        fresh.write_text(f"{self._now:%Y-%m-%d %H:%M:%S}\n")
        os.replace(fresh, layout.CLOCK)


def _library() -> str:
    found = sorted(Path("/usr/lib").glob("*/faketime/libfaketimeMT.so.1"))
    if not found:
        raise RuntimeError("libfaketime is missing; install it with: apt-get install libfaketime")
    return str(found[0])
