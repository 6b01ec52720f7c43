"""The fake of the desktop's session manager."""

from __future__ import annotations

from sandbox.fakes.base import Fake


class SessionManager(Fake):
    """Owns com.norix.SessionManager on the session bus; unlocked at first."""

    name = "session_manager"
    bus_name = "com.norix.SessionManager"
    properties = {"Locked": False}

    def lock(self, locked: bool = True) -> None:
        """Lock or unlock the session."""
        self.set("Locked", locked)
