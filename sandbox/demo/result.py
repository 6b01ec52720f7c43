"""The result of a tour: what was expected and what was seen."""

from __future__ import annotations

from typing import Sequence

from rich.table import Table
from rich.text import Text

from sandbox.demo.tour import Outcome
from sandbox.timeline.agent_time import AgentTime, minutes

_STYLES = {"as expected": "green", "missing": "bold red", "forbidden": "bold red", "not played": "yellow"}


def table(outcomes: Sequence[Outcome], time: AgentTime) -> Table:
    """A table with one row per expectation, grouped by scene."""
    shown = Table(expand=True, title="Expected and seen", title_justify="left", header_style="bold")
    shown.add_column("Scene", ratio=5, overflow="fold")
    shown.add_column("Expected", ratio=9, overflow="fold")
    shown.add_column("Seen (agent time)", ratio=5)
    shown.add_column("Result", no_wrap=True)
    last = ""
    for outcome in outcomes:
        is_first = outcome.scene != last
        if is_first and last:
            shown.add_section()
        shown.add_row(
            outcome.scene if is_first else "",
            Text(outcome.expectation.words),
            _seen(outcome, time),
            Text(outcome.verdict, _STYLES[outcome.verdict]),
        )
        last = outcome.scene
    return shown


def scenes(outcomes: Sequence[Outcome]) -> Table:
    """A summary with one line per scene."""
    shown = Table.grid(padding=(0, 2, 0, 0))
    for scene in dict.fromkeys(outcome.scene for outcome in outcomes):
        verdicts = [outcome.verdict for outcome in outcomes if outcome.scene == scene]
        good = verdicts.count("as expected")
        is_good = good == len(verdicts)
        mark = Text("good" if is_good else "BAD", "green" if is_good else "bold red")
        shown.add_row(mark, Text(scene), Text(f"{good} of {len(verdicts)}", "dim"))
    return shown


def summary(outcomes: Sequence[Outcome]) -> Text:
    """The tour's result in one line."""
    good = sum(outcome.verdict == "as expected" for outcome in outcomes)
    style = "bold green" if good == len(outcomes) else "bold red"
    return Text(f"{good} of {len(outcomes)} expectations met.", style)


def _seen(outcome: Outcome, time: AgentTime) -> str:
    if outcome.seen is None:
        return "nothing" if outcome.verdict != "not played" else "-"
    return f"{minutes(time.at(outcome.seen.time))}, {max(0.0, outcome.delay):.0f} s after the cue"
