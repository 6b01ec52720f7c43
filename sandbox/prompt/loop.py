"""Reads and runs commands, interactively or from a script."""

from __future__ import annotations

from typing import Iterable

from prompt_toolkit import PromptSession
from prompt_toolkit.history import FileHistory, History, InMemoryHistory
from prompt_toolkit.patch_stdout import patch_stdout
from rich.text import Text

from sandbox.machine import layout
from sandbox.prompt.completion import CommandCompleter
from sandbox.prompt.context import Context, CommandRefused
from sandbox.prompt.registry import run_line
from sandbox.timeline.agent_time import minutes

_WELCOME = (
    "A simulated terminal with the real agent; its traffic appears above the prompt.",
    "Try: policy 1201, then: advance 60. Type help for the commands, Ctrl+D to end.",
)


def run_prompt(context: Context) -> int:
    """Read commands while events scroll by above the prompt; Ctrl+C drops the line, Ctrl+D ends."""
    for line in _WELCOME:
        context.show(Text(line, "bold"))
    session: PromptSession[str] = PromptSession(
        "box> ",
        history=_history(),
        completer=CommandCompleter(context),
        complete_while_typing=False,
        bottom_toolbar=lambda: _status_line(context),
        refresh_interval=1,
    )
    with patch_stdout(raw=True):
        while True:
            try:
                _carry_out(context, session.prompt())
            except KeyboardInterrupt:
                continue
            except EOFError:
                return 0


def _history() -> History:
    """The history of earlier runs, if the host's file is visible in the box."""
    return FileHistory(str(layout.HISTORY)) if layout.HISTORY.exists() else InMemoryHistory()


def run_script(context: Context, lines: Iterable[str]) -> int:
    """Run the lines; returns 1 if one of them was refused, else 0."""
    status = 0
    for line in lines:
        try:
            status |= not _carry_out(context, line)
        except EOFError:
            break
    return int(status)


def _carry_out(context: Context, line: str) -> bool:
    try:
        run_line(context, line)
    except CommandRefused as refused:
        context.show(Text(str(refused), "red"))
        return False
    return True


def _status_line(context: Context) -> str:
    timeline = context.timeline
    log = "shown" if timeline.show_log else "hidden"
    speed = f" (x{timeline.time.speed})" if timeline.time.speed > 1 else ""
    return (
        f" agent time {minutes(timeline.time.now())}{speed}   user {context.terminal.user.name}   log {log}"
    )
