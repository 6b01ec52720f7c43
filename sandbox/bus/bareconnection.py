"""A connection to a bus without a library, which would answer and check messages on its own."""

from __future__ import annotations

import contextlib
import os
import socket
from typing import Iterator

from gi.repository import Gio, GLib

from sandbox.bus.buses import Bus
from sandbox.events import PATIENCE

BUS = "org.freedesktop.DBus"
_BUS_PATH = "/org/freedesktop/DBus"
_CHUNK = 1 << 16
_HEAD = 16  # the first bytes of a message, which hold its length


class BareConnection:
    """Sends bytes unchanged and returns what arrives; it answers nothing by itself."""

    def __init__(self, bus: Bus) -> None:
        self._socket = socket.socket(socket.AF_UNIX)
        self._socket.settimeout(PATIENCE)
        self._socket.connect(bus.address.removeprefix("unix:path="))
        self._socket.sendall(b"\0AUTH EXTERNAL " + str(os.getuid()).encode().hex().encode() + b"\r\n")
        assert self._socket.recv(_CHUNK).startswith(b"OK")
        self._socket.sendall(b"BEGIN\r\n")
        self._socket.settimeout(None)
        self.send(call_of_bus(BUS, "Hello"))

    def send(self, content: bytes) -> None:
        """Send one or more messages; blocks while the bus does not accept them."""
        self._socket.sendall(content)

    def received(self) -> Iterator[bytes]:
        """The incoming bytes, in pieces, until the connection ends."""
        with contextlib.suppress(ConnectionResetError):
            while piece := self._socket.recv(_CHUNK):
                yield piece

    def messages(self) -> Iterator[Gio.DBusMessage]:
        """The incoming messages, until the connection ends."""
        unread = bytearray()
        for piece in self.received():
            unread += piece
            while len(unread) >= _HEAD and len(unread) >= (size := _length(unread)):
                yield Gio.DBusMessage.new_from_blob(bytes(unread[:size]), Gio.DBusCapabilityFlags.NONE)
                del unread[:size]

    def end(self) -> None:
        """Send nothing more; the bus closes the connection once it has read everything."""
        with contextlib.suppress(OSError):
            self._socket.shutdown(socket.SHUT_WR)

    def close(self) -> None:
        """Close the socket."""
        self._socket.close()


def call_of_bus(interface: str, member: str, body: GLib.Variant | None = None, serial: int = 1) -> bytes:
    """The bytes of a call to the bus itself."""
    return as_bytes(Gio.DBusMessage.new_method_call(BUS, _BUS_PATH, interface, member), body, serial)


def as_bytes(message: Gio.DBusMessage, body: GLib.Variant | None, serial: int = 1) -> bytes:
    """The bytes of a message. The bus accepts repeated serial numbers."""
    if body is not None:
        message.set_body(body)
    message.set_serial(serial)
    return bytes(message.to_blob(Gio.DBusCapabilityFlags.NONE))


def _length(message: bytearray) -> int:
    return int(Gio.DBusMessage.bytes_needed(bytes(message[:_HEAD])))
