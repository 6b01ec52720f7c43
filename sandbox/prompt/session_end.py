"""Prints where a real session would end: the simulated login manager only records that."""

from __future__ import annotations

from rich.text import Text

from sandbox.events import Event
from sandbox.prompt.context import Context

_ENDS = {
    "Terminate": "The session would end here. The next one begins with: login",
    "Reboot": "The terminal would reboot here. The next session begins with: login",
}


def watch(context: Context) -> None:
    """From now on, print a line after each forced action."""

    def take(event: Event) -> None:
        if (event.source, event.target) == ("velks", "logind") and event.member in _ENDS:
            context.show(Text(_ENDS[event.member], "bold"))

    context.terminal.events.subscribe(take)
