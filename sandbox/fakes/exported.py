"""One object that a service exports: its interfaces, property values and method handlers."""

from __future__ import annotations

from dataclasses import dataclass
from typing import Any, Callable, Sequence
from xml.sax.saxutils import quoteattr

from sandbox.bus.values import plain, signature_in_variant, typed
from sandbox.fakes import contract
from sandbox.fakes.contract import Contract

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
    """The call gets a D-Bus error; `error_name` is the full name of it."""

    def __init__(self, error_name: str, text: str) -> None:
        super().__init__(text)
        self.error_name = _ERROR + error_name


@dataclass(frozen=True)
class Reply:
    """Values and signature of a method's reply."""

    signature: str
    values: tuple[Any, ...]


class ExportedObject:
    """Dispatches calls by the contracts of its interfaces.

    `handlers` maps a method to what it does: a function of the plain arguments that returns the reply's only
    value, or None where the method has no reply value.
    """

    def __init__(self, path: str, *interfaces: str) -> None:
        self.path = path
        self.contracts: dict[str, Contract] = {name: contract.load(name) for name in interfaces}
        self.handlers: dict[str, Handler] = {}
        self._values: dict[str, Any] = {}

    def value(self, name: str) -> Any:
        """Plain value of a property."""
        return plain(self._values[name])

    def set(self, name: str, value: Any, signature: str | None = None) -> None:
        """Change a property; with `signature`, to a value of another type than its contract's."""
        _, known = self._property(name)
        self._values[name] = typed(signature or known.signature, value)

    def interface_of(self, name: str) -> str:
        """The interface that a property belongs to."""
        return self._property(name)[0].name

    def typed_value(self, name: str) -> Any:
        """Value of a property as it goes out on the bus."""
        return self._values[name]

    def check(self, interface: str, member: str, signature: str, args: Sequence[Any]) -> None:
        """CallRefused if a call, with its arguments as they came, breaks the contract."""
        expected = _STANDARD_METHODS.get((interface, member))
        if expected is None:
            methods = self.contracts[interface].methods if interface in self.contracts else {}
            if member not in methods:
                raise CallRefused("UnknownMethod", f"{self.path} has no method {interface}.{member}")
            expected = methods[member].arguments
        if signature != expected:
            raise CallRefused(
                "InvalidArgs", f"{interface}.{member} takes ({expected}), called with ({signature})"
            )
        if interface == PROPERTIES:
            self._check_property_call(*args)

    def call(self, interface: str, member: str, args: tuple[Any, ...]) -> Reply:
        """Carry out a call that keeps to the contract."""
        if interface == INTROSPECTABLE:
            return Reply("s", (self._introspection(),))
        if interface == PROPERTIES:
            return self._property_call(member, args)
        signature = self.contracts[interface].methods[member].reply
        result = self.handlers[member](*args) if member in self.handlers else None
        return Reply(signature, (result,) if signature else ())

    def _property_call(self, member: str, args: tuple[Any, ...]) -> Reply:
        if member == "GetAll":
            values = {
                name: value for name, value in self._values.items() if self.interface_of(name) == args[0]
            }
            return Reply("a{sv}", (values,))
        _, name, *rest = args
        if member == "Get":
            return Reply("v", (self._values[name],))
        self.set(name, rest[0])
        return Reply("", ())

    def _check_property_call(self, interface: str, name: str | None = None, *values: Any) -> None:
        if interface not in self.contracts:
            raise CallRefused("UnknownInterface", f"{self.path} has no interface {interface}")
        if name is None:
            return
        known = self.contracts[interface].properties.get(name)
        if known is None:
            raise CallRefused("UnknownProperty", f"{self.path} has no property {interface}.{name}")
        if values:
            self._check_change(f"{interface}.{name}", known, signature_in_variant(values[0]))

    def _check_change(self, name: str, known: contract.Property, signature: str) -> None:
        if "write" not in known.access:
            raise CallRefused("PropertyReadOnly", f"{name} is read-only")
        if signature != known.signature:
            raise CallRefused("InvalidArgs", f"{name} is ({known.signature}), set to ({signature})")

    def _property(self, name: str) -> tuple[Contract, contract.Property]:
        for candidate in self.contracts.values():
            if name in candidate.properties:
                return candidate, candidate.properties[name]
        raise CallRefused("UnknownProperty", f"{self.path} has no property {name}")

    def _introspection(self) -> str:
        interfaces = "".join(known.xml for known in self.contracts.values())
        return f"<node name={quoteattr(self.path)}>{interfaces}</node>"
