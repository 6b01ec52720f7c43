"""What was sent to arrive, piece by piece, against what has arrived."""

from __future__ import annotations

import json
import threading
from collections import Counter
from typing import Any, Iterable

from sandbox.events import Event, Events

KINDS = (
    FORWARDED := "policies forwarded",
    NOTICES := "notices of policies",
    LOGOUTS := "forced log-outs",
    MESSAGES := "messages shown",
    RECEIPTS := "messages marked read",
    LISTS := "message lists read",
    APPLICATIONS := "applications opened, closed",
    STATUSES := "status reports",
    USERS := "user announcements",
    CHANGES := "software changes",
    INVENTORIES := "inventory reports",
)

_REMINDER = "提醒"
_LIST_READ = "getPlatformMsg ----nCode: 200 "
_SHOWN_PIECES = 3

Piece = tuple[Any, ...]


class Accounting:
    """Counts pieces by kind and content: those expected, which their cause notes, and those that came.

    Message lists are noted by themselves: the platform's answers are what is sent.
    """

    def __init__(self, events: Events, patience: float = 20.0) -> None:
        self.patience = patience  # seconds until what does not come is missing
        self._changed = threading.Condition()
        self._sent: dict[str, Counter[Piece]] = {kind: Counter() for kind in KINDS}
        self._arrived: dict[str, Counter[Piece]] = {kind: Counter() for kind in KINDS}
        events.subscribe(self._look_at)

    def sent(self, kind: str) -> int:
        """How many pieces of a kind must arrive."""
        return self._sent[kind].total()

    def arrived(self, kind: str) -> int:
        """How many pieces of a kind have arrived."""
        return self._arrived[kind].total()

    def totals(self) -> tuple[int, int]:
        """How many pieces of all kinds were sent and have arrived."""
        return sum(map(self.sent, KINDS)), sum(map(self.arrived, KINDS))

    def expect(self, kind: str, *piece: Any) -> None:
        """Note that a piece must arrive."""
        with self._changed:
            self._sent[kind][piece] += 1

    def wait(self, *kinds: str) -> None:
        """Return once as many pieces of these kinds have arrived as were sent, or when patience ends: what is
        missing then shows in `differences`."""
        with self._changed:
            self._changed.wait_for(
                lambda: all(self.arrived(kind) >= self.sent(kind) for kind in kinds), self.patience
            )

    def differences(self, due: Iterable[str] = KINDS) -> list[str]:
        """One line for each kind of which not exactly those pieces arrived that were sent."""
        return [line for kind in due for line in self._differences(kind)]

    def _differences(self, kind: str) -> list[str]:
        if self._sent[kind] == self._arrived[kind]:
            return []
        missing = self._sent[kind] - self._arrived[kind]
        surplus = self._arrived[kind] - self._sent[kind]
        counts = f"{kind}: {self.sent(kind)} sent, {self.arrived(kind)} arrived"
        named = [
            f"{len(pieces)} {word}, such as {', '.join(map(str, list(pieces)[:_SHOWN_PIECES]))}"
            for word, pieces in (("missing", missing), ("too many", surplus))
            if pieces
        ]
        return [f"{counts}; {'; '.join(named)}"]

    def _look_at(self, event: Event) -> None:
        if event.kind == "reply" and event.args[0] == "list":
            self.expect(LISTS)
        found = _piece_of(event)
        if found:
            with self._changed:
                self._arrived[found[0]][found[1]] += 1
                self._changed.notify_all()


def _piece_of(event: Event) -> tuple[str, Piece] | None:
    """Kind and content of what the agent has let arrive, None for any other event."""
    if event.source != "velks":
        return None
    match event.kind, event.target, event.member, event.args:
        case "call", "policy_service", "onPolicyMsg", (text,):
            return FORWARDED, (text,)
        case "call", "notifications", "Notify", (_, _, _, summary, body, *_):
            return (NOTICES, (body,)) if summary == _REMINDER else (MESSAGES, (summary, body))
        case "call", "logind", "Terminate", _:
            return LOGOUTS, ()
        case "http", "platform", "read", (_, body):
            return RECEIPTS, (json.loads(body)["uuid"],)
        case "log", _, _, (text,) if text.startswith(_LIST_READ):
            return LISTS, ()
        case "call", "daemon", "sendAppOpenState", args:
            return APPLICATIONS, args
        case "call", "daemon", "SendUserStatus", args:
            return STATUSES, args
        case "call", "daemon", "UpdateUserInfo", args:
            return USERS, args
        case "call", "daemon", "onUploadFinished", (_, text):
            payload = json.loads(text)["payload"]
            if "list" in payload:
                return INVENTORIES, tuple((known["name"], known["version"]) for known in payload["list"])
            return CHANGES, (payload["type"], payload["software_name"], payload["software_version"])
    return None
