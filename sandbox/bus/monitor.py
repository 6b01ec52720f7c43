"""Records every call that the agent makes on a bus, also those to names without an owner."""

from __future__ import annotations

import contextlib
import threading
from dataclasses import dataclass
from itertools import count
from typing import Any, Collection

import dbus
from gi.repository import Gio, GLib

from sandbox.bus.buses import BUS, BUS_PATH, Bus
from sandbox.bus.senders import Senders
from sandbox.events import PATIENCE

# Calls only: signals and replies, the bulk of a flood, are not needed.
_RULES = ["type='method_call'"]
_MONITORING = f"{BUS}.Monitoring"
_CLIENT = Gio.DBusConnectionFlags.AUTHENTICATION_CLIENT | Gio.DBusConnectionFlags.MESSAGE_BUS_CONNECTION


@dataclass(frozen=True, slots=True)
class MonitoredCall:
    """A call of the agent; `args` is recorded only for calls to the bus itself."""

    destination: str
    member: str
    args: tuple[Any, ...] = ()


class BusMonitor:
    """Monitors the calls on a bus during the life of the terminal, across restarts of the bus.

    `calls` holds the agent's calls. A call to a name that is not in `served` becomes a violation, whether or
    not the name has an owner.
    """

    def __init__(self, bus: Bus, senders: Senders, served: Collection[str]) -> None:
        self.calls: list[MonitoredCall] = []
        self.violations: list[str] = []
        self._bus = bus
        self._senders = senders
        self._known = {BUS, *served}
        self._tokens = (f"com.norix.box.seen{number}" for number in count(1))
        self._awaited: dict[str, threading.Event] = {}
        self._connection: Any = None
        bus.when_started(self._listen)

    def receive_all(self) -> None:
        """Return once the monitor has seen everything that was sent to the bus so far."""
        token = next(self._tokens)
        seen = self._awaited[token] = threading.Event()
        self._bus.ask("NameHasOwner", "s", token)
        assert seen.wait(PATIENCE), f"the monitor of the {self._bus.kind} bus has stopped"

    def close(self) -> None:
        """Read what was sent so far, then stop."""
        with contextlib.suppress(dbus.DBusException):  # the bus may be gone
            self.receive_all()
        with contextlib.suppress(GLib.Error):  # the bus may have closed the connection
            self._connection.close_sync()

    def _listen(self) -> None:
        self._connection = Gio.DBusConnection.new_for_address_sync(self._bus.address, _CLIENT)
        self._connection.add_filter(self._take, self._bus.run, {})
        call = (BUS, BUS_PATH, _MONITORING, "BecomeMonitor", GLib.Variant("(asu)", (_RULES, 0)))
        self._connection.call_sync(*call, None, Gio.DBusCallFlags.NONE, int(PATIENCE * 1000), None)

    def _take(
        self, _connection: Any, message: Any, incoming: bool, run: int, labels: dict[str, str | None]
    ) -> Any:
        """Runs on a thread of the library, which would answer a call that it got back."""
        if not incoming or message.get_message_type() != Gio.DBusMessageType.METHOD_CALL:
            return message
        try:
            self._look_at(message, run, labels)
        except Exception as error:  # a bug in this thread must fail the test
            self.violations.append(f"the monitor of the {self._bus.kind} bus broke: {error!r}")
        return None

    def _look_at(self, message: Gio.DBusMessage, run: int, labels: dict[str, str | None]) -> None:
        sender, destination, member = message.get_sender(), message.get_destination(), message.get_member()
        body = message.get_body() if destination == BUS else None
        args = tuple(body.unpack()) if body else ()
        if member == "NameHasOwner" and args and args[0] in self._awaited:
            self._awaited.pop(args[0]).set()
        if sender not in labels:
            labels[sender] = self._label(sender, run)
        if labels[sender] == "velks":
            self.calls.append(MonitoredCall(destination, member, args))
            if destination not in self._known:
                called = f"{message.get_interface()}.{member} of {destination}"
                self.violations.append(
                    f"the agent calls {called}; no contract has that on the {self._bus.kind} bus"
                )

    def _label(self, sender: str, run: int) -> str | None:
        """The sender's name; None after a restart of the bus, which gives the unique names out again."""
        label = self._senders.label(self._bus, sender)
        return label if self._bus.run == run else None
