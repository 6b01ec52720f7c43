"""The desktop's launcher, which lists the installed applications."""

from __future__ import annotations

from dataclasses import astuple, dataclass

from sandbox.bus.buses import Bus
from sandbox.bus.senders import Senders
from sandbox.events import Events
from sandbox.fakes.base import Fake
from sandbox.fakes.exported import ExportedObject

INTERFACE = "com.norix.kpx.daemon.Launcher"
PATH = "/com/norix/kpx/daemon/Launcher"


@dataclass(frozen=True)
class LauncherItem:
    """An installed application, in the order of its fields on the wire: its desktop file, its display name
    and what else the launcher knows of it."""

    path: str
    name: str
    first_detail: str = ""
    second_detail: str = ""
    first_number: int = 0
    second_number: int = 0


class Launcher(Fake):
    """Owns com.norix.kpx.daemon.Launcher on the session bus; `items` is what it lists, nothing at first."""

    name = "launcher"
    bus_name = INTERFACE

    def __init__(self, bus: Bus, events: Events, senders: Senders) -> None:
        super().__init__(bus, events, senders)
        self.items: list[LauncherItem] = []

    def exports(self) -> list[ExportedObject]:
        """The service's only object."""
        exported = ExportedObject(PATH, INTERFACE)
        exported.handlers["GetAllItemInfos"] = lambda: [astuple(item) for item in self.items]
        return [exported]

    def install(self, item: LauncherItem) -> None:
        """List a new application and tell so."""
        self.items.append(item)
        self.announce("created", item)

    def update(self, item: LauncherItem) -> None:
        """Replace the application with the same desktop file and tell so."""
        self.items = [item if known.path == item.path else known for known in self.items]
        self.announce("update", item)

    def remove(self, item: LauncherItem) -> None:
        """List an application no longer and tell so."""
        self.items.remove(item)
        self.announce("deleted", item)

    def announce(self, action: str, item: LauncherItem, category: int = 0) -> None:
        """Broadcast a change of an item, if the service is there; the list stays as it is."""
        if self.present:
            self.emit(INTERFACE, "ItemChanged", action, astuple(item), category)
