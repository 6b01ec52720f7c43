"""What the agent tells the daemon of the applications on the dock."""

from __future__ import annotations

from typing import Callable
from uuid import uuid4

from sandbox.fakes import dock
from sandbox.terminal import Terminal

OPENED, CLOSED = 1, 2


def settle(terminal: Terminal) -> None:
    """Return once the agent has handled all that the dock and others on its bus have said so far, and has
    asked back for what it was not told.

    The dock takes back an entry that nobody knows, which the agent logs; the first one brings the agent's own
    questions to the dock, the second one comes after the answers.
    """
    for _ in range(2):
        token = f"nobody {uuid4()}"
        mark = terminal.events.mark()
        terminal.dock.emit(dock.INTERFACE, "EntryRemoved", token)
        terminal.events.wait_for(lambda event: token in event.args[0], kind="log", after=mark)
        terminal.receive_all()


def start(terminal: Terminal) -> None:
    """Start the agent; it has then told of what was open."""
    terminal.start_agent()
    settle(terminal)


def told(terminal: Terminal, after: int = 0) -> list[tuple[int, str]]:
    """Types and names of the applications that the daemon was told of since a mark."""
    calls = terminal.events.all(source="velks", target="daemon", member="sendAppOpenState", after=after)
    return [(call.args[0], call.args[1]) for call in calls]


def follows(terminal: Terminal, *changes: Callable[[], object]) -> list[tuple[int, str]]:
    """What the daemon is told when these things happen, each after the agent has handled the one before."""
    mark = terminal.events.mark()
    for change in changes:
        change()
        settle(terminal)
    return told(terminal, mark)


def warnings(terminal: Terminal, after: int = 0) -> list[str]:
    """What the agent has warned of since a mark, without what `settle` provoked and without the address of a
    platform, which terminals without one lack."""
    lines = [event.args[0] for event in terminal.events.all(kind="log", member="warning", after=after)]
    return [line for line in lines if '"nobody ' not in line and '"getHostAndPort"' not in line]


def scans(terminal: Terminal, after: int = 0) -> list[str]:
    """The log lines of the readings of the whole dock since a mark."""
    lines = [event.args[0] for event in terminal.events.all(kind="log", member="info", after=after)]
    return [line for line in lines if line.startswith("dock entry size:")]
