"""What the platform lists for the agent, and what the agent asks of it."""

from __future__ import annotations

import json
from typing import Any

from sandbox.events import Event
from sandbox.periods import SURELY_NEXT_POLL
from sandbox.platform.server import HttpFault
from sandbox.terminal import Terminal

USER = "zhang.wei"


def requests(terminal: Terminal, route: str, after: int = 0) -> list[Event]:
    """The agent's requests of one route at the platform since a mark."""
    return terminal.events.all(kind="http", member=route, after=after)


def poll(terminal: Terminal) -> int:
    """Let the next poll come, with all that follows from it; the result is the mark before it."""
    mark = terminal.events.mark()
    terminal.advance(SURELY_NEXT_POLL)
    return mark


def begin_poll(terminal: Terminal, route: str = "list", count: int = 1) -> int:
    """Let the next poll come as far as the `count`th request of a route; the mark before it."""
    mark = terminal.events.mark()
    terminal.sync()
    terminal.jump(SURELY_NEXT_POLL)
    terminal.events.wait_for(kind="http", member=route, after=mark, count=count)
    return mark


def titles(terminal: Terminal, after: int) -> list[str]:
    """Titles of the notifications since a mark."""
    return [event.args[3] for event in terminal.events.all(member="Notify", after=after)]


def answer_always(
    terminal: Terminal, body: bytes, headers: dict[str, str] | None = None, status: int = 200
) -> None:
    """Let the platform give this reply to every list request from now on."""
    terminal.platform.faults["list"] = HttpFault("reply", status, body, headers or {})


def message(**fields: Any) -> dict[str, Any]:
    """A message as the platform sends it, with some fields changed."""
    whole = {"uuid": "u1", "uid": USER, "send_uid": "admin", "title": "T", "content": "C"}
    return {**whole, "created_at": "2026-01-02 03:04:05", "read_at": "", **fields}


def as_reply(*messages: Any) -> bytes:
    """The body of a list reply."""
    return json.dumps(messages, ensure_ascii=False).encode()
