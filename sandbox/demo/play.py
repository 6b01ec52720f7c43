"""The tour inside the box, from opening the terminal to the final table."""

from __future__ import annotations

import re
from argparse import Namespace
from typing import Sequence

from rich.console import Console
from rich.text import Text

from sandbox.box import host
from sandbox.box.preconditions import clock, require_agent
from sandbox.demo import result
from sandbox.demo.scene import Scene
from sandbox.demo.scenes import SCENES
from sandbox.demo.tour import Outcome, Tour
from sandbox.ending import CannotRun
from sandbox.terminal import Terminal
from sandbox.timeline.agent_time import AgentTime
from sandbox.timeline.timeline import Timeline, picture_console, screen_console

_WHAT_NEXT = (
    "Try it yourself: ./dev box. Everything expected and seen: ./dev demo --table. "
    "How it works: docs/architecture.md."
)
_WEB_FONT = re.compile(r"\s*@font-face \{.*?\}", re.DOTALL)
_FONTS = '"DejaVu Sans Mono", Menlo, Consolas, "Noto Sans Mono CJK SC", monospace'


def play(options: Namespace) -> int:
    """Play the chosen scenes; returns the exit status."""
    scenes = _chosen(options.only)
    require_agent()
    result_stream = host.result_stream()
    screen = screen_console()
    recorder = picture_console() if options.svg else None
    consoles = [screen, recorder] if recorder else [screen]
    outcomes, problems = _tour(options, scenes, consoles)
    if recorder:
        drawn = _svg(recorder).encode()
        if result_stream:
            result_stream.write(drawn)
        else:
            options.svg.write_bytes(drawn)
    return int(bool(problems) or any(outcome.verdict != "as expected" for outcome in outcomes))


def _svg(recorded: Console) -> str:
    """The console's recording as a self-contained SVG picture, without web fonts."""
    drawn = recorded.export_svg(title="./dev demo", unique_id="demo")
    return _WEB_FONT.sub("", drawn).replace("Fira Code, monospace", _FONTS)


def _chosen(numbers: set[int] | None) -> dict[int, Scene]:
    """The chosen scenes by number, always with the first one, which starts the agent."""
    known = dict(enumerate(SCENES, 1))
    unknown = (numbers or set()) - known.keys()
    if unknown:
        raise CannotRun(f"there is no scene {min(unknown)}; there are {len(known)}")
    return {number: scene for number, scene in known.items() if not numbers or number in {1, *numbers}}


def _tour(
    options: Namespace, scenes: dict[int, Scene], consoles: Sequence[Console]
) -> tuple[list[Outcome], list[str]]:
    # For a picture, time passes only during waits, so that the same code draws the same picture.
    speed = 0 if options.svg else options.speed
    time = AgentTime(speed)
    terminal = Terminal(clock=clock(speed))
    timeline = Timeline(terminal.events, time, consoles, options.log)
    try:
        outcomes = Tour(terminal, timeline, options.patience).play(scenes, options.only or scenes)
    finally:
        timeline.end()
        problems = terminal.shut_down()
    is_good = not problems and all(outcome.verdict == "as expected" for outcome in outcomes)
    consoles[0].print()
    consoles[0].print(result.scenes(outcomes))
    if options.table or not is_good:
        consoles[0].print(result.table(outcomes, time))
    for problem in problems:
        consoles[0].print(Text(problem, "bold red"))
    consoles[0].print(result.summary(outcomes))
    if is_good:
        consoles[0].print(Text(_WHAT_NEXT, "dim"))
    return outcomes, problems
