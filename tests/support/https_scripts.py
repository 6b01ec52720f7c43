"""What the scripted HTTPS server does on a connection: one script per path."""

from __future__ import annotations

import socket
import time
from typing import Callable

from sandbox.platform.https import Conversation, Request, reply

_DRIP_SECONDS = 0.2
_IP_MINTTL, _MORE_THAN_USUAL = 21, 255  # what comes with a lower time to live is dropped


def _chunked_reply(*chunks: bytes, end: bytes = b"0\r\n\r\n") -> bytes:
    body = b"".join(b"%x\r\n%b\r\n" % (len(chunk), chunk) for chunk in chunks)
    return b"HTTP/1.1 200 Scripted\r\nTransfer-Encoding: chunked\r\n\r\n" + body + end


def _drip(conversation: Conversation) -> None:
    # The pace of a slow server; nobody waits for anything here.
    conversation.send(_chunked_reply(end=b""))
    while True:
        conversation.send(b"1\r\nx\r\n")
        time.sleep(_DRIP_SECONDS)


def _die(conversation: Conversation) -> None:
    # Answers; from then on nothing that the client sends arrives, as if its path was dead.
    conversation.tls.setsockopt(socket.IPPROTO_IP, _IP_MINTTL, _MORE_THAN_USUAL)
    conversation.send(reply())
    conversation.wait_until_client_leaves()


def _many_headers(size: int) -> bytes:
    line = b"X-Filler: " + b"x" * 1012
    return reply(b"{}", *([line] * (size // len(line + b"\r\n"))))


_CUT = reply(b"abc", b"X-Cut: yes", missing=97)
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
    "/text": lambda: reply("用户 ü {}".encode()),
    "/empty": lambda: reply(b""),
    "/not-found": lambda: reply(b"no such thing", status=404),
    "/broken": lambda: reply(b"out of order", status=500),
    "/no-content": lambda: b"HTTP/1.1 204 Scripted\r\nX-Empty: yes\r\n\r\n",
    "/redirect": lambda: reply(b"elsewhere", b"Location: /plain", status=302),
    "/interim": lambda: _INTERIM + reply(b"final", b"X-Final: yes"),
    "/trailers": lambda: _chunked_reply(b"first ", b"second", end=_TRAILERS),
    "/headers": lambda: reply(b"{}", *_MIXED_HEADERS),
    "/folded": lambda: reply(b"{}", b"X-Folded: one", b"\t two"),
    "/headers-within-cap": lambda: _many_headers(250 * 1024),
    "/headers-over-cap": lambda: _many_headers(260 * 1024),
    "/body-at-cap": lambda: reply(b"x" * (8 << 20)),
    "/body-over-cap": lambda: reply(b"x" * ((8 << 20) + 1)),
    "/chunks-over-cap": lambda: _chunked_reply(b"x" * (8 << 20), b"x"),
}

# How the server goes on after having sent these bytes.
_ENDINGS: dict[str, tuple[bytes, Callable[[Conversation], None]]] = {
    "/stalled-header": (b"", Conversation.wait_until_client_leaves),
    "/stalled-body": (_CUT, Conversation.wait_until_client_leaves),
    "/dripping-body": (b"", _drip),
    "/cut-length": (_CUT, Conversation.close),
    "/cut-chunk": (_chunked_reply(b"abc", end=b"ff\r\nab"), Conversation.close),
    "/cut-connection": (_CUT, Conversation.break_off),
    "/reset-header": (b"HTTP/1.1 200 Scr", Conversation.reset),
    "/reset-body": (_CUT, Conversation.reset),
    "/until-close": (_NO_LENGTH + b"all of it", Conversation.close),
    "/until-break": (_NO_LENGTH + b"all of it", Conversation.break_off),
    "/announced-close": (reply(b"{}", b"Connection: close"), Conversation.close),
    "/idle-close": (reply(), Conversation.close),
    "/idle-reset": (reply(), Conversation.reset),
    "/idle-death": (b"", _die),
}


def answer(conversation: Conversation, request: Request) -> None:
    """Answers a request; raises `Over` when that ends the connection. To /said?status=STATUS&body=BODY it
    says just that, to /bytes?hex=BYTES&end=close|break_off it sends these bytes and ends so."""
    path, query = request.path, request.query
    if path in _ENDINGS:
        data, end = _ENDINGS[path]
        conversation.send(data)
        end(conversation)
    elif path == "/bytes":
        conversation.send(bytes.fromhex(query.get("hex", "")))
        conversation.close() if query["end"] == "close" else conversation.break_off()
    elif path == "/said":
        body = query.get("body", "").encode()
        conversation.send(reply(body, b"X-Said: yes", status=int(query["status"])))
    else:
        conversation.send(_REPLIES.get(path, reply)())
