"""How the tests wait: for what they want to see, never for a time."""

from __future__ import annotations

import time
from pathlib import Path
from typing import Callable, TypeVar

REPOSITORY = Path(__file__).resolve().parents[2]
_PATIENCE = 60.0
_PAUSE = 0.05

Seen = TypeVar("Seen")


class NotSeen(Exception):
    """What was waited for did not come."""


def wait_for(what: str, look: Callable[[], Seen | None], seconds: float = _PATIENCE) -> Seen:
    """Look until something is seen, and return it. `what` is told if it never is."""
    end = time.monotonic() + seconds
    while True:
        seen = look()
        if seen:
            return seen
        if time.monotonic() > end:
            raise NotSeen(f"{what}: not within {seconds:g} s")
        time.sleep(_PAUSE)
