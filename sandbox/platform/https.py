"""A scripted HTTPS server: requests as they came over the wire, replies byte for byte, ways to disconnect."""

from __future__ import annotations

import socket
import ssl
import struct
from contextlib import suppress
from dataclasses import dataclass
from http.client import HTTPMessage, parse_headers
from io import BufferedReader
from itertools import chain, count
from pathlib import Path
from threading import Thread
from typing import Any, Callable, NoReturn
from urllib.parse import SplitResult, parse_qsl, urlsplit

from sandbox.platform.certificates import CertificateFiles

_LISTEN_BACKLOG = 64
_CLOSE_SECONDS = 5.0

_handshakes = count(1)


class Over(Exception):
    """The server has ended the connection."""


@dataclass(frozen=True)
class Request:
    """A request as it came over the wire."""

    line: str
    headers: HTTPMessage
    body: bytes

    @property
    def method(self) -> str:
        """GET, PUT..."""
        return self.line.split(" ")[0]

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
    """One TLS connection after its handshake, the process's n-th."""

    def __init__(self, tls: ssl.SSLSocket, reader: BufferedReader) -> None:
        self.tls = tls
        self.handshake = next(_handshakes)
        self._reader = reader

    @property
    def client(self) -> str:
        """Common name of the client's certificate, empty without one."""
        subject: Any = (self.tls.getpeercert() or {}).get("subject", ())
        return dict(chain.from_iterable(subject)).get("commonName", "")

    def read_request(self) -> Request | None:
        """The next request, None when the client has left."""
        line = self._reader.readline().rstrip(b"\r\n").decode("latin-1")
        if not line:
            return None
        headers = parse_headers(self._reader)
        return Request(line, headers, self._reader.read(int(headers.get("Content-Length", 0))))

    def send(self, data: bytes) -> None:
        """Sends bytes as they are."""
        self.tls.sendall(data)

    def wait_until_client_leaves(self) -> NoReturn:
        """Says nothing more, for as long as the client endures it."""
        while self.tls.recv(4096):
            pass
        raise Over

    def close(self) -> NoReturn:
        """Ends the connection in order, with TLS's own good-bye."""
        self.tls.settimeout(_CLOSE_SECONDS)
        self.tls.unwrap()
        raise Over

    def break_off(self) -> NoReturn:
        """Ends the TCP connection without TLS's good-bye."""
        self.tls.shutdown(socket.SHUT_RDWR)
        raise Over

    def reset(self) -> NoReturn:
        """Ends the TCP connection with a reset."""
        self.tls.setsockopt(socket.SOL_SOCKET, socket.SO_LINGER, struct.pack("ii", 1, 0))
        raise Over


class Listener:
    """A port on which each client is answered in a thread of its own, from the constructor on until `close`.

    Connections that are open then stay so. Port 0 is one that the system picks.
    """

    def __init__(
        self,
        address: tuple[str, int],
        context: ssl.SSLContext,
        answer: Callable[[Conversation, Request], None],
        on_failed_handshake: Callable[[OSError], None] = lambda error: None,
    ) -> None:
        self._context = context
        self._answer = answer
        self._on_failed_handshake = on_failed_handshake
        self._socket = socket.create_server(address, backlog=_LISTEN_BACKLOG)
        # For all connections: a part of a reply must not wait until the part before it has been acknowledged.
        self._socket.setsockopt(socket.IPPROTO_TCP, socket.TCP_NODELAY, 1)
        self.port: int = self._socket.getsockname()[1]
        self._acceptor = Thread(target=self._accept, daemon=True)
        self._acceptor.start()

    def close(self) -> None:
        """Listen no more."""
        self._socket.shutdown(socket.SHUT_RDWR)  # ends a pending accept(), which close() does not
        self._acceptor.join()
        self._socket.close()

    def _accept(self) -> None:
        with suppress(OSError):
            while True:
                connection, _ = self._socket.accept()
                Thread(target=self._converse, args=(connection,), daemon=True).start()

    def _converse(self, connection: socket.socket) -> None:
        try:
            tls = self._context.wrap_socket(connection, server_side=True)
        except OSError as error:
            self._on_failed_handshake(error)
            return
        # A client that leaves is no failure of the server.
        with suppress(OSError, Over), tls, tls.makefile("rb") as reader:
            conversation = Conversation(tls, reader)
            while request := conversation.read_request():
                self._answer(conversation, request)


def server_context(
    identity: CertificateFiles, clients: Path, demand: ssl.VerifyMode = ssl.CERT_REQUIRED
) -> ssl.SSLContext:
    """TLS of a server that knows clients by certificates of the authority `clients`."""
    context = ssl.SSLContext(ssl.PROTOCOL_TLS_SERVER)
    context.load_cert_chain(identity.certificate, identity.key)
    context.load_verify_locations(clients)
    context.verify_mode = demand
    return context


def reply(body: bytes = b"{}", *headers: bytes, status: int = 200, missing: int = 0) -> bytes:
    """A whole reply, or one that announces more bytes than its body has."""
    head = [b"HTTP/1.1 %d Scripted" % status, *headers, b"Content-Length: %d" % (len(body) + missing)]
    return b"\r\n".join(head) + b"\r\n\r\n" + body
