"""The shortest history that fails, as hypothesis finds it."""

from __future__ import annotations

import sys
import time
from typing import Any, Callable
from unittest import SkipTest

from hypothesis import HealthCheck, Phase, Verbosity, seed, settings
from hypothesis.errors import Flaky
from hypothesis.stateful import run_state_machine_as_test

from sandbox.events import NotSeen
from sandbox.soak.session import Lost, Session

SECONDS = 120
_SETTINGS = settings(
    max_examples=10_000,
    stateful_step_count=30,
    phases=(Phase.generate, Phase.shrink),
    deadline=None,
    database=None,
    report_multiple_bugs=False,
    suppress_health_check=list(HealthCheck),
    verbosity=Verbosity.quiet,
)
_try_out: Callable[..., Any] = run_state_machine_as_test


def shortest_history(number: int, session: Any = Session, seconds: float = SECONDS) -> list[str] | None:
    """Of the histories that failed, the one with the fewest steps after the log-in; None if none failed.

    Hypothesis tries histories, each in a session of its own, until one fails, then shorter ones like it,
    as long as there is time.
    """
    failed: list[list[str]] = []
    end = time.monotonic() + seconds

    class Attempt(session):
        patience = 2.0

        def __init__(self) -> None:
            if time.monotonic() > end:
                raise SkipTest("the time is over")
            super().__init__()

        def teardown(self) -> None:
            if isinstance(sys.exc_info()[1], (Lost, NotSeen)):
                failed.append(self.history)
            super().teardown()

    try:
        _try_out(seed(number)(Attempt), settings=_SETTINGS)
    except (Lost, NotSeen, Flaky, SkipTest):
        pass
    failed.reverse()  # of equal lengths, hypothesis found the simplest last
    return min(failed, key=len) if failed else None
