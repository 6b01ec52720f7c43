"""The context of a person whose output tests can read."""

from __future__ import annotations

import io

from rich.console import Console

from sandbox.prompt.context import Context
from sandbox.terminal import Terminal
from sandbox.timeline.agenttime import AgentTime
from sandbox.timeline.timeline import Timeline


class RecordedContext(Context):
    """A context whose output can be read."""

    def __init__(self, terminal: Terminal) -> None:
        self.context = io.StringIO()
        console = Console(file=self.context, width=130)
        super().__init__(terminal, Timeline(terminal.events, AgentTime(0), [console]))

    def lines_with(self, text: str) -> list[str]:
        """The printed lines that hold a text."""
        return [line for line in self.context.getvalue().splitlines() if text in line]
