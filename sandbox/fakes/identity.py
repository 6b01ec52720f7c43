"""The fake of the identity service, which the agent switches off when the terminal leaves the domain."""

from __future__ import annotations

from sandbox.fakes.base import Fake


class IdentityService(Fake):
    """Owns com.norix.velk.iam on the system bus."""

    name = "identity"
    bus_name = "com.norix.velk.iam"
    bus_kind = "system"
    properties = {"Enable": True}
