"""What the platform knows and how its routes answer, without any network."""

from __future__ import annotations

import json
import threading
from dataclasses import dataclass, field
from datetime import datetime
from itertools import islice
from typing import Any, Literal, Mapping
from uuid import uuid4

Route = Literal["list", "read", "tips", "software_change", "inventory", "other"]

_ROUTES: dict[tuple[str, str], Route] = {
    ("GET", "/notification/v2/list"): "list",
    ("PUT", "/notification/v2/read"): "read",
    ("GET", "/uim/v3/client/password/tips"): "tips",
    ("POST", "/uim/v3/client/upinfo_log"): "software_change",
    ("POST", "/uim/v3/client/upload_info"): "inventory",
}
_REPORT_TYPES: dict[Route, int] = {"software_change": 2002, "inventory": 1103}


@dataclass(frozen=True)
class HttpReply:
    """Answer to one request."""

    status: int
    body: bytes
    headers: Mapping[str, str] = field(default_factory=dict)


class Store:
    """Messages of all users with their read state, the password warnings, and what terminals report of their
    software; thread-safe.

    `software_changes` are the terminal's reports of single changes, oldest first; `inventory` is its software
    as it was reported last, None before the first report.
    """

    def __init__(self) -> None:
        self.software_changes: list[dict[str, Any]] = []
        self.inventory: list[dict[str, Any]] | None = None
        self._lock = threading.Lock()
        self._messages: dict[str, dict[str, str]] = {}
        self._unread: dict[str, dict[str, dict[str, str]]] = {}  # by user, then by uuid
        self._tips: dict[str, str] = {}

    @staticmethod
    def route(method: str, path: str) -> Route:
        """Which route a request is meant for."""
        return _ROUTES.get((method, path), "other")

    def post(self, uid: str, title: str, content: str, sender: str) -> str:
        """Add an unread message; the result is its uuid."""
        message = {
            "uuid": str(uuid4()),
            "uid": uid,
            "send_uid": sender,
            "title": title,
            "content": content,
            "created_at": _now(),
            "read_at": "",
        }
        with self._lock:
            self._messages[message["uuid"]] = message
            self._unread.setdefault(uid, {})[message["uuid"]] = message
        return message["uuid"]

    def messages(self, uid: str | None = None) -> list[dict[str, str]]:
        """Copies of a user's messages or of all, oldest first; those that were read have a `read_at`."""
        with self._lock:
            return [dict(message) for message in self._messages.values() if uid in (None, message["uid"])]

    def set_tip(self, user: str, message: str | None) -> None:
        """Set or, with None, remove the warning of a user."""
        with self._lock:
            self._tips.pop(user, None)
            if message is not None:
                self._tips[user] = message

    def serve(self, route: Route, query: Mapping[str, str], body: bytes) -> HttpReply:
        """Answer a request."""
        if route == "list":
            return self._list(query)
        if route == "read":
            return self._mark_read(_json_object(body).get("uuid"))
        if route == "tips":
            return self._tip(_json_object(body).get("username"))
        if route in _REPORT_TYPES:
            return self._take_report(route, _json_object(body))
        return HttpReply(404, b"{}")

    def _take_report(self, route: Route, report: dict[str, Any]) -> HttpReply:
        payload = report.get("payload")
        if report.get("type") != _REPORT_TYPES[route] or not isinstance(payload, dict):
            return HttpReply(400, _json({"code": 1}))
        if route == "inventory":
            self.inventory = payload.get("list")
        else:
            self.software_changes.append(payload)
        return HttpReply(200, _json({"code": 0}))

    def _list(self, query: Mapping[str, str]) -> HttpReply:
        limit, offset = int(query.get("limit", "10")), int(query.get("offset", "0"))
        uid = query.get("uid", "")
        if query.get("is_not_read") == "1":
            with self._lock:
                unread = self._unread.get(uid, {})
                count, page = len(unread), list(islice(unread.values(), offset, offset + limit))
        else:
            found = self.messages(uid)
            count, page = len(found), found[offset : offset + limit]
        headers = {"X-Total-Count": count, "X-Total-Offset": offset, "X-Total-Limit": limit}
        return HttpReply(200, _json(page), {name: str(value) for name, value in headers.items()})

    def _mark_read(self, uuid: Any) -> HttpReply:
        with self._lock:
            message = self._messages.get(uuid)
            if message:
                message["read_at"] = _now()
                self._unread[message["uid"]].pop(uuid, None)
                return HttpReply(200, _json({"code": 0}))
        return HttpReply(404, _json({"code": 1}))

    def _tip(self, user: Any) -> HttpReply:
        with self._lock:
            message = self._tips.get(user)
        return HttpReply(
            200, _json({"code": 0, "data": {"result": message is not None, "msg": message or ""}})
        )


def _json(value: Any) -> bytes:
    return json.dumps(value, ensure_ascii=False).encode()


def _json_object(body: bytes) -> dict[str, Any]:
    try:
        value = json.loads(body)
    except ValueError:
        return {}
    return value if isinstance(value, dict) else {}


def _now() -> str:
    return datetime.now().strftime("%Y-%m-%d %H:%M:%S")
