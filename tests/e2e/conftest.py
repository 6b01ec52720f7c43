"""Terminals that tests of several files begin with."""

from __future__ import annotations

import pytest

from sandbox.terminal import Terminal
from tests.e2e.checkreport import make_all_well
from tests.e2e.software import EDITOR, install


@pytest.fixture
def working(terminal: Terminal) -> Terminal:
    """A terminal of which velks-check finds nothing amiss."""
    make_all_well(terminal)
    return terminal


@pytest.fixture
def polling(terminal: Terminal) -> Terminal:
    """A terminal with a platform, and an agent that is ready."""
    assert terminal.platform
    terminal.start_agent()
    return terminal


@pytest.fixture
def stocked(terminal: Terminal) -> Terminal:
    """A terminal on which the editor is installed, without an agent yet."""
    install(terminal, EDITOR)
    return terminal


@pytest.fixture
def stocked_session(stocked: Terminal) -> Terminal:
    """A terminal on which the editor is installed, and an agent that has reported it."""
    stocked.start_agent()
    return stocked
