"""D-Bus contracts, read from the interfaces' XML files."""

from __future__ import annotations

from dataclasses import dataclass
from functools import cache
from pathlib import Path
from xml.etree import ElementTree

from sandbox import REPOSITORY


FOLDERS = (REPOSITORY / "contracts" / "dbus", REPOSITORY / "src" / "velk" / "dbus")


@dataclass(frozen=True)
class Method:
    """The signatures of a method's arguments and reply."""

    arguments: str
    reply: str


@dataclass(frozen=True)
class Property:
    """A property's type and access ("read", "write", "readwrite")."""

    signature: str
    access: str


@dataclass(frozen=True)
class Contract:
    """One interface; `xml` is its <interface> element."""

    name: str
    methods: dict[str, Method]
    signals: dict[str, str]
    properties: dict[str, Property]
    xml: str


@cache
def load(interface: str) -> Contract:
    """Read the contract of an interface from the file named after it."""
    element = ElementTree.parse(_file(interface)).getroot().find(f"interface[@name='{interface}']")
    assert element is not None, f"{interface}.xml describes another interface"
    return Contract(
        interface,
        {
            _name(method): Method(_signature(method, "in"), _signature(method, "out"))
            for method in element.iter("method")
        },
        {_name(signal): _signature(signal, "out") for signal in element.iter("signal")},
        {
            _name(prop): Property(prop.attrib["type"], prop.attrib["access"])
            for prop in element.iter("property")
        },
        ElementTree.tostring(element, encoding="unicode"),
    )


def _file(interface: str) -> Path:
    for folder in FOLDERS:
        path = folder / f"{interface}.xml"
        if path.exists():
            return path
    raise FileNotFoundError(f"no contract {interface}.xml in {', '.join(map(str, FOLDERS))}")


def _name(element: ElementTree.Element) -> str:
    return element.attrib["name"]


def _signature(element: ElementTree.Element, direction: str) -> str:
    default = "out" if element.tag == "signal" else "in"
    args = element.iter("arg")
    return "".join(arg.attrib["type"] for arg in args if arg.attrib.get("direction", default) == direction)
