"""The desktop's notification service."""

from __future__ import annotations

from itertools import count

from sandbox.fakes.base import Fake
from sandbox.fakes.exported import ExportedObject

INTERFACE = "com.norix.kpx.Notification"


class Notifications(Fake):
    """Owns com.norix.kpx.Notification on the session bus; numbers the notifications from 1."""

    name = "notifications"
    bus_name = INTERFACE

    def exports(self) -> list[ExportedObject]:
        """The service's only object."""
        exported = ExportedObject("/com/norix/kpx/Notification", INTERFACE)
        ids = count(1)
        exported.handlers["Notify"] = lambda *_args: next(ids)
        return [exported]
