"""A stranger that sends as fast as the bus accepts it."""

from __future__ import annotations

import contextlib
import os
import socket
import threading
from typing import Sequence

from gi.repository import Gio, GLib

from sandbox.bus.buses import BUS, BUS_PATH, Bus
from sandbox.events import PATIENCE

_CHUNK = 1 << 16


class Flooder:
    """Sends prepared messages as bytes, any number of times, including messages that a library would refuse
    to send. Incoming messages are read and dropped."""

    def __init__(self, bus: Bus) -> None:
        self._socket = socket.socket(socket.AF_UNIX)
        self._socket.connect(bus.address.removeprefix("unix:path="))
        self._socket.sendall(b"\0AUTH EXTERNAL " + str(os.getuid()).encode().hex().encode() + b"\r\n")
        assert self._socket.recv(_CHUNK).startswith(b"OK")
        self._socket.sendall(b"BEGIN\r\n")
        self.send([_as_bytes(Gio.DBusMessage.new_method_call(BUS, BUS_PATH, BUS, "Hello"))])
        self._has_ended = threading.Event()
        threading.Thread(target=self._drop_all, name="flooder", daemon=True).start()

    def send(self, messages: Sequence[bytes], times: int = 1) -> None:
        """Send the messages in order, `times` times over; blocks while the bus does not accept them."""
        block = b"".join(messages)
        for _ in range(times):
            self._socket.sendall(block)

    def is_expelled(self) -> bool:
        """Whether the bus ends the connection by itself, as after a message that nobody may send."""
        return self._has_ended.wait(PATIENCE)

    def close(self) -> None:
        """Leave the bus once it has accepted everything that was sent."""
        with contextlib.suppress(OSError):  # it has been expelled
            self._socket.shutdown(socket.SHUT_WR)
        assert self._has_ended.wait(PATIENCE), "the bus did not accept everything"
        self._socket.close()

    def _drop_all(self) -> None:
        with contextlib.suppress(ConnectionResetError):
            while self._socket.recv(_CHUNK):
                pass
        self._has_ended.set()


def signal(
    path: str, interface: str, member: str, body: GLib.Variant | None = None, destination: str | None = None
) -> bytes:
    """The bytes of a signal, broadcast or to one `destination`."""
    message = Gio.DBusMessage.new_signal(path, interface, member)
    if destination:
        message.set_destination(destination)
    if body is not None:
        message.set_body(body)
    return _as_bytes(message)


def _as_bytes(message: Gio.DBusMessage) -> bytes:
    message.set_serial(1)  # the bus accepts repeated serial numbers
    return bytes(message.to_blob(Gio.DBusCapabilityFlags.NONE))
