"""The fake of the desktop's notification service."""

from __future__ import annotations

from itertools import count

from sandbox.fakes.base import Fake
from sandbox.fakes.exported import ExportedObject


class Notifications(Fake):
    """Owns com.norix.kpx.Notification on the session bus; numbers the notifications from 1."""

    name = "notifications"
    bus_name = "com.norix.kpx.Notification"

    def exports(self) -> list[ExportedObject]:
        """The service's only object."""
        (main,) = super().exports()
        ids = count(1)
        main.handlers["Notify"] = lambda *_args: next(ids)
        return [main]
