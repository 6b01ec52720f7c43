"""The desktop's restriction switches in the user's file."""

from __future__ import annotations

from configparser import ConfigParser
from pathlib import Path

from sandbox.terminal import Terminal

FILE = Path(".config/norix/desktop-control.ini")


def look_at_switches(terminal: Terminal) -> None:
    """Record each switch of the file, if it exists, as an event of kind "file"."""
    parser = ConfigParser(interpolation=None)
    parser.optionxform = str  # type: ignore[assignment]  # keys are case-sensitive
    parser.read(Path(terminal.user.home, FILE), encoding="utf-8")
    for name, value in parser["restrictions"].items() if parser.has_section("restrictions") else ():
        terminal.events.record("velks", "switches", "file", name, (value,))
