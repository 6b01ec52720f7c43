"""The fake of the desktop's screen saver."""

from __future__ import annotations

from sandbox.fakes.base import Fake


class ScreenSaver(Fake):
    """Owns com.norix.ScreenSaver on the session bus; not running at first."""

    name = "screensaver"
    bus_name = "com.norix.ScreenSaver"
    properties = {"isRunning": False}

    def run(self, running: bool = True) -> None:
        """Start or end the screen saver."""
        self.set("isRunning", running)
