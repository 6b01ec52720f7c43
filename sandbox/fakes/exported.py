"""An object that a fake exports: its interface, property values and method handlers."""

from __future__ import annotations

from dataclasses import dataclass
from typing import Any, Callable, Sequence
from xml.sax.saxutils import quoteattr

from gi.repository import Gio, GLib

from sandbox.bus.values import plain, signature_in_variant, typed
from sandbox.fakes import contract

PROPERTIES = "org.freedesktop.DBus.Properties"
INTROSPECTABLE = "org.freedesktop.DBus.Introspectable"
_ERROR = "org.freedesktop.DBus.Error."
_STANDARD_METHODS = {
    (INTROSPECTABLE, "Introspect"): "",
    (PROPERTIES, "Get"): "ss",
    (PROPERTIES, "GetAll"): "s",
    (PROPERTIES, "Set"): "ssv",
}

Handler = Callable[..., Any]


class CallRefused(Exception):
    """The call is answered with a D-Bus error; `error_name` is the error's full name."""

    def __init__(self, error_name: str, text: str) -> None:
        super().__init__(text)
        self.error_name = _ERROR + error_name


@dataclass(frozen=True)
class Reply:
    """The values and signature of a method's reply."""

    signature: str
    values: tuple[Any, ...]


class ExportedObject:
    """Dispatches calls by the contract of its interface.

    `handlers` maps a method to a function of the plain arguments, which returns the single value of the
    reply, or None if the reply has no value.
    """

    def __init__(self, path: str, interface: str) -> None:
        self.path = path
        self.contract = contract.load(interface)
        self.handlers: dict[str, Handler] = {}
        self._values: dict[str, Any] = {}

    def value(self, name: str) -> Any:
        """A property as a plain value."""
        return plain(self._values[name])

    def set(self, name: str, value: Any, signature: str | None = None) -> None:
        """Change a property; `signature` allows a type other than the contract's."""
        self._values[name] = typed(signature or self._property(name).signature, value)

    def typed_value(self, name: str) -> Any:
        """A property as a D-Bus value."""
        return self._values[name]

    def check(self, interface: str, member: str, signature: str, args: Sequence[Any]) -> None:
        """Raise CallRefused if a call breaks the contract; `args` are its D-Bus values."""
        expected = _STANDARD_METHODS.get((interface, member))
        if expected is None:
            method = self.contract.lookup_method(member) if interface == self.contract.name else None
            if method is None:
                raise CallRefused("UnknownMethod", f"{self.path} has no method {interface}.{member}")
            expected = contract.signature(method.in_args)
        if signature != expected:
            raise CallRefused(
                "InvalidArgs", f"{interface}.{member} takes ({expected}), called with ({signature})"
            )
        if interface == PROPERTIES:
            self._check_property_call(*args)

    def call(self, interface: str, member: str, args: tuple[Any, ...]) -> Reply:
        """Carry out a call that keeps to the contract."""
        if interface == INTROSPECTABLE:
            xml = GLib.String.new("")
            self.contract.generate_xml(0, xml)
            return Reply("s", (f"<node name={quoteattr(self.path)}>{xml.str}</node>",))
        if interface == PROPERTIES:
            return self._property_call(member, args)
        signature = contract.signature(self.contract.lookup_method(member).out_args)
        result = self.handlers[member](*args) if member in self.handlers else None
        return Reply(signature, (result,) if signature else ())

    def _property_call(self, member: str, args: tuple[Any, ...]) -> Reply:
        if member == "GetAll":
            return Reply("a{sv}", (self._values,))
        _, name, *rest = args
        if member == "Get":
            return Reply("v", (self._values[name],))
        self.set(name, rest[0])
        return Reply("", ())

    def _check_property_call(self, interface: str, name: str | None = None, *values: Any) -> None:
        if interface != self.contract.name:
            raise CallRefused("UnknownInterface", f"{self.path} has no interface {interface}")
        if name is None:
            return
        known = self._property(name)
        if not values:
            return
        if not known.flags & Gio.DBusPropertyInfoFlags.WRITABLE:
            raise CallRefused("PropertyReadOnly", f"{interface}.{name} is read-only")
        signature = signature_in_variant(values[0])
        if signature != known.signature:
            raise CallRefused(
                "InvalidArgs", f"{interface}.{name} is ({known.signature}), set to ({signature})"
            )

    def _property(self, name: str) -> Any:
        known = self.contract.lookup_property(name)
        if known is None:
            raise CallRefused("UnknownProperty", f"{self.path} has no property {self.contract.name}.{name}")
        return known
