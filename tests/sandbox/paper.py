"""The desk of a person whose output tests can read."""

from __future__ import annotations

import io

from rich.console import Console

from sandbox.prompt.desk import Desk
from sandbox.terminal import Terminal
from sandbox.timeline.agenttime import AgentTime
from sandbox.timeline.timeline import Timeline


class Paper(Desk):
    """A desk whose output can be read."""

    def __init__(self, terminal: Terminal) -> None:
        self.paper = io.StringIO()
        console = Console(file=self.paper, width=130)
        super().__init__(terminal, Timeline(terminal.events, AgentTime(0), [console]))

    def lines_with(self, text: str) -> list[str]:
        """The printed lines that hold a text."""
        return [line for line in self.paper.getvalue().splitlines() if text in line]
