"""What happens on the dock, and what the agent reports of it to the daemon."""

from __future__ import annotations

from typing import Callable
from uuid import uuid4

import pytest

from sandbox.fakes import dock
from sandbox.fakes.dock import Dock
from sandbox.terminal import Terminal
from tests.e2e import wire

OPENED, CLOSED = 1, 2
UNKNOWN = "unknown entry"

Change = Callable[[Dock], object]

at_start_or_later = pytest.mark.parametrize("at_start", [True, False], ids=["at start", "later"])


def opens(app: str = "mail", docked: bool = False, windows: int = 1) -> Change:
    """An application's entry comes to the dock, called like the application with a capital."""
    return lambda dock: dock.open_app(app, app.capitalize(), docked, windows)


def closes(app: str = "mail") -> Change:
    """An application's entry goes."""
    return lambda dock: dock.close_app(app)


def has_windows(number: int, app: str = "mail") -> Change:
    """An application has so many windows now, all of them new."""
    return lambda dock: dock.set_windows(app, number)


def is_called(name: str, app: str = "mail") -> Change:
    """An application gets another name."""
    return lambda dock: dock.rename(app, name)


def settle(terminal: Terminal) -> None:
    """Return once the agent has handled all signals on the session bus so far, and has read the properties
    that were invalidated.

    The dock removes an unknown entry, which the agent logs: the first time the agent's calls have reached the
    dock, the second time their replies have been handled, too.
    """
    for _ in range(2):
        token = f"{UNKNOWN} {uuid4()}"
        mark = terminal.events.mark()
        terminal.dock.emit(dock.INTERFACE, "EntryRemoved", token)
        terminal.events.wait_for(lambda event: token in event.args[0], kind="log", after=mark)
        terminal.receive_all()


def start(terminal: Terminal) -> None:
    """Start the agent; returns when it has reported what was open."""
    terminal.start_agent()
    settle(terminal)


def reported(terminal: Terminal, after: int = 0) -> list[tuple[int, str]]:
    """Types and names of the applications that the agent has reported since a mark."""
    calls = terminal.events.all(source="velks", target="daemon", member="sendAppOpenState", after=after)
    return [(call.args[0], call.args[1]) for call in calls]


def start_with(terminal: Terminal, change: Change, at_start: bool) -> None:
    """Start the agent; a change happens before, or after."""
    if at_start:
        change(terminal.dock)
    start(terminal)
    if not at_start:
        let_happen(terminal, change)


def let_happen(terminal: Terminal, *changes: Change) -> None:
    """Let changes happen; each waits until the agent has handled the one before."""
    for change in changes:
        change(terminal.dock)
        settle(terminal)


def follows(terminal: Terminal, *changes: Change) -> list[tuple[int, str]]:
    """What the agent reports of these changes."""
    mark = terminal.events.mark()
    let_happen(terminal, *changes)
    return reported(terminal, mark)


def dock_warnings(terminal: Terminal, after: int = 0) -> list[str]:
    """What the agent has warned of since a mark, but for what `settle` provoked and for the missing address
    of a terminal without a platform."""
    provoked = (f'"{UNKNOWN} ', '"getHostAndPort"')
    return [line for line in wire.warnings(terminal, after) if not any(text in line for text in provoked)]


def scans(terminal: Terminal, after: int = 0) -> list[str]:
    """The log lines of the readings of the whole dock since a mark."""
    lines = [event.args[0] for event in terminal.events.all(kind="log", member="info", after=after)]
    return [line for line in lines if line.startswith("dock entry size:")]
