"""Conversion between D-Bus values and plain Python ones."""

from __future__ import annotations

from typing import Any, Callable

import dbus

_BASIC: dict[str, Callable[[Any], Any]] = {
    "y": dbus.Byte,
    "b": dbus.Boolean,
    "n": dbus.Int16,
    "q": dbus.UInt16,
    "i": dbus.Int32,
    "u": dbus.UInt32,
    "x": dbus.Int64,
    "t": dbus.UInt64,
    "d": dbus.Double,
    "s": dbus.String,
    "o": dbus.ObjectPath,
    "g": dbus.Signature,
}


def typed(signature: str, value: Any) -> Any:
    """`value` as the D-Bus type of `signature`, a single complete type."""
    if signature in _BASIC:
        return _BASIC[signature](value)
    if signature.startswith("a{"):
        return dbus.Dictionary(value, signature=signature[2:-1])
    if signature.startswith("a"):
        return dbus.Array(value, signature=signature[1:])
    if signature.startswith("("):
        return dbus.Struct(value, signature=signature[1:-1])
    return value


def signature_in_variant(value: Any) -> str:
    """The type of a received variant's content."""
    return "v" if getattr(value, "variant_level", 0) > 1 else _signature(value)


def _signature(value: Any) -> str:
    if isinstance(value, dbus.Struct):
        return f"({''.join(_signature_of_item(item) for item in value)})"
    if isinstance(value, dbus.Dictionary):
        return f"a{{{value.signature}}}"
    if isinstance(value, dbus.Array):
        return f"a{value.signature}"
    return next(signature for signature, kind in _BASIC.items() if kind is type(value))


def _signature_of_item(item: Any) -> str:
    return "v" if getattr(item, "variant_level", 0) > 0 else _signature(item)


def plain(value: Any) -> Any:
    """A D-Bus value as bool, int, float, str, list, tuple or dict."""
    if isinstance(value, dbus.Boolean):
        return bool(value)
    if isinstance(value, dict):
        return {plain(key): plain(item) for key, item in value.items()}
    if isinstance(value, dbus.Struct):
        return tuple(plain(item) for item in value)
    if isinstance(value, list):
        return [plain(item) for item in value]
    for kind in (int, float, str):
        if isinstance(value, kind):
            return kind(value)
    return value
