"""The context in which the prompt's commands run."""

from __future__ import annotations

from difflib import get_close_matches
from typing import Iterable

from rich.console import RenderableType

from sandbox.events import Event, NotSeen
from sandbox.fakes.base import Fake
from sandbox.terminal import Terminal
from sandbox.timeline.timeline import Timeline

_ANSWER_SECONDS = 5.0
_STEP = 10


class CommandRefused(Exception):
    """The command cannot be carried out; the message is one line with the reason."""


def guess(word: str, known: Iterable[str]) -> str:
    """A suggestion of the most similar known word; empty if none is similar."""
    like = get_close_matches(word, known, 1)
    return f"did you mean {like[0]}?" if like else ""


class Context:
    """The terminal, its timeline, and the event up to which `wait` commands have looked."""

    def __init__(self, terminal: Terminal, timeline: Timeline) -> None:
        self.terminal = terminal
        self.timeline = timeline
        self._followed = 0

    def show(self, what: RenderableType) -> None:
        """Print something for the user."""
        self.timeline.print(what)

    def fake(self, name: str) -> Fake:
        """The fake with this name."""
        known = self.terminal.fakes
        if name not in known:
            hint = guess(name, known) or f"there are: {', '.join(known)}"
            raise CommandRefused(f"there is no service '{name}'; {hint}")
        return known[name]

    def present(self, name: str) -> Fake:
        """The fake with this name, which must be on the bus."""
        fake = self.fake(name)
        if not fake.present:
            raise CommandRefused(f"{name} is not on the bus; bring it back with: appear {name}")
        return fake

    def advance(self, seconds: int) -> None:
        """Move the agent's clock ahead in small steps, so that periodic timers fire at each interval. If the
        agent is blocked, move the rest at once."""
        self.present("daemon")  # it wakes the agent up
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
        """Wait for the next event with this member that the timeline shows, after the one found last."""

        def is_wanted(event: Event) -> bool:
            return event.member == member and self.timeline.shows(event)

        events = self.terminal.events
        try:
            found = events.wait_for(is_wanted, after=self._followed, timeout=seconds)
        except NotSeen:
            raise CommandRefused(f"no {member} came within {seconds:g} s") from None
        self._followed = events.all().index(found) + 1
