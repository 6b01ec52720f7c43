"""The session policy service, which carries out the policies that the agent forwards."""

from __future__ import annotations

from sandbox.fakes.base import Fake
from sandbox.fakes.exported import ExportedObject

INTERFACE = "com.norix.velk.prys"


class PolicyService(Fake):
    """Owns com.norix.velk.prys on the session bus."""

    name = "policy_service"
    bus_name = INTERFACE

    def exports(self) -> list[ExportedObject]:
        """The service's only object."""
        return [ExportedObject("/com/norix/velk/prys", INTERFACE)]
