"""The desktop's session manager."""

from __future__ import annotations

from sandbox.fakes.base import Fake
from sandbox.fakes.exported import ExportedObject

INTERFACE = "com.norix.SessionManager"


class SessionManager(Fake):
    """Owns com.norix.SessionManager on the session bus; unlocked at first."""

    name = "session_manager"
    bus_name = INTERFACE

    def exports(self) -> list[ExportedObject]:
        """The service's only object."""
        exported = ExportedObject("/com/norix/SessionManager", INTERFACE)
        exported.set("Locked", False)
        return [exported]

    def lock(self, locked: bool = True) -> None:
        """Lock or unlock the session."""
        self.set("Locked", locked)
