"""What the commands of the prompt work with."""

from __future__ import annotations

from rich.console import Console, RenderableType

from sandbox.events import Event
from sandbox.fakes.base import Peer
from sandbox.terminal import Terminal
from sandbox.timeline.timeline import Timeline


class Refused(Exception):
    """A command that cannot be carried out; the text is the line that says why."""


class Desk:
    """The terminal, its timeline, and how far the person has followed the traffic."""

    def __init__(self, terminal: Terminal, timeline: Timeline, console: Console) -> None:
        self.terminal = terminal
        self.timeline = timeline
        self._console = console
        self._followed = 0

    def show(self, what: RenderableType) -> None:
        """Print something for the person."""
        self._console.print(what)

    def peer(self, name: str) -> Peer:
        """A service by its name."""
        known = self.terminal.peers
        if name not in known:
            raise Refused(f"there is no service '{name}'; there are: {', '.join(known)}")
        return known[name]

    def present(self, name: str) -> Peer:
        """A service that is on the bus."""
        peer = self.peer(name)
        if not peer.present:
            raise Refused(f"{name} is not on the bus; bring it back with: appear {name}")
        return peer

    def follow(self, member: str, seconds: float) -> None:
        """Wait until the traffic, from where it was followed to last, comes to a line with this member."""

        def is_wanted(event: Event) -> bool:
            return event.member == member and self.timeline.shows(event)

        events = self.terminal.events
        try:
            found = events.wait_for(is_wanted, after=self._followed, timeout=seconds)
        except AssertionError:
            raise Refused(f"no {member} came within {seconds:g} s") from None
        self._followed = events.all().index(found) + 1
