"""What the scripted HTTPS server does on a connection: one script per path."""

from __future__ import annotations

import socket
import ssl
import struct
import time
from dataclasses import dataclass, field
from itertools import chain
from typing import Any, BinaryIO, Callable
from urllib.parse import SplitResult, parse_qsl, urlsplit

_REPORTED_BODY = 16 * 1024  # bytes; the reader of the reports may be waiting for the answer just now
_CLOSE_SECONDS = 5.0
_DRIP_SECONDS = 0.2
_IP_MINTTL, _MORE_THAN_USUAL = 21, 255  # what comes with a lower time to live is dropped


class Over(Exception):
    """The script has ended the connection."""


@dataclass
class Request:
    """A request as it came over the wire."""

    line: str
    headers: list[tuple[str, str]] = field(default_factory=list)
    body: bytes = b""

    @property
    def path(self) -> str:
        """Path without query."""
        return self._target.path

    @property
    def query(self) -> dict[str, str]:
        """The query's values, decoded."""
        return dict(parse_qsl(self._target.query))

    @property
    def _target(self) -> SplitResult:
        return urlsplit(self.line.split(" ")[1])


class Conversation:
    """One TLS connection after its handshake, the server's n-th."""

    def __init__(self, tls: ssl.SSLSocket, handshake: int) -> None:
        self._tls = tls
        self._reader: BinaryIO = tls.makefile("rb")
        self._handshake = handshake

    def read_request(self) -> Request | None:
        """The next request, None when the client has left."""
        line = self._read_line()
        if not line:
            return None
        request = Request(line)
        while header := self._read_line():
            name, _, value = header.partition(": ")
            request.headers.append((name, value))
        lengths = [int(value) for name, value in request.headers if name.lower() == "content-length"]
        request.body = self._reader.read(lengths[0]) if lengths else b""
        return request

    def describe(self, request: Request) -> dict[str, object]:
        """What came: the request, and the connection that it came on."""
        subject: Any = (self._tls.getpeercert() or {}).get("subject", ())
        return {
            "line": request.line,
            "headers": request.headers,
            "body": request.body[:_REPORTED_BODY].decode(errors="backslashreplace"),
            "handshake": self._handshake,
            "resumed": self._tls.session_reused,
            "tls": self._tls.version(),
            "protocol": self._tls.selected_alpn_protocol(),
            "client": dict(chain.from_iterable(subject)).get("commonName", ""),
        }

    def send(self, data: bytes) -> None:
        """Sends bytes as they are."""
        self._tls.sendall(data)

    def wait_until_client_leaves(self) -> None:
        """Says nothing more, for as long as the client endures it."""
        while self._tls.recv(4096):
            pass
        raise Over

    def die(self) -> None:
        """Answers; from then on nothing that the client sends arrives, as if its path was dead."""
        self._tls.setsockopt(socket.IPPROTO_IP, _IP_MINTTL, _MORE_THAN_USUAL)
        self.send(_reply())
        self.wait_until_client_leaves()

    def close(self) -> None:
        """Ends the connection in order, with TLS's own good-bye."""
        self._tls.settimeout(_CLOSE_SECONDS)
        self._tls.unwrap()
        raise Over

    def break_off(self) -> None:
        """Ends the TCP connection without TLS's good-bye."""
        self._tls.shutdown(socket.SHUT_RDWR)
        raise Over

    def reset(self) -> None:
        """Ends the TCP connection with a reset."""
        self._tls.setsockopt(socket.SOL_SOCKET, socket.SO_LINGER, struct.pack("ii", 1, 0))
        raise Over

    def _read_line(self) -> str:
        return self._reader.readline().rstrip(b"\r\n").decode("latin-1")


def _reply(body: bytes = b"{}", *headers: bytes, status: int = 200) -> bytes:
    head = [b"HTTP/1.1 %d Scripted" % status, *headers, b"Content-Length: %d" % len(body)]
    return b"\r\n".join(head) + b"\r\n\r\n" + body


def _chunked_reply(*chunks: bytes, end: bytes = b"0\r\n\r\n") -> bytes:
    body = b"".join(b"%x\r\n%b\r\n" % (len(chunk), chunk) for chunk in chunks)
    return b"HTTP/1.1 200 Scripted\r\nTransfer-Encoding: chunked\r\n\r\n" + body + end


def _drip(conversation: Conversation) -> None:
    # The pace of a slow server; nobody waits for anything here.
    conversation.send(_chunked_reply(end=b""))
    while True:
        conversation.send(b"1\r\nx\r\n")
        time.sleep(_DRIP_SECONDS)


def _many_headers(size: int) -> bytes:
    line = b"X-Filler: " + b"x" * 1012
    return _reply(b"{}", *([line] * (size // len(line + b"\r\n"))))


_LENGTH_100 = b"HTTP/1.1 200 Scripted\r\nX-Cut: yes\r\nContent-Length: 100\r\n\r\n"
_NO_LENGTH = b"HTTP/1.1 200 Scripted\r\nX-Length: unknown\r\n\r\n"
_INTERIM = b"HTTP/1.1 100 Continue\r\nX-Interim: 1\r\n\r\nHTTP/1.1 103 Early Hints\r\nX-Interim: 2\r\n\r\n"
_MIXED_HEADERS = (
    b"X-Total-Count: 5",
    b"x-lower: a",
    b"X-UPPER:   b \t c  ",
    b"x-twice: 1",
    b"X-Twice: 2",
    b"x-twice: 1",
    b"X-Empty:",
)
_TRAILERS = b"0\r\nX-Trailer: late\r\n\r\n"

# What the server sends for a path that needs no more than sending; any other path gets a plain reply.
_REPLIES: dict[str, Callable[[], bytes]] = {
    "/text": lambda: _reply("用户 ü {}".encode()),
    "/empty": lambda: _reply(b""),
    "/not-found": lambda: _reply(b"no such thing", status=404),
    "/broken": lambda: _reply(b"out of order", status=500),
    "/no-content": lambda: b"HTTP/1.1 204 Scripted\r\nX-Empty: yes\r\n\r\n",
    "/redirect": lambda: _reply(b"elsewhere", b"Location: /plain", status=302),
    "/interim": lambda: _INTERIM + _reply(b"final", b"X-Final: yes"),
    "/trailers": lambda: _chunked_reply(b"first ", b"second", end=_TRAILERS),
    "/headers": lambda: _reply(b"{}", *_MIXED_HEADERS),
    "/folded": lambda: _reply(b"{}", b"X-Folded: one", b"\t two"),
    "/headers-within-cap": lambda: _many_headers(250 * 1024),
    "/headers-over-cap": lambda: _many_headers(260 * 1024),
    "/body-at-cap": lambda: _reply(b"x" * (8 << 20)),
    "/body-over-cap": lambda: _reply(b"x" * ((8 << 20) + 1)),
    "/chunks-over-cap": lambda: _chunked_reply(b"x" * (8 << 20), b"x"),
}

# How the server goes on after having sent these bytes.
_ENDINGS: dict[str, tuple[bytes, Callable[[Conversation], None]]] = {
    "/stalled-header": (b"", Conversation.wait_until_client_leaves),
    "/stalled-body": (_LENGTH_100 + b"abc", Conversation.wait_until_client_leaves),
    "/dripping-body": (b"", _drip),
    "/cut-length": (_LENGTH_100 + b"abc", Conversation.close),
    "/cut-chunk": (_chunked_reply(b"abc", end=b"ff\r\nab"), Conversation.close),
    "/cut-connection": (_LENGTH_100 + b"abc", Conversation.break_off),
    "/reset-header": (b"HTTP/1.1 200 Scr", Conversation.reset),
    "/reset-body": (_LENGTH_100 + b"abc", Conversation.reset),
    "/until-close": (_NO_LENGTH + b"all of it", Conversation.close),
    "/until-break": (_NO_LENGTH + b"all of it", Conversation.break_off),
    "/announced-close": (_reply(b"{}", b"Connection: close"), Conversation.close),
    "/idle-close": (_reply(), Conversation.close),
    "/idle-reset": (_reply(), Conversation.reset),
    "/idle-death": (b"", Conversation.die),
}


def answer(conversation: Conversation, request: Request) -> None:
    """Answers a request; raises `Over` when that ends the connection. To /said?status=STATUS&body=BODY it
    says just that."""
    if request.path in _ENDINGS:
        data, end = _ENDINGS[request.path]
        conversation.send(data)
        end(conversation)
    elif request.path == "/said":
        body = request.query.get("body", "").encode()
        conversation.send(_reply(body, b"X-Said: yes", status=int(request.query["status"])))
    else:
        conversation.send(_REPLIES.get(request.path, _reply)())
