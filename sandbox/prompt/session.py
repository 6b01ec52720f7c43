"""A session of the terminal with a prompt, inside the box."""

from __future__ import annotations

import sys
from argparse import Namespace

from rich.text import Text

from sandbox.box import host
from sandbox.box.host import CannotRun
from sandbox.box.preconditions import clock, require_agent
from sandbox.events import NotSeen
from sandbox.prompt import commands  # noqa: F401  registers all commands
from sandbox.prompt import loop, session_end
from sandbox.prompt.context import Context
from sandbox.prompt.mirror import Mirror
from sandbox.terminal import Terminal
from sandbox.timeline.agent_time import AgentTime
from sandbox.timeline.timeline import Timeline, screen_console


def run(options: Namespace) -> int:
    """Run commands until their end; returns 0 if none was refused and the agent made no mistake."""
    require_agent()
    result_stream = host.result_stream()
    terminal = Terminal(clock=clock(options.speed))
    terminal.daemon.uploads_to(terminal.platform)
    console = screen_console()
    timeline = Timeline(terminal.events, AgentTime(options.speed), [console], options.log)
    if result_stream:
        Mirror(terminal.events, result_stream)
    try:
        status = _serve(Context(terminal, timeline))
    finally:
        timeline.end()
        problems = terminal.shut_down()
    for problem in problems:
        console.print(Text(problem, "red"))
    return 1 if problems else status


def _serve(context: Context) -> int:
    session_end.watch(context)
    try:
        context.terminal.start_agent()
    except NotSeen:
        raise CannotRun("the agent did not report its session to the daemon") from None
    return loop.run_prompt(context) if sys.stdin.isatty() else loop.run_script(context, sys.stdin)
