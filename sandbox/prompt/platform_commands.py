"""What a person can do with the platform at the prompt."""

from __future__ import annotations

from typing import Mapping

from rich.table import Table
from rich.text import Text

from sandbox.platform.server import HttpFault, Platform
from sandbox.prompt.context import Context, CommandRefused
from sandbox.prompt.registry import COMMANDS, command, number

_FIRST_ERROR, _LAST_ERROR = 400, 599
_FAULTS = {"hang": HttpFault.hang(), "garbage": HttpFault.reply(body=b"garbage"), "cut": HttpFault.cut()}


_MANNERS = {
    "up": "answers",
    "down": "refuses connections",
    "error": "answers with this status",
    "hang": "never answers",
    "garbage": "answers with nonsense",
    "cut": "breaks off in its answers",
}


def _off(_context: Context) -> Mapping[str, str]:
    return {"off": "no tip any more"}


def _manners(_context: Context) -> Mapping[str, str]:
    return _MANNERS


@command(
    "message", "TITLE CONTENT [SENDER]", "the platform has a message, which the agent's next poll brings"
)
def message(context: Context, title: str, content: str, sender: str = "admin") -> str:
    """For the user of the session."""
    context.terminal.platform.post_message(context.terminal.user.plain_name, title, content, sender)
    return "The platform has the message; the agent asks every three minutes at the latest: advance 180"


@command("messages", "", "the user's messages on the platform, and when they were read")
def messages(context: Context) -> None:
    """Oldest first."""
    table = Table("Title", "Sent", "Read")
    for known in context.terminal.platform.messages(context.terminal.user.plain_name):
        table.add_row(Text(known["title"]), known["created_at"], known["read_at"] or "not yet")
    context.show(table)


@command("tip", "TEXT|off", "the platform warns of the password's end (asked once, at login)", _off)
def tip(context: Context, text: str) -> str:
    """Until `off`."""
    context.terminal.platform.password_tip(context.terminal.user.plain_name, None if text == "off" else text)
    return "No tip is left." if text == "off" else "The agent asks for the tip when a session begins: login"


@command("platform", "up|down|hang|error STATUS|garbage|cut", "how the platform treats requests", _manners)
def platform(context: Context, manner: str, status: str | None = None) -> str:
    """Until `up`, which also answers what hangs."""
    if manner not in _manners(context) or (manner == "error") != (status is not None):
        raise CommandRefused(f"usage: {COMMANDS['platform'].usage}")
    known = context.terminal.platform
    told = f"The platform {_MANNERS[manner]}{f': {status}' if status else ''}."
    if manner == "down":
        known.leave()
        return told
    if status is not None:
        known.fault = HttpFault.reply(_error(status))
    elif manner != "up":
        known.fault = _FAULTS[manner]
    else:
        known.release()
    if not known.present:
        known.appear()
    return told


def behaviour(platform: Platform) -> str:
    """In a word, what the platform does with a request."""
    fault = platform.fault
    if fault.kind == "none":
        return "well"
    if fault.status >= _FIRST_ERROR:
        return f"error {fault.status}"
    return next(name for name, known in _FAULTS.items() if known == fault)


def _error(status: str) -> int:
    code = int(number(status, int))
    if not _FIRST_ERROR <= code <= _LAST_ERROR:
        raise CommandRefused(f"{code} is no error status ({_FIRST_ERROR} to {_LAST_ERROR})")
    return code
