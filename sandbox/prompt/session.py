"""The terminal with a prompt inside the box, from its opening to its end."""

from __future__ import annotations

import sys
from argparse import Namespace

from rich.text import Text

from sandbox.box import outside
from sandbox.box.outside import Trouble
from sandbox.box.preconditions import clock, require_agent
from sandbox.events import NotSeen
from sandbox.prompt import commands, loop, session_end
from sandbox.prompt.context import Context
from sandbox.prompt.mirror import Mirror
from sandbox.terminal import Terminal
from sandbox.timeline.agenttime import AgentTime
from sandbox.timeline.timeline import Timeline, console_for_people

assert commands, "importing the module makes its commands known"


def run(options: Namespace) -> int:
    """Take commands until they end; the result is 0 when all were carried out and the agent did well."""
    require_agent()
    result_stream = outside.result_stream()
    terminal = Terminal(clock=clock(options.speed))
    terminal.daemon.uploads_to(terminal.platform)
    console = console_for_people()
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
        raise Trouble("the agent did not announce itself to the daemon") from None
    return loop.run_prompt(context) if sys.stdin.isatty() else loop.run_script(context, sys.stdin)
