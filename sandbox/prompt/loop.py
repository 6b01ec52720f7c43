"""Takes commands from a person at a terminal or from a script, until they end."""

from __future__ import annotations

from typing import Iterable

from prompt_toolkit import PromptSession
from prompt_toolkit.completion import NestedCompleter
from prompt_toolkit.history import InMemoryHistory
from prompt_toolkit.patch_stdout import patch_stdout
from rich.text import Text

from sandbox.prompt.desk import Desk, Refused
from sandbox.prompt.registry import COMMANDS, run_line
from sandbox.timeline.agenttime import minutes


def run_prompt(desk: Desk) -> int:
    """Ask for commands while the traffic scrolls by above; Ctrl+C drops the line, Ctrl+D ends."""
    desk.show(Text("Type help for the commands, Ctrl+D to end.", "dim"))
    offered = {name: dict.fromkeys(known.choices(desk)) for name, known in COMMANDS.items()}
    session: PromptSession[str] = PromptSession(
        "box> ",
        history=InMemoryHistory(),
        completer=NestedCompleter.from_nested_dict(offered),
        complete_while_typing=False,
        bottom_toolbar=lambda: _status_line(desk),
        refresh_interval=1,
    )
    with patch_stdout(raw=True):
        while True:
            try:
                _carry_out(desk, session.prompt())
            except KeyboardInterrupt:
                continue
            except EOFError:
                return 0


def run_script(desk: Desk, lines: Iterable[str]) -> int:
    """Carry out the lines; the result is 1 when one of them was refused, else 0."""
    status = 0
    for line in lines:
        try:
            status |= not _carry_out(desk, line)
        except EOFError:
            break
    return int(status)


def _carry_out(desk: Desk, line: str) -> bool:
    try:
        run_line(desk, line)
    except Refused as refused:
        desk.show(Text(str(refused), "red"))
        return False
    return True


def _status_line(desk: Desk) -> str:
    timeline = desk.timeline
    log = "shown" if timeline.show_log else "hidden"
    speed = f" (x{timeline.time.speed})" if timeline.time.speed > 1 else ""
    return f" agent time {minutes(timeline.time.now())}{speed}   user {desk.terminal.user.name}   log {log}"
