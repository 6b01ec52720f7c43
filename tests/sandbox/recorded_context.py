"""The context of a person at the prompt, whose output tests can read."""

from __future__ import annotations

import io

import pytest
from rich.console import Console

from sandbox.prompt import commands  # noqa: F401  registers all commands
from sandbox.prompt.context import CommandRefused, Context
from sandbox.prompt.registry import run_line
from sandbox.terminal import Terminal
from sandbox.timeline.agent_time import AgentTime
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

    def refusal(self, line: str) -> str:
        """Why a line is refused; nothing happens in the terminal."""
        mark = self.terminal.events.mark()
        with pytest.raises(CommandRefused) as refused:
            run_line(self, line)
        assert not self.terminal.events.all(after=mark)
        return str(refused.value)
