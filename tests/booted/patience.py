"""How the tests wait: for what they want to see, never for a time."""

from __future__ import annotations

import time
from pathlib import Path
from typing import Callable, TypeVar

from sandbox.events import NotSeen

REPOSITORY = Path(__file__).resolve().parents[2]
_PATIENCE = 120.0  # also of a machine that is busy with much else
_PAUSE = 0.05

Seen = TypeVar("Seen")


def wait_for(what: str, look: Callable[[], Seen | None], seconds: float = _PATIENCE) -> Seen:
    """Look until something is seen, and return it. A failure names `what`."""
    end = time.monotonic() + seconds
    while True:
        seen = look()
        if seen:
            return seen
        if time.monotonic() > end:
            raise NotSeen(f"{what}: not within {seconds:g} s")
        time.sleep(_PAUSE)
