"""Records every call that the agent makes on a bus, also those to names without an owner."""

from __future__ import annotations

import contextlib
import threading
from dataclasses import dataclass
from itertools import count
from typing import Any, Collection

import dbus
from gi.repository import Gio, GLib

from sandbox.bus.bareconnection import BUS, BareConnection, call_of_bus
from sandbox.bus.buses import Bus
from sandbox.bus.senders import Senders
from sandbox.events import PATIENCE

# Calls only: signals and replies, the bulk of a flood, are not needed.
_RULES = ["type='method_call'"]
_MONITORING = f"{BUS}.Monitoring"
_SERIAL = 2


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
        self._connection: BareConnection | None = None
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
        if self._connection:
            self._connection.end()

    def _listen(self) -> None:
        self._connection = connection = BareConnection(self._bus)
        rules = GLib.Variant("(asu)", (_RULES, 0))
        connection.send(call_of_bus(_MONITORING, "BecomeMonitor", rules, _SERIAL))
        ready = threading.Event()
        arguments = (connection, self._bus.run, ready)
        threading.Thread(target=self._read, args=arguments, name="bus-monitor", daemon=True).start()
        assert ready.wait(PATIENCE), f"the {self._bus.kind} bus allows no monitor"

    def _read(self, connection: BareConnection, run: int, ready: threading.Event) -> None:
        labels: dict[str, str | None] = {}
        try:
            for message in connection.messages():
                if message.get_message_type() == Gio.DBusMessageType.METHOD_CALL:
                    self._look_at(message, run, labels)
                elif message.get_reply_serial() == _SERIAL:
                    message.to_gerror()  # raises if the bus refused
                    ready.set()
        except Exception as error:  # a bug in this thread must fail the test
            self.violations.append(f"the monitor of the {self._bus.kind} bus broke: {error!r}")
        connection.close()

    def _look_at(self, message: Gio.DBusMessage, run: int, labels: dict[str, str | None]) -> None:
        sender, destination, member = message.get_sender(), message.get_destination(), message.get_member()
        args = _arguments(message) if destination == BUS else ()
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


def _arguments(message: Gio.DBusMessage) -> tuple[Any, ...]:
    body = message.get_body()
    return tuple(body.unpack()) if body else ()
