"""The login manager, as far as a session agent uses it."""

from __future__ import annotations

from sandbox.fakes.base import Fake
from sandbox.fakes.exported import ExportedObject
from sandbox.machine.users import current_user

MANAGER = "/org/freedesktop/login1"
USER = "/org/freedesktop/login1/user/self"
SESSION = "/org/freedesktop/login1/session/auto"


class Logind(Fake):
    """Owns org.freedesktop.login1 on the system bus; a reboot or log-out is recorded and nothing else."""

    name = "logind"
    bus_name = "org.freedesktop.login1"
    bus_kind = "system"

    def exports(self) -> list[ExportedObject]:
        """The manager, the caller's user object and the caller's session."""
        user = current_user()
        caller = ExportedObject(USER, "org.freedesktop.login1.User")
        caller.set("Name", user.name)
        caller.set("UID", user.uid)
        manager = ExportedObject(MANAGER, "org.freedesktop.login1.Manager")
        manager.handlers["CanReboot"] = lambda: "yes"
        session = ExportedObject(SESSION, "org.freedesktop.login1.Session")
        return [manager, caller, session]

    def rename(self, name: str) -> None:
        """Change the user's name."""
        self.set("Name", name, path=USER)

    def forget_user(self) -> None:
        """Have no user object for the caller."""
        self.withdrawn.add(USER)
