"""The fake of the desktop's launcher, which lists the installed applications."""

from __future__ import annotations

from dataclasses import astuple, dataclass
from typing import Any

from sandbox.fakes.base import Fake
from sandbox.fakes.exported import ExportedObject

INTERFACE = "com.norix.kpx.daemon.Launcher"
PATH = "/com/norix/kpx/daemon/Launcher"


@dataclass(frozen=True)
class LauncherItem:
    """An installed application, its fields in the order of the wire: desktop file, display name, and details
    that the agent does not use."""

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

    def __init__(self, *surroundings: Any) -> None:
        super().__init__(*surroundings)
        self.items: list[LauncherItem] = []

    def exports(self) -> list[ExportedObject]:
        """The service's only object."""
        (main,) = super().exports()
        main.handlers["GetAllItemInfos"] = lambda: [astuple(item) for item in self.items]
        return [main]

    def install(self, item: LauncherItem) -> None:
        """Add an application to the list and announce it."""
        self.items.append(item)
        self.announce("created", item)

    def update(self, item: LauncherItem) -> None:
        """Replace the application with the same desktop file and announce it."""
        self.items = [item if known.path == item.path else known for known in self.items]
        self.announce("update", item)

    def remove(self, item: LauncherItem) -> None:
        """Remove an application from the list and announce that."""
        self.items.remove(item)
        self.announce("deleted", item)

    def announce(self, action: str, item: LauncherItem, category: int = 0) -> None:
        """Announce a change of an item if the service is on the bus; the list does not change."""
        if self.present:
            self.emit(INTERFACE, "ItemChanged", action, astuple(item), category)
