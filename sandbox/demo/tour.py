"""Plays scenes and compares what is expected with what is seen."""

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
    """What became of an expectation of a scene: its verdict, the event that was seen, and how many seconds of
    the agent's time after the cue."""

    scene: str
    expectation: Expectation
    verdict: Verdict
    seen: Event | None = None
    delay: float = 0.0


# Nobody wants to watch minutes go by, however fast: so much of them is left out at a time, in seconds.
_LONG_WAIT, _SKIP = 60, 5
_INDENTED = (0, 0, 0, 7)
_STILL_THERE = Expectation("the agent handles what comes", "velks", "log", "info")


class Tour:
    """Plays scenes until one step does not go as expected; what comes after it is then not played.

    `patience` is the real time in seconds that an event may take beyond its due time.
    """

    def __init__(self, terminal: Terminal, timeline: Timeline, patience: float) -> None:
        self._terminal = terminal
        self._timeline = timeline
        self._patience = patience
        self._outcomes: list[Outcome] = []
        self._mark = 0
        self._cue = 0.0

    def play(self, scenes: Mapping[int, Scene], drawn: Container[int]) -> list[Outcome]:
        """Play the scenes, which are given by number, and draw some; one outcome for each expectation of each
        scene."""
        self._terminal.events.subscribe(self._end_at_reboot)
        for scene in scenes.values():
            scene.beforehand(self._terminal)
        for place, (number, scene) in enumerate(scenes.items(), 1):
            self._timeline.draw(number in drawn)
            if self._goes_well:
                self._announce(f"{number}. {scene.title}", f"  {place} of {len(scenes)}", scene.sentence)
            self._play_scene(f"{number}. {scene.title}", scene)
        return self._outcomes

    def _end_at_reboot(self, event: Event) -> None:
        """On a real terminal nobody would see what comes after it."""
        if REBOOT.matches(event):
            self._timeline.end()

    @property
    def _goes_well(self) -> bool:
        return all(outcome.verdict == "as expected" for outcome in self._outcomes)

    def _announce(self, title: str, place: str, sentence: str) -> None:
        self._timeline.print()
        self._timeline.print(Rule(Text.assemble((title, "bold"), (place, "dim")), align="left", style="dim"))
        self._timeline.print(Text(sentence))

    def _play_scene(self, title: str, scene: Scene) -> None:
        for step in scene.steps:
            if self._goes_well:
                self._outcomes += self._play_step(title, step)
            else:
                self._outcomes += [Outcome(title, expected, "not played") for expected in step.then]
        if self._goes_well and scene.remark:
            self._timeline.print(Text(scene.remark, "dim"))

    def _play_step(self, title: str, step: Step) -> list[Outcome]:
        if step.cue:
            self._mark, self._cue = self._terminal.events.mark(), time.monotonic()
            step.cue(self._terminal)
        is_silent = self._all_come(step) and not self._settles()
        outcomes = self._judge(title, step)
        if is_silent:
            outcomes.append(Outcome(title, _STILL_THERE, "missing"))
        elif not step.wanted and all(outcome.verdict == "as expected" for outcome in outcomes):
            self._tell_of_silence(step)
        return outcomes

    def _all_come(self, step: Step) -> bool:
        """Wait for what is wanted, until something does not come."""
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
        """Move the clock ahead step by step until what is expected has come or is overdue."""
        for _ in range(0, expectation.within, step):
            if self._first(expectation, place) or not self._settles():
                return
            self._timeline.time.move(step)
            self._terminal.jump(step)
        self._settles()

    def _next_place(self, step: Step, event: Event) -> int:
        """Where to look for what comes next."""
        return self._terminal.events.all().index(event) + 1 if step.in_order else self._mark

    def _settles(self) -> bool:
        """Whether the agent has handled everything, so that what has not come by now will not come."""
        try:
            self._terminal.sync()
        except NotSeen:
            return False
        return True

    def _tell_of_silence(self, step: Step) -> None:
        """Say what the timeline cannot show."""
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
