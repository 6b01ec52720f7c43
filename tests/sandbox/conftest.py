"""Fixtures of the tests of the terminal's own programs."""

from __future__ import annotations

import pytest

from sandbox.terminal import Terminal
from tests.sandbox.recorded_context import RecordedContext


@pytest.fixture
def context(terminal: Terminal) -> RecordedContext:
    """A context at a terminal with a platform, whose agent is not started."""
    assert terminal.platform
    return RecordedContext(terminal)
