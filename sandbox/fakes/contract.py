"""D-Bus contracts, read from the interfaces' XML files."""

from __future__ import annotations

from functools import cache
from typing import Any, Iterable

from gi.repository import Gio

from sandbox import REPOSITORY

_FOLDERS = (REPOSITORY / "contracts" / "dbus", REPOSITORY / "src" / "velk" / "dbus")


@cache
def load(interface: str) -> Gio.DBusInterfaceInfo:
    """Read the contract of an interface from the file named after it."""
    for folder in _FOLDERS:
        file = folder / f"{interface}.xml"
        if file.exists():
            known = Gio.DBusNodeInfo.new_for_xml(file.read_text()).lookup_interface(interface)
            assert known, f"{file} describes another interface"
            return known
    raise FileNotFoundError(f"no contract {interface}.xml in {', '.join(map(str, _FOLDERS))}")


def signature(arguments: Iterable[Any]) -> str:
    """The type of these arguments of a method or a signal."""
    return "".join(argument.signature for argument in arguments)
