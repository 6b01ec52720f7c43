"""The fake of the desktop's dock, which lists the applications that run or are pinned."""

from __future__ import annotations

from itertools import count
from typing import Any, Callable, Literal

from sandbox.bus.mainloop import on_main_loop
from sandbox.bus.values import signature_of
from sandbox.fakes.base import Fake
from sandbox.fakes.exported import ExportedObject

INTERFACE = "com.norix.kpx.daemon.Dock"
ENTRY = "com.norix.kpx.daemon.Dock.Entry"
PATH = "/com/norix/kpx/daemon/Dock"
ENTRIES = f"{PATH}/entries"

Announcement = Literal["values", "invalidated", "signal"]

# What docks of different versions store for a window, by the type of WindowInfos.
WINDOW_TYPES: dict[str, Callable[[str], Any]] = {
    "a{uv}": lambda title: title,
    "a{us}": lambda title: title,
    "a{u(sb)}": lambda title: (title, False),
    "a{ua{sv}}": lambda title: {"Title": title},
}
_CHANGE_SIGNALS = {"WindowInfos": "WindowInfosChanged", "Name": "NameChanged"}


class Dock(Fake):
    """Owns com.norix.kpx.daemon.Dock on the session bus; empty at first.

    `announces` lists the ways in which it announces a change of an entry, in order: PropertiesChanged with
    values or with invalidated names, or the entry's own signal. `window_type`, one of WINDOW_TYPES, applies
    to windows set from then on. The objects of removed entries do not exist for callers.
    """

    name = "dock"
    bus_name = INTERFACE
    properties = {"Entries": []}

    def __init__(self, *surroundings: Any) -> None:
        super().__init__(*surroundings)
        self.announces: tuple[Announcement, ...] = ("values",)
        self.window_type = "a{uv}"
        self._paths = (f"{ENTRIES}/e{number}" for number in count(1))
        self._window_ids = count(1)

    @property
    def apps(self) -> dict[str, str]:
        """The paths of the entries by identifier, in the dock's order; of two with the same identifier, the
        newer one."""
        return {self.value("Id", path): path for path in self.value("Entries")}

    @on_main_loop
    def open_app(self, app: str, name: str, docked: bool = False, windows: int = 1) -> str:
        """Add and announce an entry for an application; returns its object path."""
        entry = ExportedObject(next(self._paths), ENTRY)
        entry.set("Id", app)
        entry.set("Name", name)
        entry.set("IsDocked", docked)
        entry.set("WindowInfos", self._new_windows(windows), self.window_type)
        self.objects[entry.path] = entry
        paths = self._change_entries(lambda known: [*known, entry.path])
        if self.present:
            self.emit(INTERFACE, "EntryAdded", entry.path, len(paths) - 1)
        return entry.path

    @on_main_loop
    def close_app(self, app: str) -> None:
        """Remove an application's entry, with any windows that it has, and announce that."""
        gone = self.apps[app]
        self._change_entries(lambda known: [path for path in known if path != gone])
        self.withdrawn.add(gone)
        if self.present:
            self.emit(INTERFACE, "EntryRemoved", app)

    def set_windows(self, app: str, number: int) -> None:
        """Replace an application's windows by this many new ones."""
        self.set("WindowInfos", self._new_windows(number), self.window_type, self.apps[app])

    def windows(self, app: str) -> int:
        """The number of an application's windows."""
        return len(self.value("WindowInfos", self.apps[app]))

    def rename(self, app: str, name: str) -> None:
        """Change an application's display name."""
        self.set("Name", name, path=self.apps[app])

    def pin(self, app: str, docked: bool = True) -> None:
        """Pin an application to the dock, or unpin it."""
        self.set("IsDocked", docked, path=self.apps[app])

    def is_docked(self, app: str) -> bool:
        """Whether an application is pinned to the dock."""
        return bool(self.value("IsDocked", self.apps[app]))

    def _change_entries(self, change: Callable[[list[str]], list[str]]) -> list[str]:
        main = self.objects[PATH]
        paths = change(main.value("Entries"))
        main.set("Entries", paths)
        return paths

    def _new_windows(self, number: int) -> dict[int, Any]:
        describe = WINDOW_TYPES[self.window_type]
        fresh = [next(self._window_ids) for _ in range(number)]
        return {window: describe(f"window {window}") for window in fresh}

    def _announce(self, known: ExportedObject, name: str) -> None:
        for way in self.announces:
            if way == "values":
                self._announce_properties(known, {name: known.typed_value(name)}, [])
            elif way == "invalidated":
                self._announce_properties(known, {}, [name])
            elif name in _CHANGE_SIGNALS:
                value = known.typed_value(name)
                self._emit(known.path, ENTRY, _CHANGE_SIGNALS[name], signature_of(value), (value,))
