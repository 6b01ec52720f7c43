"""Conversion between D-Bus values and plain Python ones."""

from __future__ import annotations

from typing import Any

import dbus
from dbus.lowlevel import SignalMessage


def typed(signature: str, value: Any) -> Any:
    """`value` as the D-Bus type of `signature`, a single complete type."""
    message = SignalMessage("/", "com.norix.box", "Value")
    message.append(value, signature=signature)
    return message.get_args_list()[0]


def signature_of(value: Any) -> str:
    """The type of a D-Bus value."""
    return str(SignalMessage.guess_signature(value))


def signature_in_variant(value: Any) -> str:
    """The type of a received variant's content."""
    inner = {"signature": value.signature} if hasattr(value, "signature") else {}
    return signature_of(type(value)(value, variant_level=value.variant_level - 1, **inner))


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
