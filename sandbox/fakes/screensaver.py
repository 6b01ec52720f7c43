"""The desktop's screen saver."""

from __future__ import annotations

from sandbox.fakes.base import Fake
from sandbox.fakes.exported import ExportedObject

INTERFACE = "com.norix.ScreenSaver"


class ScreenSaver(Fake):
    """Owns com.norix.ScreenSaver on the session bus; not running at first."""

    name = "screensaver"
    bus_name = INTERFACE

    def exports(self) -> list[ExportedObject]:
        """The service's only object."""
        exported = ExportedObject("/com/norix/ScreenSaver", INTERFACE)
        exported.set("isRunning", False)
        return [exported]

    def run(self, running: bool = True) -> None:
        """Start or end the screen saver."""
        self.set("isRunning", running)
