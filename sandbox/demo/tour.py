"""Plays scenes and compares the expected with the actual events."""

from __future__ import annotations

import time
from dataclasses import dataclass
from typing import Container, Literal, Mapping

from rich.padding import Padding
from rich.rule import Rule
from rich.text import Text

from sandbox.demo.scene import REBOOT, Expectation, Scene, Step
from sandbox.events import Event, NotSeen
from sandbox.terminal import Terminal
from sandbox.timeline.timeline import Timeline

Verdict = Literal["as expected", "missing", "forbidden", "not played"]


@dataclass(frozen=True)
class Outcome:
    """The result of an expectation: its verdict, the event seen, and its delay after the cue in agent
    time."""

    scene: str
    expectation: Expectation
    verdict: Verdict
    seen: Event | None = None
    delay: float = 0.0


# Waits longer than _LONG_WAIT are shortened: the clock skips some seconds at a time.
_LONG_WAIT, _SKIP = 60, 5
_INDENTED = (0, 0, 0, 7)
_RESPONSIVE = Expectation("the agent handles messages", "velks", "log", "info")


class Tour:
    """Plays scenes until a step fails; the later ones are then not played.

    `patience` is the real time in seconds by which an event may be late.
    """

    def __init__(self, terminal: Terminal, timeline: Timeline, patience: float) -> None:
        self._terminal = terminal
        self._timeline = timeline
        self._patience = patience
        self._outcomes: list[Outcome] = []
        self._mark = 0
        self._cue = 0.0

    def play(self, scenes: Mapping[int, Scene], drawn: Container[int]) -> list[Outcome]:
        """Play the scenes, given by number, and draw some of them; returns an outcome for each
        expectation."""
        self._terminal.events.subscribe(self._end_at_reboot)
        for scene in scenes.values():
            scene.beforehand(self._terminal)
        for place, (number, scene) in enumerate(scenes.items(), 1):
            self._timeline.draw(number in drawn)
            if self._as_expected:
                self._print_heading(f"{number}. {scene.title}", f"  {place} of {len(scenes)}", scene.sentence)
            self._play_scene(f"{number}. {scene.title}", scene)
        return self._outcomes

    def _end_at_reboot(self, event: Event) -> None:
        """Stop showing events, since a real terminal would reboot now."""
        if REBOOT.matches(event):
            self._timeline.end()

    @property
    def _as_expected(self) -> bool:
        return all(outcome.verdict == "as expected" for outcome in self._outcomes)

    def _print_heading(self, title: str, place: str, sentence: str) -> None:
        self._timeline.print()
        self._timeline.print(Rule(Text.assemble((title, "bold"), (place, "dim")), align="left", style="dim"))
        self._timeline.print(Text(sentence))

    def _play_scene(self, title: str, scene: Scene) -> None:
        for step in scene.steps:
            if self._as_expected:
                self._outcomes += self._play_step(title, step)
            else:
                self._outcomes += [Outcome(title, expected, "not played") for expected in step.then]
        if self._as_expected and scene.remark:
            self._timeline.print(Text(scene.remark, "dim"))

    def _play_step(self, title: str, step: Step) -> list[Outcome]:
        if step.cue:
            self._mark, self._cue = self._terminal.events.mark(), time.monotonic()
            step.cue(self._terminal)
        is_stuck = self._all_come(step) and not self._settles()
        outcomes = self._judge(title, step)
        if is_stuck:
            outcomes.append(Outcome(title, _RESPONSIVE, "missing"))
        elif not step.wanted and all(outcome.verdict == "as expected" for outcome in outcomes):
            self._print_silence(step)
        return outcomes

    def _all_come(self, step: Step) -> bool:
        """Wait for the wanted events; returns False at the first that does not come."""
        place = self._mark
        for expectation in step.wanted:
            event = self._wait_for(expectation, place)
            if event is None:
                return False
            place = self._next_place(step, event)
        return True

    def _wait_for(self, expectation: Expectation, place: int) -> Event | None:
        speed = self._timeline.time.speed
        due = self._cue + (expectation.within / speed if speed else 0) + self._patience
        timeout = max(0.0, due - time.monotonic())
        with self._timeline.waiting(expectation.words):
            if not speed or expectation.within > _LONG_WAIT:
                self._let_pass(expectation, place, step=_SKIP if speed else 1)
            try:
                return self._terminal.events.wait_for(expectation.matches, after=place, timeout=timeout)
            except NotSeen:
                return None

    def _let_pass(self, expectation: Expectation, place: int, step: int) -> None:
        """Move the clock ahead step by step until the expected event has come or is overdue."""
        for _ in range(0, expectation.within, step):
            if self._first(expectation, place) or not self._settles():
                return
            self._timeline.time.move(step)
            self._terminal.jump(step)
        self._settles()

    def _next_place(self, step: Step, event: Event) -> int:
        """The mark from which to look for the next event."""
        return self._terminal.events.all().index(event) + 1 if step.in_order else self._mark

    def _settles(self) -> bool:
        """Wait until the agent has handled everything, so that a missing event will not come any more;
        returns whether it has."""
        try:
            self._terminal.sync()
        except NotSeen:
            return False
        return True

    def _print_silence(self, step: Step) -> None:
        """Print what did not happen, which the timeline cannot show."""
        words = "; ".join(expectation.words for expectation in step.then)
        self._timeline.print(Padding(Text(f"Nothing follows: {words}.", "italic"), _INDENTED))

    def _judge(self, title: str, step: Step) -> list[Outcome]:
        outcomes = []
        place = self._mark
        for expectation in step.then:
            event = self._first(expectation, self._mark if expectation.forbidden else place)
            outcomes.append(self._outcome(title, expectation, event))
            if event and not expectation.forbidden:
                place = self._next_place(step, event)
        return outcomes

    def _outcome(self, title: str, expectation: Expectation, event: Event | None) -> Outcome:
        if (event is None) == expectation.forbidden:
            verdict: Verdict = "as expected"
        else:
            verdict = "forbidden" if expectation.forbidden else "missing"
        time_of = self._timeline.time.at
        delay = time_of(event.time) - time_of(self._cue) if event else 0.0
        return Outcome(title, expectation, verdict, event, delay)

    def _first(self, expectation: Expectation, place: int) -> Event | None:
        return next(iter(self._terminal.events.all(expectation.matches, after=place)), None)
