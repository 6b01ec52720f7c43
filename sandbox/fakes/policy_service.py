"""The fake of the session policy service, which carries out forwarded policies."""

from __future__ import annotations

from sandbox.fakes.base import Fake


class PolicyService(Fake):
    """Owns com.norix.velk.prys on the session bus."""

    name = "policy_service"
    bus_name = "com.norix.velk.prys"
