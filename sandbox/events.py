"""Everything that happens in a box, as one list in the order in which it happened."""

from __future__ import annotations

import threading
import time
from dataclasses import dataclass, field
from typing import Any, Callable, Mapping

Predicate = Callable[["Event"], bool]
_SHOWN_CHARACTERS = 300
# Seconds until something that does not come counts as missing: far more than even a busy machine takes.
PATIENCE = 120.0
# How the texts begin that the terminal has the daemon push for its own sake: no policies, so that the agent
# does nothing about them.
SYNC, WAKE_UP = "sync ", "wake up"


@dataclass(frozen=True)
class Event:
    """One thing that happened.

    `kind` is "call", "signal", "log", "output", "http", "reply" (of the platform), "post" (to it), "command",
    "life", or "file" and "inbox" for what was found there; `member` the D-Bus member, log level, route or
    command; `args` plain Python values, whose exact types `detail["signature"]` tells.
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
    """An event that was waited for did not come; the text lists what came instead."""


class Events:
    """Thread-safe, append-only list of events that can be waited for."""

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
        """Add an event and wake up those who wait for it; subscribers are called on this thread."""
        with self._changed:
            event = Event(time.monotonic(), source, target, kind, member, args, detail or {})
            self._events.append(event)
            subscribers = list(self._subscribers)
            self._changed.notify_all()
        for subscriber in subscribers:
            subscriber(event)
        return event

    def subscribe(self, subscriber: Callable[[Event], None]) -> None:
        """Call `subscriber` with every event from now on, on the thread where it happens."""
        with self._changed:
            self._subscribers.append(subscriber)

    def forget(self) -> None:
        """Drop what has happened so far; marks taken before mean nothing any more."""
        with self._changed:
            self._events.clear()

    def mark(self) -> int:
        """A place in the list: what comes `after` it has not happened yet."""
        with self._changed:
            return len(self._events)

    def all(self, predicate: Predicate | None = None, *, after: int = 0, **fields: Any) -> list[Event]:
        """Events so far that have these field values and satisfy `predicate`."""
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
        """The `count`th event after mark `after` that has these field values and satisfies `predicate`.

        Waits for it if need be; raises NotSeen after `timeout` seconds.
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
        """The events as text, one a line, with seconds since the box was opened."""
        with self._changed:
            return "\n".join(f"{event.time - self._start:9.3f} {event}" for event in self._events[after:])

    def _missing(self, fields: Mapping[str, Any], came: int, count: int, after: int) -> str:
        wanted = ", ".join(f"{name}={value!r}" for name, value in fields.items()) or "the predicate"
        return f"no event with {wanted} came ({came} of {count}); what came:\n{self.report(after)}"


def _matches(event: Event, predicate: Predicate | None, fields: Mapping[str, Any]) -> bool:
    same = all(getattr(event, name) == value for name, value in fields.items())
    return same and (predicate is None or predicate(event))
