"""The base of all fakes: connection, faults, recording, contract checks."""

from __future__ import annotations

from typing import Any, Mapping

import dbus
import dbus.bus
import dbus.lowlevel

from sandbox.bus.buses import Bus, BusKind, await_pings
from sandbox.bus.mainloop import MainLoop, on_main_loop
from sandbox.bus.senders import Senders
from sandbox.bus.values import plain
from sandbox.events import Events
from sandbox.fakes import contract
from sandbox.fakes.exported import PROPERTIES, ExportedObject, CallRefused, Reply
from sandbox.fakes.fault import Fault

_HANDLED = dbus.lowlevel.HANDLER_RESULT_HANDLED
_NOT_HANDLED = dbus.lowlevel.HANDLER_RESULT_NOT_YET_HANDLED
_CALL = dbus.lowlevel.MESSAGE_TYPE_METHOD_CALL
_FAILED = "org.freedesktop.DBus.Error.Failed"


class Fake:
    """A service on a bus, with its own bus name and connection.

    Records every call that reaches it as an event and checks it against the interface's contract;
    `violations` holds the calls that broke it. `fault` applies to all calls, an entry of `faults` to one
    member or one property, an entry of `answers` replaces a method's reply, even by one of a wrong type.
    Objects whose paths are in `withdrawn` do not exist for callers. `properties` are the initial values of
    the main object, `replies` what its methods return.
    """

    name = ""
    bus_name = ""
    bus_kind: BusKind = "session"
    properties: Mapping[str, Any] = {}
    replies: Mapping[str, Any] = {}

    def __init__(self, bus: Bus, events: Events, senders: Senders) -> None:
        self.bus = bus
        self.fault = Fault()
        self.faults: dict[str, Fault] = {}
        self.answers: dict[str, Reply] = {}
        self.violations: list[str] = []
        self.withdrawn: set[str] = set()
        self.objects = {known.path: known for known in self.exports()}
        self._events = events
        self._senders = senders
        self._connection: Any = None
        self._bus_run = 0
        self._held: list[Any] = []

    def exports(self) -> list[ExportedObject]:
        """The service's objects, the main one first: by default one with the interface and path of its
        name."""
        main = ExportedObject(f"/{self.bus_name.replace('.', '/')}", self.bus_name)
        for name, value in self.properties.items():
            main.set(name, value)
        for member, reply in self.replies.items():
            main.handlers[member] = lambda *_args, reply=reply: reply
        return [main]

    @property
    def present(self) -> bool:
        """Whether the service is on the bus."""
        return self._connection is not None and self._bus_run == self.bus.run

    @on_main_loop
    def appear(self) -> None:
        """Connect and own the bus name."""
        assert not self.present, f"{self.name} is on the bus already"
        connection = self.bus.connect()
        connection.add_message_filter(self._on_message)
        self._connection = connection
        self._bus_run = self.bus.run
        answer = connection.request_name(self.bus_name, dbus.bus.NAME_FLAG_DO_NOT_QUEUE)
        assert answer == dbus.bus.REQUEST_NAME_REPLY_PRIMARY_OWNER, f"{self.bus_name} is taken"
        self._record("life", "appears", (str(connection.get_unique_name()),))

    @on_main_loop
    def leave(self) -> None:
        """Close the connection; the bus then answers the unanswered calls with an error."""
        if not self.present:
            return
        connection, self._connection = self._connection, None
        self._held.clear()
        # The bus notices a closed connection only a moment later, but the name must be free at once.
        connection.release_name(self.bus_name)
        connection.close()
        self._record("life", "leaves", ())

    def restart(self) -> None:
        """Leave and appear again, with a new unique name."""
        self.leave()
        self.appear()

    @on_main_loop
    def release(self) -> None:
        """Answer the calls held so far, in order, and hold no more."""
        self.fault = Fault()
        self.faults = {member: fault for member, fault in self.faults.items() if fault.kind != "hold"}
        held, self._held = self._held, []
        for message in held:
            self._answer(message)

    @on_main_loop
    def set(self, name: str, value: Any, signature: str | None = None, path: str | None = None) -> None:
        """Change a property and announce it; `signature` allows a value of a wrong type."""
        known = self._object(path)
        known.set(name, value, signature)
        if self.present:
            self._announce(known, name)

    @on_main_loop
    def value(self, name: str, path: str | None = None) -> Any:
        """A property as a plain value."""
        return self._object(path).value(name)

    @on_main_loop
    def emit(self, interface: str, member: str, *args: Any) -> None:
        """Broadcast a signal of the main object."""
        known = self._object(None)
        signature = contract.signature(known.contract.lookup_signal(member).args)
        self._emit(known.path, interface, member, signature, args)

    def receive_all_from(self, pid: int) -> None:
        """Return once everything that a process has sent to the service so far is recorded."""
        await_pings(self._connection, self.bus.names_of(pid))

    def _object(self, path: str | None) -> ExportedObject:
        return self.objects[path] if path else next(iter(self.objects.values()))

    def _announce(self, known: ExportedObject, name: str) -> None:
        """Announce a property's new value on the bus."""
        self._announce_properties(known, {name: known.typed_value(name)}, [])

    def _announce_properties(
        self, known: ExportedObject, changed: Mapping[str, Any], invalidated: list[str]
    ) -> None:
        args = (known.contract.name, dbus.Dictionary(changed, signature="sv"), invalidated)
        self._emit(known.path, PROPERTIES, "PropertiesChanged", "sa{sv}as", args)

    def _emit(self, path: str, interface: str, member: str, signature: str, args: tuple[Any, ...]) -> None:
        assert self.present, f"{self.name} is not on the bus"
        message = dbus.lowlevel.SignalMessage(path, interface, member)
        message.append(*args, signature=signature)
        self._record("signal", member, plain(list(args)), interface=interface, path=path, signature=signature)
        self._connection.send_message(message)
        self._connection.flush()

    def _record(self, kind: str, member: str, args: Any, **detail: Any) -> None:
        self._events.record(self.name, "*", kind, member, tuple(args), detail)

    def _on_message(self, _connection: Any, message: Any) -> int:
        if message.get_type() != _CALL:
            return int(_NOT_HANDLED)
        args = self._record_call(message)
        fault = self._fault_for(message.get_member(), args)
        if fault.kind == "none":
            self._answer(message)
        elif fault.kind == "fail":
            self._refuse(message, fault.error_name, "simulated failure")
        elif fault.kind == "slow":
            MainLoop.later(fault.seconds, lambda: self._answer(message))
        elif fault.kind == "hold":
            self._held.append(message)
        return int(_HANDLED)

    def _record_call(self, message: Any) -> tuple[Any, ...]:
        args = message.get_args_list()
        detail = {
            "interface": message.get_interface(),
            "path": message.get_path(),
            "signature": message.get_signature(),
            "serial": message.get_serial(),
        }
        try:
            self._check(message)
        except CallRefused as refused:
            self.violations.append(f"{self.name}: {refused}")
        source = self._senders.label(self.bus, message.get_sender())
        simple = tuple(plain(arg) for arg in args)
        self._events.record(source, self.name, "call", message.get_member(), simple, detail)
        return simple

    def _check(self, message: Any) -> None:
        """Raise CallRefused if a call breaks the contract of its object."""
        known = self.objects.get(message.get_path())
        if known is None:
            raise CallRefused("UnknownObject", f"no object {message.get_path()}")
        arguments = message.get_args_list()
        known.check(str(message.get_interface()), message.get_member(), message.get_signature(), arguments)

    def _fault_for(self, member: str, args: tuple[Any, ...]) -> Fault:
        is_property = member in ("Get", "Set") and len(args) > 1
        by_property = self.faults.get(args[1]) if is_property else None
        return by_property or self.faults.get(member) or self.fault

    def _answer(self, message: Any) -> None:
        if not self.present:
            return
        try:
            reply = self._carry_out(message)
        except CallRefused as refused:
            self._refuse(message, refused.error_name, str(refused))
        except Exception as error:  # a bug in a fake must fail the test instead of vanishing in the loop
            self.violations.append(f"{self.name}: {message.get_member()} broke: {error!r}")
            self._refuse(message, _FAILED, repr(error))
        else:
            self._reply(message, self.answers.get(message.get_member(), reply))

    def _carry_out(self, message: Any) -> Reply:
        path = message.get_path()
        if path in self.withdrawn:
            raise CallRefused("UnknownObject", f"no object {path}")
        self._check(message)
        args = tuple(plain(arg) for arg in message.get_args_list())
        return self.objects[path].call(str(message.get_interface()), message.get_member(), args)

    def _reply(self, message: Any, reply: Reply) -> None:
        answer = dbus.lowlevel.MethodReturnMessage(message)
        if reply.signature:
            answer.append(*reply.values, signature=reply.signature)
        self._send(message, answer)

    def _refuse(self, message: Any, error_name: str, text: str) -> None:
        self._send(message, dbus.lowlevel.ErrorMessage(message, error_name, text))

    def _send(self, message: Any, answer: Any) -> None:
        if not message.get_no_reply():
            self._connection.send_message(answer)
            self._connection.flush()
