"""A stranger on a bus who sends as fast as the bus can take it."""

from __future__ import annotations

import threading
from typing import Sequence

from gi.repository import Gio, GLib

from sandbox.bus.bareconnection import BUS, BareConnection, as_bytes, call_of_bus
from sandbox.bus.buses import Bus
from sandbox.events import PATIENCE


class Flooder:
    """Messages are made once and sent as bytes, as often as one likes, and need not be such that a library
    would send them. What comes is taken and forgotten: to callers, the owner of `name` is a service that
    hangs."""

    def __init__(self, bus: Bus, name: str = "") -> None:
        self._connection = BareConnection(bus)
        self._has_ended = threading.Event()
        threading.Thread(target=self._take_all, name="flooder", daemon=True).start()
        if name:
            do_not_queue = 4
            self.send([call_of_bus(BUS, "RequestName", GLib.Variant("(su)", (name, do_not_queue)))])
            while bus.owner(name) is None:
                pass

    def send(self, messages: Sequence[bytes], times: int = 1) -> None:
        """Send these messages one after the other, and all of them so many times."""
        block = b"".join(messages)
        for _ in range(times):
            self._connection.send(block)

    def close(self) -> None:
        """Leave the bus, once it has taken everything that was sent."""
        self._connection.end()
        assert self._has_ended.wait(PATIENCE), "the bus did not take everything"
        self._connection.close()

    def is_shown_out(self) -> bool:
        """Whether the bus has closed the connection by itself; waits for it."""
        return self._has_ended.wait(PATIENCE)

    def _take_all(self) -> None:
        for _ in self._connection.received():
            pass
        self._has_ended.set()


def signal(
    path: str, interface: str, member: str, body: GLib.Variant | None = None, destination: str | None = None
) -> bytes:
    """A signal as it goes through the wire, to everyone or to one `destination`."""
    message = Gio.DBusMessage.new_signal(path, interface, member)
    if destination:
        message.set_destination(destination)
    return as_bytes(message, body)
