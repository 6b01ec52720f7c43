"""The context of a person at the prompt, whose output tests can read."""

from __future__ import annotations

import io
import subprocess

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

    def run(self, *lines: str) -> None:
        """Let a person type these lines."""
        for line in lines:
            run_line(self, line)

    def refusal(self, line: str) -> str:
        """Why a line is refused; nothing happens in the terminal."""
        mark, installed = self.terminal.events.mark(), installed_packages()
        with pytest.raises(CommandRefused) as refused:
            self.run(line)
        assert (self.terminal.events.all(after=mark), installed_packages()) == ([], installed)
        return str(refused.value)


def installed_packages() -> dict[str, str]:
    """Versions of the packages as the package tools know them."""
    shown = subprocess.run(["dpkg-query", "-W"], capture_output=True, text=True).stdout
    return dict(line.split("\t", 1) for line in shown.splitlines())
