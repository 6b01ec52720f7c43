"""A stranger on a bus who sends as fast as the bus can take it."""

from __future__ import annotations

import contextlib
import os
import socket
import threading
from typing import Sequence

from gi.repository import Gio, GLib

from sandbox.buses import Bus

_BUS = ("org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus")
_SECONDS = 20.0
_CHUNK = 1 << 16


class Flooder:
    """A bare connection, without a library between: messages are made once and sent as bytes, as often as one
    likes, and need not be such that a library would send them. What comes is taken and forgotten, so that to
    callers the owner of `name` is a service that hangs.
    """

    def __init__(self, bus: Bus, name: str = "") -> None:
        self._socket = socket.socket(socket.AF_UNIX)
        self._socket.settimeout(_SECONDS)
        self._socket.connect(bus.address.removeprefix("unix:path="))
        self._socket.sendall(b"\0AUTH EXTERNAL " + str(os.getuid()).encode().hex().encode() + b"\r\n")
        assert self._socket.recv(_CHUNK).startswith(b"OK")
        self._socket.sendall(b"BEGIN\r\n")
        self._has_ended = threading.Event()
        threading.Thread(target=self._take_all, name="flooder", daemon=True).start()
        self.send([_call("Hello")])
        if name:
            do_not_queue = 4
            self.send([_call("RequestName", GLib.Variant("(su)", (name, do_not_queue)))])
            while bus.owner(name) is None:
                pass

    def send(self, messages: Sequence[bytes], times: int = 1) -> None:
        """Send these messages one after the other, and all of them so many times."""
        block = b"".join(messages)
        self._socket.settimeout(None)
        for _ in range(times):
            self._socket.sendall(block)

    def close(self) -> None:
        """Leave the bus, once it has taken everything that was sent."""
        self._socket.shutdown(socket.SHUT_WR)
        assert self._has_ended.wait(_SECONDS), "the bus did not take everything"
        self._socket.close()

    def is_shown_out(self) -> bool:
        """Whether the bus has closed the connection by itself; waits for it."""
        return self._has_ended.wait(_SECONDS)

    def _take_all(self) -> None:
        with contextlib.suppress(ConnectionResetError):
            while self._socket.recv(_CHUNK):
                pass
        self._has_ended.set()


def signal(
    path: str, interface: str, member: str, body: GLib.Variant | None = None, destination: str | None = None
) -> bytes:
    """A signal as it goes through the wire, to everyone or to one `destination`."""
    message = Gio.DBusMessage.new_signal(path, interface, member)
    if destination:
        message.set_destination(destination)
    return _bytes(message, body)


def _call(member: str, body: GLib.Variant | None = None) -> bytes:
    return _bytes(Gio.DBusMessage.new_method_call(*_BUS, member), body)


def _bytes(message: Gio.DBusMessage, body: GLib.Variant | None) -> bytes:
    if body is not None:
        message.set_body(body)
    # The bus does not mind that they all have the same number: nobody answers a signal.
    message.set_serial(1)
    return bytes(message.to_blob(Gio.DBusCapabilityFlags.NONE))
