"""Says where the session would have ended: the simulated login manager only takes note."""

from __future__ import annotations

from rich.text import Text

from sandbox.events import Event
from sandbox.prompt.desk import Desk

_ENDS = {
    "Terminate": "The session would end here. The next one begins with: login",
    "Reboot": "The terminal would reboot here. The next session begins with: login",
}


def watch(desk: Desk) -> None:
    """From now on, a line under each forced action."""

    def take(event: Event) -> None:
        if (event.source, event.target) == ("velks", "logind") and event.member in _ENDS:
            desk.show(Text(_ENDS[event.member], "bold"))

    desk.terminal.events.subscribe(take)
