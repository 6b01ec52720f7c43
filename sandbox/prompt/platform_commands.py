"""The prompt's commands about the platform."""

from __future__ import annotations

from rich.table import Table
from rich.text import Text

from sandbox.platform.server import HttpFault, Platform
from sandbox.prompt.context import Context, CommandRefused
from sandbox.prompt.registry import COMMANDS, command, number

_FIRST_ERROR, _LAST_ERROR = 400, 599
_FAULTS = {"hang": HttpFault("hang"), "garbage": HttpFault("reply", body=b"garbage"), "cut": HttpFault("cut")}


_BEHAVIOURS = {
    "up": "answers",
    "down": "refuses connections",
    "error": "answers with this status",
    "hang": "never answers",
    "garbage": "answers with garbage",
    "cut": "closes the connection in the middle of an answer",
}


@command(
    "message", "TITLE CONTENT [SENDER]", "the platform has a message, which the agent's next poll fetches"
)
def message(context: Context, title: str, content: str, sender: str = "admin") -> str:
    """The message is for the user of the session."""
    context.terminal.platform.post_message(context.terminal.user.plain_name, title, content, sender)
    return "The platform has the message; the agent polls at least every three minutes: advance 180"


@command("messages", "", "the user's messages on the platform, and when they were read")
def messages(context: Context) -> None:
    """The oldest message comes first."""
    table = Table("Title", "Sent", "Read")
    for known in context.terminal.platform.messages(context.terminal.user.plain_name):
        table.add_row(Text(known["title"]), known["created_at"], known["read_at"] or "not yet")
    context.show(table)


@command(
    "tip",
    "TEXT|off",
    "the platform has a tip about the password, which the agent requests at login",
    lambda _context: {"off": "no tip any more"},
)
def tip(context: Context, text: str) -> str:
    """The tip stays until `tip off`."""
    context.terminal.platform.password_tip(context.terminal.user.plain_name, None if text == "off" else text)
    return (
        "There is no tip now." if text == "off" else "The agent requests the tip when a session begins: login"
    )


@command(
    "platform",
    "up|down|hang|error STATUS|garbage|cut",
    "how the platform treats requests",
    lambda _context: _BEHAVIOURS,
)
def platform(context: Context, manner: str, status: str | None = None) -> str:
    """It stays so until `platform up`, which also answers the hanging requests."""
    if manner not in _BEHAVIOURS or (manner == "error") != (status is not None):
        raise CommandRefused(f"usage: {COMMANDS['platform'].usage}")
    known = context.terminal.platform
    result = f"The platform {_BEHAVIOURS[manner]}{f': {status}' if status else ''}."
    if manner == "down":
        known.leave()
        return result
    if status is not None:
        known.fault = HttpFault("reply", _error(status))
    elif manner != "up":
        known.fault = _FAULTS[manner]
    else:
        known.release()
    if not known.present:
        known.appear()
    return result


def behaviour(platform: Platform) -> str:
    """The platform's behaviour in a word."""
    fault = platform.fault
    if fault.kind == "none":
        return "ok"
    if fault.status >= _FIRST_ERROR:
        return f"error {fault.status}"
    return next(name for name, known in _FAULTS.items() if known == fault)


def _error(status: str) -> int:
    code = int(number(status, int))
    if not _FIRST_ERROR <= code <= _LAST_ERROR:
        raise CommandRefused(f"{code} is not an error status ({_FIRST_ERROR} to {_LAST_ERROR})")
    return code
