"""What the agent reports to the daemon of the applications on the dock."""

from __future__ import annotations

from typing import Callable
from uuid import uuid4

from sandbox.fakes import dock
from sandbox.terminal import Terminal
from tests.e2e import wire

OPENED, CLOSED = 1, 2
UNKNOWN = "unknown entry"


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


def follows(terminal: Terminal, *changes: Callable[[], object]) -> list[tuple[int, str]]:
    """What the agent reports of these changes; each waits until the agent has handled the one before."""
    mark = terminal.events.mark()
    for change in changes:
        change()
        settle(terminal)
    return reported(terminal, mark)


def warnings(terminal: Terminal, after: int = 0) -> list[str]:
    """What the agent has warned of since a mark, but for what `settle` provoked and for the missing address
    of a terminal without a platform."""
    provoked = (f'"{UNKNOWN} ', '"getHostAndPort"')
    return [line for line in wire.warnings(terminal, after) if not any(text in line for text in provoked)]


def scans(terminal: Terminal, after: int = 0) -> list[str]:
    """The log lines of the readings of the whole dock since a mark."""
    lines = [event.args[0] for event in terminal.events.all(kind="log", member="info", after=after)]
    return [line for line in lines if line.startswith("dock entry size:")]
