"""The identity service, which is switched off when the terminal leaves the domain."""

from __future__ import annotations

from sandbox.fakes.base import Fake
from sandbox.fakes.exported import ExportedObject

INTERFACE = "com.norix.velk.iam"


class IdentityService(Fake):
    """Owns com.norix.velk.iam on the system bus."""

    name = "identity"
    bus_name = INTERFACE
    bus_kind = "system"

    def exports(self) -> list[ExportedObject]:
        """The service's only object."""
        exported = ExportedObject("/com/norix/velk/iam", INTERFACE)
        exported.set("Enable", True)
        return [exported]
