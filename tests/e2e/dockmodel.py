"""What the agent must report of any history of the dock, as a plain model, and random histories."""

from __future__ import annotations

from dataclasses import dataclass, field
from functools import partial
from typing import Callable, Literal

from hypothesis import strategies

from sandbox.fakes import dock
from sandbox.fakes.dock import Dock
from tests.e2e.dockwatch import CLOSED, OPENED

APPS = ("editor", "mail", "files")
NAMES = ("Mail", "Post", "邮件", "")
MOST_WINDOWS = 3


@dataclass(frozen=True)
class Act:
    """Something that happens to an application; those that cannot happen to it at the moment do not."""

    kind: Literal["open", "close", "set windows", "rename", "announce again"]
    app: str
    name: str
    docked: bool
    windows: int


def acts() -> strategies.SearchStrategy[Act]:
    """Any act."""
    return strategies.builds(
        Act,
        kind=strategies.sampled_from(("set windows", "open", "close", "rename", "announce again")),
        app=strategies.sampled_from(APPS),
        name=strategies.sampled_from(NAMES),
        docked=strategies.booleans(),
        windows=strategies.integers(0, MOST_WINDOWS),
    )


@dataclass
class _Known:
    """What the agent knows of an entry."""

    path: str
    name: str
    windows: int


@dataclass
class DockModel:
    """Carries acts out on a dock and says which events each stretch of them must bring.

    A stretch is what the dock does before the agent comes to handle it. An entry that was added is read when
    the agent comes to its addition, at the end of the stretch: what the dock announced of it until then is in
    the reading and no news. An entry that has gone by then cannot be read: it counts as open, without a name
    or an identifier, so its removal is not reported.
    """

    dock: Dock
    _known: dict[str, _Known] = field(default_factory=dict)
    _steps: list[Callable[[], list[tuple[int, str]]]] = field(default_factory=list)
    _read_now: set[str] = field(default_factory=set)
    added: set[str] = field(default_factory=set)

    def do(self, act: Act) -> None:
        """Carry out an act, if it is possible."""
        is_open = act.app in self.dock.apps
        if act.kind == "open" and not is_open:
            path = self.dock.open_app(act.app, act.name, act.docked, act.windows)
            self._add(act.app, path)
        elif act.kind == "announce again" and is_open:
            path = self.dock.apps[act.app]
            self.dock.emit(dock.INTERFACE, "EntryAdded", path, 0)
            self._add(act.app, path)
        elif act.kind == "close" and is_open:
            self.dock.close_app(act.app)
            self._steps.append(partial(self._removed, act.app))
        elif act.kind == "set windows" and is_open:
            path = self.dock.apps[act.app]
            self.dock.set_windows(act.app, act.windows)
            self._steps.append(partial(self._counted, path, act.windows))
        elif act.kind == "rename" and is_open:
            path = self.dock.apps[act.app]
            self.dock.rename(act.app, act.name)
            self._steps.append(partial(self._renamed, path, act.name))

    def start(self) -> list[tuple[int, str]]:
        """The agent starts and reads what is on the dock now: the events that this must bring."""
        self._steps.clear()
        self._known.clear()
        self._steps += [partial(self._added, path) for path in self.dock.value("Entries")]
        return self.end_stretch()

    def end_stretch(self) -> list[tuple[int, str]]:
        """The agent has handled all that happened: the events that this must have brought."""
        events = [event for step in self._steps for event in step()]
        self._steps.clear()
        self._read_now.clear()
        self.added.clear()
        return events

    def _add(self, app: str, path: str) -> None:
        self.added.add(app)
        self._steps.append(partial(self._added, path))

    def _added(self, path: str) -> list[tuple[int, str]]:
        if path in self.dock.withdrawn:
            return [(OPENED, "")]
        self._read_now.add(path)
        read = self.dock.objects[path]
        name = str(read.value("Name"))
        self._known[str(read.value("Id"))] = _Known(path, name, len(read.value("WindowInfos")))
        return [] if read.value("IsDocked") else [(OPENED, name)]

    def _removed(self, app: str) -> list[tuple[int, str]]:
        gone = self._known.pop(app, None)
        return [(CLOSED, gone.name)] if gone and gone.windows else []

    def _counted(self, path: str, windows: int) -> list[tuple[int, str]]:
        entry = self._entry_known_by_now(path)
        if entry is None or windows == entry.windows:
            return []
        kind = OPENED if windows > entry.windows else CLOSED
        entry.windows = windows
        return [(kind, entry.name)]

    def _renamed(self, path: str, name: str) -> list[tuple[int, str]]:
        entry = self._entry_known_by_now(path)
        if entry and name:
            entry.name = name
        return []

    def _entry_known_by_now(self, path: str) -> _Known | None:
        """The entry whose announcement must be reported; None for one that is unknown or being read."""
        if path in self._read_now:
            return None
        return next((entry for entry in self._known.values() if entry.path == path), None)
