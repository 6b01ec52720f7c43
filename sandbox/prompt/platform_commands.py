"""What a person can do with the platform at the prompt."""

from __future__ import annotations

from typing import Iterable

from rich.table import Table
from rich.text import Text

from sandbox.platform.server import HttpFault, Platform
from sandbox.prompt.desk import Desk, Refused
from sandbox.prompt.registry import COMMANDS, command, number

_FIRST_ERROR, _LAST_ERROR = 400, 599
_FAULTS = {"hang": HttpFault.hang(), "garbage": HttpFault.reply(body=b"garbage"), "cut": HttpFault.cut()}


def _off(_desk: Desk) -> Iterable[str]:
    return ("off",)


def _manners(_desk: Desk) -> Iterable[str]:
    return ("up", "down", "error", *_FAULTS)


@command(
    "message", "TITLE CONTENT [SENDER]", "the platform has a message, which the agent's next poll brings"
)
def message(desk: Desk, title: str, content: str, sender: str = "admin") -> None:
    """For the user of the session."""
    desk.terminal.platform.post_message(desk.terminal.user.plain_name, title, content, sender)


@command("messages", "", "the user's messages on the platform, and when they were read")
def messages(desk: Desk) -> None:
    """Oldest first."""
    table = Table("Title", "Sent", "Read")
    for known in desk.terminal.platform.messages(desk.terminal.user.plain_name):
        table.add_row(Text(known["title"]), known["created_at"], known["read_at"] or "not yet")
    desk.show(table)


@command("tip", "TEXT|off", "the platform warns of the password's end (asked once, at login)", _off)
def tip(desk: Desk, text: str) -> None:
    """Until `off`."""
    desk.terminal.platform.password_tip(desk.terminal.user.plain_name, None if text == "off" else text)


@command("platform", "up|down|hang|error STATUS|garbage|cut", "how the platform treats requests", _manners)
def platform(desk: Desk, manner: str, status: str | None = None) -> None:
    """Until `up`, which also answers what hangs."""
    if manner not in _manners(desk) or (manner == "error") != (status is not None):
        raise Refused(f"usage: {COMMANDS['platform'].usage}")
    known = desk.terminal.platform
    if manner == "down":
        known.leave()
        return
    if status is not None:
        known.fault = HttpFault.reply(_error(status))
    elif manner != "up":
        known.fault = _FAULTS[manner]
    else:
        known.release()
    if not known.present:
        known.appear()


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
        raise Refused(f"{code} is no error status ({_FIRST_ERROR} to {_LAST_ERROR})")
    return code
