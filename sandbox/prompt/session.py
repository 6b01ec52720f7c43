"""A session of the terminal with a prompt, inside the box."""

from __future__ import annotations

import json
import sys
from argparse import Namespace
from typing import IO

from rich.text import Text

from sandbox.box import host
from sandbox.box.preconditions import clock, require_agent
from sandbox.ending import CannotRun
from sandbox.events import Event, NotSeen
from sandbox.prompt import commands  # noqa: F401  registers all commands
from sandbox.prompt import loop
from sandbox.prompt.context import Context
from sandbox.terminal import Terminal
from sandbox.timeline.agent_time import AgentTime
from sandbox.timeline.timeline import Timeline, screen_console

# The simulated login manager only records what would end a real session.
_ENDS = {
    "Terminate": "The session would end here. The next one begins with: login",
    "Reboot": "The terminal would reboot here. The next session begins with: login",
}


def run(options: Namespace) -> int:
    """Run commands until their end; returns 0 if none was refused and the agent made no mistake."""
    require_agent()
    result_stream = host.result_stream()
    terminal = Terminal(clock=clock(options.speed))
    terminal.daemon.uploads_to(terminal.platform)
    console = screen_console()
    timeline = Timeline(terminal.events, AgentTime(options.speed), [console], options.log)
    if result_stream:
        mirror(terminal, result_stream)
    try:
        status = _serve(Context(terminal, timeline))
    finally:
        timeline.end()
        problems = terminal.shut_down()
    for problem in problems:
        console.print(Text(problem, "red"))
    return 1 if problems else status


def _serve(context: Context) -> int:
    show_ends(context)
    try:
        context.terminal.start_agent()
    except NotSeen:
        raise CannotRun("the agent did not report its session to the daemon") from None
    return loop.run_prompt(context) if sys.stdin.isatty() else loop.run_script(context, sys.stdin)


def show_ends(context: Context) -> None:
    """From now on, print a line after each forced action."""

    def take(event: Event) -> None:
        if (event.source, event.target) == ("velks", "logind") and event.member in _ENDS:
            context.show(Text(_ENDS[event.member], "bold"))

    context.terminal.events.subscribe(take)


def mirror(terminal: Terminal, stream: IO[bytes]) -> None:
    """From now on, write each notification of the agent as a JSON line, for the host's desktop."""

    def take(event: Event) -> None:
        if (event.target, event.member) == ("notifications", "Notify"):
            app_name, _, _, summary, body, _, _, timeout = event.args
            # Without the actions, which would have no effect on the host.
            shown = {"app_name": app_name, "summary": summary, "body": body, "timeout": timeout}
            stream.write(json.dumps(shown).encode() + b"\n")

    terminal.events.subscribe(take)
