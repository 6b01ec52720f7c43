"""Everything that happens in a terminal, as one list in order."""

from __future__ import annotations

import threading
import time
from dataclasses import dataclass, field
from typing import Any, Callable, Mapping

Predicate = Callable[["Event"], bool]
_SHOWN_CHARACTERS = 300
# Seconds until an expected event counts as missing: far more than even a busy machine needs.
PATIENCE = 120.0
# The terminal synchronises with the agent by pushes that begin like this. They are no policies; the agent
# logs and ignores them.
SYNC, WAKE_UP = "sync ", "wake up"


@dataclass(frozen=True)
class Event:
    """One thing that happened.

    `kind` is "call", "signal", "log", "output", "http", "reply" (of the platform), "post" (to it), "upload",
    "command", "life", or "file" and "inbox" for content found there; `member` is the D-Bus member, log level,
    route or command. `args` are plain Python values; `detail["signature"]` has their D-Bus types.
    """

    time: float
    source: str
    target: str
    kind: str
    member: str
    args: tuple[Any, ...] = ()
    detail: Mapping[str, Any] = field(default_factory=dict, compare=False)

    def __str__(self) -> str:
        shown = ", ".join(repr(arg) for arg in self.args)
        if len(shown) > _SHOWN_CHARACTERS:
            shown = shown[:_SHOWN_CHARACTERS] + "..."
        return f"{self.kind:7} {self.source} -> {self.target}: {self.member}({shown})"


class NotSeen(AssertionError):
    """An awaited event did not come; the message lists the events that came instead."""


class Events:
    """A thread-safe, append-only list of events, with waiting."""

    def __init__(self) -> None:
        self._events: list[Event] = []
        self._changed = threading.Condition()
        self._subscribers: list[Callable[[Event], None]] = []
        self._start = time.monotonic()

    def record(
        self,
        source: str,
        target: str,
        kind: str,
        member: str,
        args: tuple[Any, ...] = (),
        detail: Mapping[str, Any] | None = None,
    ) -> Event:
        """Add an event, wake up waiting threads and call the subscribers on this thread."""
        with self._changed:
            event = Event(time.monotonic(), source, target, kind, member, args, detail or {})
            self._events.append(event)
            subscribers = list(self._subscribers)
            self._changed.notify_all()
        for subscriber in subscribers:
            subscriber(event)
        return event

    def subscribe(self, subscriber: Callable[[Event], None]) -> None:
        """Call `subscriber` with every later event, on the thread that records it."""
        with self._changed:
            self._subscribers.append(subscriber)

    def forget(self) -> None:
        """Drop all events so far; earlier marks become invalid."""
        with self._changed:
            self._events.clear()

    def mark(self) -> int:
        """The current end of the list: pass it as `after` to see only later events."""
        with self._changed:
            return len(self._events)

    def all(self, predicate: Predicate | None = None, *, after: int = 0, **fields: Any) -> list[Event]:
        """The events so far with these field values that satisfy `predicate`."""
        with self._changed:
            return [event for event in self._events[after:] if _matches(event, predicate, fields)]

    def wait_for(
        self,
        predicate: Predicate | None = None,
        *,
        after: int = 0,
        count: int = 1,
        timeout: float = PATIENCE,
        **fields: Any,
    ) -> Event:
        """Wait for the `count`th event after mark `after` with these field values that satisfies `predicate`.

        Raises NotSeen after `timeout` seconds.
        """
        found: list[Event] = []
        looked_at = after

        def came() -> bool:
            nonlocal looked_at
            fresh, looked_at = self._events[looked_at:], len(self._events)
            found.extend(event for event in fresh if _matches(event, predicate, fields))
            return len(found) >= count

        with self._changed:
            if not self._changed.wait_for(came, timeout):
                raise NotSeen(self._missing(fields, len(found), count, after))
        return found[count - 1]

    def report(self, after: int = 0) -> str:
        """The events as text, one per line, with the seconds since the start of the terminal."""
        with self._changed:
            return "\n".join(f"{event.time - self._start:9.3f} {event}" for event in self._events[after:])

    def _missing(self, fields: Mapping[str, Any], came: int, count: int, after: int) -> str:
        wanted = ", ".join(f"{name}={value!r}" for name, value in fields.items()) or "the predicate"
        return f"no event with {wanted} came ({came} of {count}); what came:\n{self.report(after)}"


def _matches(event: Event, predicate: Predicate | None, fields: Mapping[str, Any]) -> bool:
    same = all(getattr(event, name) == value for name, value in fields.items())
    return same and (predicate is None or predicate(event))
