"""A stranger that sends as fast as the bus accepts it."""

from __future__ import annotations

import threading
from typing import Sequence

from gi.repository import Gio, GLib

from sandbox.bus.bareconnection import BareConnection, as_bytes
from sandbox.bus.buses import Bus
from sandbox.events import PATIENCE


class Flooder:
    """Sends prepared messages as bytes, any number of times, including messages that a library would refuse
    to send. Incoming messages are read and dropped."""

    def __init__(self, bus: Bus) -> None:
        self._connection = BareConnection(bus)
        self._has_ended = threading.Event()
        threading.Thread(target=self._drop_all, name="flooder", daemon=True).start()

    def send(self, messages: Sequence[bytes], times: int = 1) -> None:
        """Send the messages in order, `times` times over."""
        block = b"".join(messages)
        for _ in range(times):
            self._connection.send(block)

    def close(self) -> None:
        """Leave the bus once it has accepted everything that was sent."""
        self._connection.end()
        assert self._has_ended.wait(PATIENCE), "the bus did not accept everything"
        self._connection.close()

    def _drop_all(self) -> None:
        for _ in self._connection.received():
            pass
        self._has_ended.set()


def signal(
    path: str, interface: str, member: str, body: GLib.Variant | None = None, destination: str | None = None
) -> bytes:
    """The bytes of a signal, broadcast or to one `destination`."""
    message = Gio.DBusMessage.new_signal(path, interface, member)
    if destination:
        message.set_destination(destination)
    return as_bytes(message, body)
