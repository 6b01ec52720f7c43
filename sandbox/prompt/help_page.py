"""The output of `help`: all commands by group, or one command with its arguments."""

from __future__ import annotations

from typing import Mapping, Sequence

from rich.console import Group, RenderableType
from rich.table import Table
from rich.text import Text

from sandbox.prompt.context import Context
from sandbox.prompt.registry import COMMANDS, Command

GROUPS = {
    "The daemon": ("policy", "online"),
    "The user": ("lock", "unlock", "saver", "login"),
    "Applications": ("open", "close", "windows", "dock", "undock", "apps"),
    "Software": ("install", "update", "uninstall", "software"),
    "The platform": ("message", "messages", "tip", "platform"),
    "Services": ("leave", "appear", "restart", "hang", "slow", "fail", "recover", "state"),
    "The prompt": ("advance", "wait", "log", "help", "quit"),
}
_WIDTH = 64  # beside the groups, on a terminal of 80 columns
_EXAMPLES = {
    "policy 1201": "disable the terminal, then: advance 60",
    "message Hello Lunch": "post a message, then: advance 180",
    "hang notifications": "see how long the agent waits for a service",
}


def topics(_context: Context) -> Mapping[str, str]:
    """The choices of `help`."""
    return {name: known.help for name, known in COMMANDS.items()}


def overview() -> RenderableType:
    """All commands, and some examples."""
    table = Table.grid(padding=(0, 2, 0, 0))
    for group, names in GROUPS.items():
        table.add_row(Text(group, "bold"), Text(_filled([COMMANDS[name].usage for name in names])))
    examples = Table.grid(padding=(0, 2, 0, 0))
    for line, words in _EXAMPLES.items():
        examples.add_row(Text(f"  {line}", "cyan"), Text(words, "dim"))
    more = Text("help COMMAND says more; Tab completes; Ctrl+D ends.", "dim")
    return Group(table, Text("For example:"), examples, more)


def _filled(usages: Sequence[str]) -> str:
    """The usages, as many per line as fit."""
    lines = [""]
    for usage in usages:
        if lines[-1] and len(lines[-1] + usage) > _WIDTH:
            lines.append("")
        lines[-1] += f"{usage}   "
    return "\n".join(lines)


def about(context: Context, known: Command) -> RenderableType:
    """One command: usage, effect, and possible arguments."""
    lines = [Text.assemble((known.usage, "bold"), f"\n  {known.help}.")]
    if known.run.__doc__:
        lines.append(Text(f"  {known.run.__doc__}", "dim"))
    choices = Table.grid(padding=(0, 2, 0, 2))
    for word, meaning in known.choices(context).items():
        choices.add_row(word, Text(meaning, "dim"))
    return Group(*lines, choices)
