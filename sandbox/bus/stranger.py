"""A stranger on a bus: it may send anything and own any name."""

from __future__ import annotations

from typing import Any

import dbus.bus
import dbus.lowlevel

from sandbox.bus.buses import Bus, reply_to
from sandbox.bus.mainloop import MainLoop, on_main_loop
from sandbox.bus.values import plain

_CALL_SECONDS = 30.0


class Stranger:
    """A separate connection, for messages that no correct service would send."""

    def __init__(self, bus: Bus) -> None:
        self._connection = bus.connect()
        self._names: set[str] = set()

    @property
    def unique_name(self) -> str:
        """Unique name of the stranger's connection."""
        return str(self._connection.get_unique_name())

    @on_main_loop
    def emit(
        self,
        path: str,
        interface: str,
        member: str,
        *args: Any,
        signature: str = "",
        destination: str | None = None,
    ) -> None:
        """Send a signal, broadcast or to one `destination`."""
        message = dbus.lowlevel.SignalMessage(path, interface, member)
        if destination:
            message.set_destination(destination)
        message.append(*args, signature=signature)
        self._connection.send_message(message)
        self._connection.flush()

    def call(self, name: str, path: str, interface: str, member: str, *args: Any, signature: str = "") -> Any:
        """Call a method and return its reply; raises dbus.DBusException. Must not run on the main loop's
        thread, because the fakes answer there."""
        reply = reply_to(self._connection, name, path, interface, member, signature, args)
        values = reply.result(_CALL_SECONDS)
        return plain(values[0]) if len(values) == 1 else plain(list(values))

    def own(self, name: str, queue: bool = False) -> int:
        """Request a bus name; returns the bus's answer (1 owner, 2 in the queue, 3 taken)."""
        flags = 0 if queue else dbus.bus.NAME_FLAG_DO_NOT_QUEUE
        self._names.add(name)
        return int(MainLoop.call(self._connection.request_name, name, flags))

    def release(self, name: str) -> None:
        """Release a bus name."""
        self._names.discard(name)
        MainLoop.call(self._connection.release_name, name)

    def close(self) -> None:
        """Release all names and leave the bus."""
        for name in list(self._names):
            self.release(name)
        MainLoop.call(self._connection.close)
