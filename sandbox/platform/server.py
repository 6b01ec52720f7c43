"""The management platform's HTTPS interface."""

from __future__ import annotations

import threading
from dataclasses import dataclass, field
from functools import cache
from pathlib import Path
from tempfile import mkdtemp
from typing import Literal, Mapping

from sandbox.events import Events
from sandbox.machine import layout
from sandbox.platform.certificates import Authority, CertificateFiles
from sandbox.platform.https import Conversation, Listener, Request, reply, server_context
from sandbox.platform.store import HttpReply, Route, Store

_ADMINISTRATOR = "administrator"

# What the box's daemon calls itself; any other client is taken for the agent.
DAEMON_AGENT = "daemon"
_HALF = b'[{"uuid":'  # of a list of messages


@dataclass(frozen=True)
class HttpFault:
    """What the platform does with a request instead of serving it; by default it does serve it.

    "reply" answers with this, whatever was asked; "hang" sends nothing until `Platform.release` or the end;
    "close" closes the connection without a reply; "cut" announces a body and closes half-way through it.
    """

    kind: Literal["none", "reply", "hang", "close", "cut"] = "none"
    status: int = 200
    body: bytes = b""
    headers: Mapping[str, str] = field(default_factory=dict)


@dataclass(frozen=True)
class Trust:
    """Certificates of one platform: its authority, its own and the terminal's."""

    authority: Authority
    server: CertificateFiles
    terminal: CertificateFiles


@cache
def trust() -> Trust:
    """Certificates of the box's platform, minted once in a process."""
    authority = Authority(Path(mkdtemp(prefix="platform-")), "Box platform authority")
    return Trust(authority, authority.issue_server(layout.PLATFORM_HOST), authority.issue_client("terminal"))


class Platform(Store):
    """HTTPS server that demands a certificate of its own authority from the client.

    Every request is an event of kind "http", its source the agent or the daemon: member the route; args the
    request line and the body; detail headers and the client's name. A failed handshake is an event with
    member "tls", and an answer one of kind "reply": args route, status and body, detail its own headers and
    whether it is the platform's own answer and no fault. `fault` applies to all requests, `faults` to those
    of one route.
    """

    def __init__(
        self, events: Events, port: int = layout.PLATFORM_PORT, server: CertificateFiles | None = None
    ) -> None:
        super().__init__()
        self.port = port
        self.fault = HttpFault()
        self.faults: dict[Route, HttpFault] = {}
        self.events = events
        self._released = threading.Event()
        self._context = server_context(server or trust().server, trust().authority.certificate)
        self._listener: Listener | None = None
        self.appear()

    @property
    def present(self) -> bool:
        """Whether it serves."""
        return self._listener is not None

    def appear(self) -> None:
        """Begin to serve."""
        assert not self.present, "the platform serves already"
        address = (layout.PLATFORM_HOST, self.port)
        self._listener = Listener(address, self._context, self._answer, self._on_failed_handshake)

    def leave(self) -> None:
        """Stop listening; connections that are open break when they are used."""
        listener, self._listener = self._listener, None
        if listener:
            listener.close()

    def post_message(self, uid: str, title: str, content: str, sender: str = "admin") -> str:
        """Leave a message for a user; the result is its uuid."""
        self.events.record(_ADMINISTRATOR, "platform", "post", "message", (uid, title, content, sender))
        return self.post(uid, title, content, sender)

    def password_tip(self, user: str, message: str | None) -> None:
        """Warn a user of the end of the password's life; None takes the warning back."""
        self.events.record(_ADMINISTRATOR, "platform", "post", "tip", (user, message))
        self.set_tip(user, message)

    def release(self, then: HttpFault = HttpFault()) -> None:
        """Let hanging requests go on; they and later ones get `then`, or are served."""
        self.fault = then
        self.faults.clear()
        self._released.set()
        self._released = threading.Event()

    def close(self) -> None:
        """Stop serving, and let nothing hang."""
        self._released.set()
        self.leave()

    def _on_failed_handshake(self, error: OSError) -> None:
        self.events.record("velks", "platform", "http", "tls", (str(error),))

    def _answer(self, conversation: Conversation, request: Request) -> None:
        route = self.route(request.method, request.path)
        if not self.present:
            conversation.break_off()
        fault, released = self._fault_for(route), self._released
        client = "daemon" if request.headers.get("User-Agent") == DAEMON_AGENT else "velks"
        args = (request.line, request.body.decode())
        detail = {"headers": request.headers.items(), "client": conversation.client}
        self.events.record(client, "platform", "http", route, args, detail)
        if fault.kind == "hang":
            released.wait()
            fault = self._fault_for(route)
        if fault.kind == "close":
            conversation.break_off()
        answer = HttpReply(fault.status, _HALF if fault.kind == "cut" else fault.body, fault.headers)
        if fault.kind == "none":
            answer = self.serve(route, request.query, request.body)
        self._record_reply(client, route, answer, own=fault.kind == "none")
        conversation.send(_on_the_wire(answer, missing=1000 if fault.kind == "cut" else 0))
        if fault.kind == "cut":
            conversation.break_off()

    def _record_reply(self, client: str, route: Route, answer: HttpReply, own: bool) -> None:
        args = (route, answer.status, answer.body.decode(errors="replace"))
        detail = {"headers": answer.headers, "own": own}
        self.events.record("platform", client, "reply", "reply", args, detail)

    def _fault_for(self, route: Route) -> HttpFault:
        return self.faults.get(route, self.fault)


def _on_the_wire(answer: HttpReply, missing: int) -> bytes:
    headers = {"Content-Type": "application/json", **answer.headers}
    lines = [f"{name}: {value}".encode("latin-1") for name, value in headers.items()]
    return reply(answer.body, *lines, status=answer.status, missing=missing)
