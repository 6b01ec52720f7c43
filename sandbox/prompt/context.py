"""What the commands of the prompt work with."""

from __future__ import annotations

from difflib import get_close_matches
from typing import Iterable

from rich.console import RenderableType
from rich.text import Text

from sandbox.events import Event, NotSeen
from sandbox.fakes.base import Fake
from sandbox.terminal import Terminal
from sandbox.timeline.timeline import Timeline

_ANSWER_SECONDS = 5.0
_STEP = 10


class CommandRefused(Exception):
    """A command that cannot be carried out; the text is the line that says why."""


def guess(word: str, known: Iterable[str]) -> str:
    """A question whether one of these was meant, empty if none is like the word."""
    like = get_close_matches(word, known, 1)
    return f"did you mean {like[0]}?" if like else ""


class Context:
    """The terminal, its timeline, and how far the person has followed the traffic."""

    def __init__(self, terminal: Terminal, timeline: Timeline) -> None:
        self.terminal = terminal
        self.timeline = timeline
        self._followed = 0

    def show(self, what: RenderableType) -> None:
        """Print something for the person."""
        self.timeline.print(what)

    def tell(self, line: str) -> None:
        """Say in a line what became of a command."""
        self.show(Text(line, "dim"))

    def fake(self, name: str) -> Fake:
        """A service by its name."""
        known = self.terminal.fakes
        if name not in known:
            hint = guess(name, known) or f"there are: {', '.join(known)}"
            raise CommandRefused(f"there is no service '{name}'; {hint}")
        return known[name]

    def present(self, name: str) -> Fake:
        """A service that is on the bus."""
        fake = self.fake(name)
        if not fake.present:
            raise CommandRefused(f"{name} is not on the bus; bring it back with: appear {name}")
        return fake

    def advance(self, seconds: int) -> None:
        """Let some of the agent's time pass, step by step: one long one would let timers that come again miss
        their turns. Where the agent is blocked, the rest passes at once."""
        self.present("daemon")  # what wakes the agent up
        while seconds:
            step = min(seconds, _STEP) if self._answers() else seconds
            self.timeline.time.move(step)
            self.terminal.jump(step)
            seconds -= step
        self._answers()

    def _answers(self) -> bool:
        try:
            self.terminal.sync(_ANSWER_SECONDS)
        except NotSeen:
            return False
        return True

    def follow(self, member: str, seconds: float) -> None:
        """Wait until the traffic, from where it was followed to last, comes to a line with this member."""

        def is_wanted(event: Event) -> bool:
            return event.member == member and self.timeline.shows(event)

        events = self.terminal.events
        try:
            found = events.wait_for(is_wanted, after=self._followed, timeout=seconds)
        except NotSeen:
            raise CommandRefused(f"no {member} came within {seconds:g} s") from None
        self._followed = events.all().index(found) + 1
