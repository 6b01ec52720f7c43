"""The management platform's HTTPS interface."""

from __future__ import annotations

import socket
import ssl
import threading
from dataclasses import dataclass, field
from functools import cache
from http.server import BaseHTTPRequestHandler, ThreadingHTTPServer
from pathlib import Path
from tempfile import mkdtemp
from typing import Any, Literal, Mapping
from urllib.parse import urlsplit

from sandbox.events import Events
from sandbox.machine import layout
from sandbox.platform.certificates import Authority, CertificateFiles
from sandbox.platform.store import HttpReply, Route, Store

_ADMINISTRATOR = "administrator"

# What the box's daemon calls itself; any other client is taken for the agent.
DAEMON_AGENT = "daemon"


@dataclass(frozen=True)
class HttpFault:
    """What the platform does with a request instead of serving it."""

    kind: Literal["none", "reply", "hang", "close", "cut"]
    status: int = 200
    body: bytes = b""
    headers: Mapping[str, str] = field(default_factory=dict)

    @staticmethod
    def none() -> HttpFault:
        """Serve it."""
        return HttpFault("none")

    @staticmethod
    def reply(status: int = 200, body: bytes = b"", headers: Mapping[str, str] | None = None) -> HttpFault:
        """Answer with this, whatever was asked."""
        return HttpFault("reply", status, body, headers or {})

    @staticmethod
    def hang() -> HttpFault:
        """Send nothing until `Platform.release` or the end."""
        return HttpFault("hang")

    @staticmethod
    def close() -> HttpFault:
        """Close the connection without a reply."""
        return HttpFault("close")

    @staticmethod
    def cut() -> HttpFault:
        """Announce a body and close the connection half-way through it."""
        return HttpFault("cut", body=b'[{"uuid":')


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


class Platform:
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
        self.port = port
        self.store = Store()
        self.fault = HttpFault.none()
        self.faults: dict[Route, HttpFault] = {}
        self.events = events
        self.released = threading.Event()
        self._identity = server or trust().server
        self._server: _Server | None = None
        self.appear()

    @property
    def present(self) -> bool:
        """Whether it serves."""
        return self._server is not None

    def appear(self) -> None:
        """Begin to serve."""
        assert not self.present, "the platform serves already"
        server = _Server((layout.PLATFORM_HOST, self.port), _Handler)
        server.platform = self
        server.socket = self._context(self._identity).wrap_socket(
            server.socket, server_side=True, do_handshake_on_connect=False
        )
        threading.Thread(target=server.serve_forever, args=(0.02,), name="platform", daemon=True).start()
        self._server = server

    def leave(self) -> None:
        """Stop listening; connections that are open break when they are used."""
        server, self._server = self._server, None
        if server:
            server.shutdown()
            server.server_close()

    def post_message(self, uid: str, title: str, content: str, sender: str = "admin") -> str:
        """Leave a message for a user; the result is its uuid."""
        self.events.record(_ADMINISTRATOR, "platform", "post", "message", (uid, title, content, sender))
        return self.store.post(uid, title, content, sender)

    def messages(self, uid: str | None = None) -> list[dict[str, str]]:
        """The messages of a user, or all; those that were read have a `read_at`."""
        return self.store.messages(uid)

    def password_tip(self, user: str, message: str | None) -> None:
        """Warn a user of the end of the password's life; None takes the warning back."""
        self.events.record(_ADMINISTRATOR, "platform", "post", "tip", (user, message))
        self.store.set_tip(user, message)

    def software_changes(self) -> list[dict[str, Any]]:
        """The terminal's reports of single changes, oldest first."""
        return self.store.software_changes()

    def inventory(self) -> list[dict[str, Any]] | None:
        """The terminal's software as it was reported last, None before the first report."""
        return self.store.inventory()

    def fault_for(self, route: Route) -> HttpFault:
        """What happens to a request of this route now."""
        return self.faults.get(route, self.fault)

    def release(self, then: HttpFault = HttpFault("none")) -> None:
        """Let hanging requests go on; they and later ones get `then`, or are served."""
        self.fault = then
        self.faults.clear()
        self.released.set()
        self.released = threading.Event()

    def close(self) -> None:
        """Stop serving, and let nothing hang."""
        self.released.set()
        self.leave()

    def _context(self, identity: CertificateFiles) -> ssl.SSLContext:
        context = ssl.SSLContext(ssl.PROTOCOL_TLS_SERVER)
        context.load_cert_chain(identity.certificate, identity.key)
        context.load_verify_locations(trust().authority.certificate)
        context.verify_mode = ssl.CERT_REQUIRED
        return context


class _Server(ThreadingHTTPServer):
    daemon_threads = True
    platform: Platform

    def handle_error(self, request: Any, client_address: Any) -> None:
        """A connection that broke is no failure of the box: the request's own events tell."""


class _Handler(BaseHTTPRequestHandler):
    raw_requestline: bytes
    protocol_version = "HTTP/1.1"
    disable_nagle_algorithm = True  # the body must not wait until the headers have been acknowledged

    def setup(self) -> None:
        connection = self.request
        assert isinstance(connection, ssl.SSLSocket)
        try:
            connection.do_handshake()
        except (ssl.SSLError, OSError) as error:
            self._platform.events.record("velks", "platform", "http", "tls", (str(error),))
            raise
        super().setup()

    def do_GET(self) -> None:  # the name is the base class's
        self._serve("GET")

    def do_PUT(self) -> None:
        self._serve("PUT")

    def do_POST(self) -> None:
        self._serve("POST")

    def log_message(self, format: str, *args: Any) -> None:  # events tell more
        pass

    @property
    def _platform(self) -> Platform:
        assert isinstance(self.server, _Server)
        return self.server.platform

    @property
    def _client(self) -> str:
        return "daemon" if self.headers.get("User-Agent") == DAEMON_AGENT else "velks"

    def _serve(self, method: str) -> None:
        body = self.rfile.read(int(self.headers.get("Content-Length", 0)))
        url = urlsplit(self.path)
        route = self._platform.store.route(method, url.path)
        if not self._platform.present:
            self._hang_up()
            return
        fault, released = self._platform.fault_for(route), self._platform.released
        self._record(route, body)
        if fault.kind == "hang":
            released.wait()
            fault = self._platform.fault_for(route)
        if fault.kind == "none":
            reply = self._platform.store.serve(route, url.query, body)
            self._reply(route, reply, own=True)
        elif fault.kind == "close":
            self._hang_up()
        else:
            reply = HttpReply(fault.status, fault.body, fault.headers)
            self._reply(route, reply, missing=1000 if fault.kind == "cut" else 0)

    def _record(self, route: Route, body: bytes) -> None:
        line = self.raw_requestline.decode("latin-1").rstrip("\r\n")
        assert isinstance(self.connection, ssl.SSLSocket)
        subject = (self.connection.getpeercert() or {}).get("subject", ())
        detail = {"headers": list(self.headers.items()), "client": subject}
        self._platform.events.record(self._client, "platform", "http", route, (line, body.decode()), detail)

    def _reply(self, route: Route, reply: HttpReply, own: bool = False, missing: int = 0) -> None:
        args = (route, reply.status, reply.body.decode(errors="replace"))
        detail = {"headers": reply.headers, "own": own}
        self._platform.events.record("platform", self._client, "reply", "reply", args, detail)
        self.send_response(reply.status)
        for name, value in {"Content-Type": "application/json", **reply.headers}.items():
            self.send_header(name, value)
        self.send_header("Content-Length", str(len(reply.body) + missing))
        self.end_headers()
        self.wfile.write(reply.body)
        if missing:
            self._hang_up()

    def _hang_up(self) -> None:
        self.close_connection = True
        self.wfile.flush()
        self.connection.shutdown(socket.SHUT_RDWR)
