"""What the agent asks for on a bus, whether it reaches a service or nobody."""

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

# Signals and replies, the bulk of a flood, are none of its business.
_RULES = ["type='method_call'"]
_MONITORING = f"{BUS}.Monitoring"
_SERIAL = 2


@dataclass(frozen=True, slots=True)
class Overheard:
    """One call; its arguments are kept of questions to the bus alone."""

    destination: str
    member: str
    args: tuple[Any, ...] = ()


class BusMonitor:
    """Overhears the calls on a bus for as long as the terminal lives, also after the bus was restarted.

    `calls` are the agent's. One to a name that none of the `served` contracts knows is kept in `violations`,
    whether somebody owns the name or not.
    """

    def __init__(self, bus: Bus, senders: Senders, served: Collection[str]) -> None:
        self.calls: list[Overheard] = []
        self.violations: list[str] = []
        self._bus = bus
        self._senders = senders
        self._known = {BUS, *served}
        self._tokens = (f"com.norix.box.heard{number}" for number in count(1))
        self._awaited: dict[str, threading.Event] = {}
        self._line: BareConnection | None = None
        bus.when_started(self._listen)

    def receive_all(self) -> None:
        """Return once everything that the bus was sent so far has been overheard."""
        token = next(self._tokens)
        heard = self._awaited[token] = threading.Event()
        self._bus.ask("NameHasOwner", "s", token)
        assert heard.wait(PATIENCE), f"the monitor of the {self._bus.kind} bus has stopped"

    def close(self) -> None:
        """Overhear what has been sent so far, and then no more."""
        with contextlib.suppress(dbus.DBusException):  # the bus may have gone
            self.receive_all()
        if self._line:
            self._line.end()

    def _listen(self) -> None:
        self._line = line = BareConnection(self._bus)
        line.send(call_of_bus(_MONITORING, "BecomeMonitor", GLib.Variant("(asu)", (_RULES, 0)), _SERIAL))
        ready = threading.Event()
        arguments = (line, self._bus.run, ready)
        threading.Thread(target=self._overhear, args=arguments, name="bus-monitor", daemon=True).start()
        assert ready.wait(PATIENCE), f"the {self._bus.kind} bus allows no monitor"

    def _overhear(self, line: BareConnection, run: int, ready: threading.Event) -> None:
        labels: dict[str, str | None] = {}
        try:
            for message in line.messages():
                if message.get_message_type() == Gio.DBusMessageType.METHOD_CALL:
                    self._look_at(message, run, labels)
                elif message.get_reply_serial() == _SERIAL:
                    message.to_gerror()  # raises what the bus refuses
                    ready.set()
        except Exception as error:  # the thread's own mistake must fail the test
            self.violations.append(f"the monitor of the {self._bus.kind} bus broke: {error!r}")
        line.close()

    def _look_at(self, message: Gio.DBusMessage, run: int, labels: dict[str, str | None]) -> None:
        sender, destination, member = message.get_sender(), message.get_destination(), message.get_member()
        args = _arguments(message) if destination == BUS else ()
        if member == "NameHasOwner" and args and args[0] in self._awaited:
            self._awaited.pop(args[0]).set()
        if sender not in labels:
            labels[sender] = self._label(sender, run)
        if labels[sender] == "velks":
            self.calls.append(Overheard(destination, member, args))
            if destination not in self._known:
                asked = f"{destination} for {message.get_interface()}.{member}"
                self.violations.append(
                    f"the agent asks {asked}; no contract has that on the {self._bus.kind} bus"
                )

    def _label(self, sender: str, run: int) -> str | None:
        """Who that is; unknown when the bus was restarted, whose fresh connections have the same names."""
        label = self._senders.label(self._bus, sender)
        return label if self._bus.run == run else None


def _arguments(message: Gio.DBusMessage) -> tuple[Any, ...]:
    body = message.get_body()
    return tuple(body.unpack()) if body else ()
