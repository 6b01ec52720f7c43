"""The fake of the login manager, with the parts that the agent uses."""

from __future__ import annotations

from sandbox.fakes.base import Fake
from sandbox.fakes.exported import ExportedObject
from sandbox.machine.users import current_user

MANAGER = "/org/freedesktop/login1"
USER = "/org/freedesktop/login1/user/self"
SESSION = "/org/freedesktop/login1/session/auto"
DISPLAY = "/org/freedesktop/login1/session/c1"


class Logind(Fake):
    """Owns org.freedesktop.login1 on the system bus; only records a reboot or log-out."""

    name = "logind"
    bus_name = "org.freedesktop.login1"
    bus_kind = "system"

    def exports(self) -> list[ExportedObject]:
        """The manager, the caller's user object, and the caller's session by its two paths."""
        user = current_user()
        caller = ExportedObject(USER, "org.freedesktop.login1.User")
        caller.set("Name", user.name)
        caller.set("UID", user.uid)
        caller.set("Display", ("c1", DISPLAY))
        manager = ExportedObject(MANAGER, "org.freedesktop.login1.Manager")
        manager.handlers["CanReboot"] = lambda: "yes"
        session = ExportedObject(SESSION, "org.freedesktop.login1.Session")
        display = ExportedObject(DISPLAY, "org.freedesktop.login1.Session")
        for name, value in {"Type": "wayland", "Class": "user", "Active": True}.items():
            display.set(name, value)
        return [manager, caller, session, display]

    def rename(self, name: str) -> None:
        """Change the user's name."""
        self.set("Name", name, path=USER)

    def forget_user(self) -> None:
        """Withdraw the caller's user object."""
        self.withdrawn.add(USER)
