"""One object that a service exports: its interfaces, property values and method handlers."""

from __future__ import annotations

from dataclasses import dataclass
from typing import Any, Callable
from xml.sax.saxutils import quoteattr

from sandbox.peers import contract
from sandbox.peers.contract import Contract
from sandbox.peers.values import plain, typed

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


class Refused(Exception):
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

    def violation(self, interface: str, member: str, signature: str) -> str | None:
        """In what a call breaks the contract, None when it keeps to it."""
        expected = _STANDARD_METHODS.get((interface, member))
        if expected is None:
            methods = self.contracts[interface].methods if interface in self.contracts else {}
            if member not in methods:
                return f"{self.path} has no method {interface}.{member}"
            expected = methods[member].arguments
        if signature != expected:
            return f"{interface}.{member} takes ({expected}), called with ({signature})"
        return None

    def call(self, interface: str, member: str, args: tuple[Any, ...]) -> Reply:
        """Carry out a call that keeps to the contract; raises Refused."""
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
        interface, name, *rest = args
        found, known = self._property(name)
        if found.name != interface:
            raise Refused("UnknownProperty", f"no property {interface}.{name}")
        if member == "Get":
            return Reply("v", (self._values[name],))
        if "write" not in known.access:
            raise Refused("PropertyReadOnly", f"{interface}.{name} is read-only")
        self.set(name, rest[0])
        return Reply("", ())

    def _property(self, name: str) -> tuple[Contract, contract.Property]:
        for candidate in self.contracts.values():
            if name in candidate.properties:
                return candidate, candidate.properties[name]
        raise Refused("UnknownProperty", f"{self.path} has no property {name}")

    def _introspection(self) -> str:
        interfaces = "".join(known.xml for known in self.contracts.values())
        return f"<node name={quoteattr(self.path)}>{interfaces}</node>"
