"""Fakes of services on a bus of the booted machine: they answer from a table and record what they are asked.

Everything that crosses their connection goes to one file, a line of JSON each, for the tests to read.
"""

from __future__ import annotations

import json
import os
from typing import Any

import dbus
import dbus.lowlevel
from dbus.mainloop.glib import DBusGMainLoop
from gi.repository import GLib

EVENTS = "/run/booted/events"
CONTROL = "com.norix.velk.booted"  # the tests' own interface, on every fake
_BUS = ("org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus")
_CALL = dbus.lowlevel.MESSAGE_TYPE_METHOD_CALL
_HANDLED = dbus.lowlevel.HANDLER_RESULT_HANDLED
_NOT_HANDLED = dbus.lowlevel.HANDLER_RESULT_NOT_YET_HANDLED

# Signature and value of each method's reply, by interface and member; "" where there is none.
Answers = dict[tuple[str, str], tuple[str, Any]]


def record(who: str, member: str, args: list[Any], uid: int | None = None, pid: int | None = None) -> None:
    """Append one event; a single write, so that the lines of several processes do not mix."""
    event = {"who": who, "member": member, "args": args, "uid": uid, "pid": pid}
    line = json.dumps(event, ensure_ascii=False) + "\n"
    stream = os.open(EVENTS, os.O_WRONLY | os.O_APPEND)
    os.write(stream, line.encode())
    os.close(stream)


class Services:
    """Owns names on one bus. `answers` gives the replies."""

    def __init__(self, who: str, bus: Any, names: list[str], answers: Answers) -> None:
        self._who = who
        self._bus = bus
        self._answers = answers
        self._muted = ""
        bus.add_message_filter(self._on_message)
        for name in names:
            bus.request_name(name)

    def _on_message(self, _connection: Any, message: Any) -> int:
        if message.get_type() != _CALL:
            return int(_NOT_HANDLED)
        if message.get_interface() == CONTROL:
            self._obey(message)
        else:
            self._serve(message)
        return int(_HANDLED)

    def _serve(self, message: Any) -> None:
        member = str(message.get_member())
        args = json.loads(json.dumps(message.get_args_list(), default=str))
        record(self._who, member, args, *self._sender(message.get_sender()))
        if message.get_no_reply() or member == self._muted:
            return
        key = (str(args[0]), f"{member} {args[1]}") if member in ("Get", "Set") else None
        known = self._answers.get(key or (str(message.get_interface()), member))
        if known is None:
            unknown = "org.freedesktop.DBus.Error.UnknownMethod"
            self._bus.send_message(dbus.lowlevel.ErrorMessage(message, unknown, member))
        else:
            self._reply(message, *known)

    def _sender(self, name: str) -> list[int | None]:
        """User and process of a caller, as the bus knows them; none if it has gone."""
        found: list[int | None] = []
        for question in ("GetConnectionUnixUser", "GetConnectionUnixProcessID"):
            try:
                found.append(int(self._bus.call_blocking(*_BUS, question, "s", (name,))))
            except dbus.DBusException:
                found.append(None)
        return found

    def _obey(self, message: Any) -> None:
        """A test's wish: `Emit` a signal of strings, `EmitMany` of it, or `Mute` a member for good."""
        args = [str(arg) for arg in message.get_args_list()]
        if message.get_member() == "Mute":
            (self._muted,) = args
        elif message.get_member() == "EmitMany":
            self._emit(int(args[0]), *args[1:])
        else:
            self._emit(1, *args)
        self._reply(message, "", None)

    def _emit(self, times: int, path: str, interface: str, member: str, *values: str) -> None:
        for _ in range(times):
            signal = dbus.lowlevel.SignalMessage(path, interface, member)
            signal.append(*values, signature="s" * len(values))
            self._bus.send_message(signal)

    def _reply(self, message: Any, signature: str, value: Any) -> None:
        reply = dbus.lowlevel.MethodReturnMessage(message)
        if signature:
            reply.append(value, signature=signature)
        self._bus.send_message(reply)


def main_loop() -> Any:
    """The loop of the process, which D-Bus connections made from now on use."""
    DBusGMainLoop(set_as_default=True)
    return GLib.MainLoop()
