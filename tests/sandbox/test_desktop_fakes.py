"""The dock and the launcher as a client of the session bus sees them."""

from __future__ import annotations

from typing import Any

import dbus
import pytest

from sandbox.bus.stranger import Stranger
from sandbox.fakes import dock, launcher
from sandbox.fakes.dock import Announcement
from sandbox.fakes.launcher import LauncherItem
from sandbox.terminal import Terminal

PROPERTIES = "org.freedesktop.DBus.Properties"
EDITOR = LauncherItem("/usr/share/applications/editor.desktop", "编辑器", "a", "b", 3, 1 << 40)


@pytest.fixture
def editor(terminal: Terminal) -> str:
    """An application with a window; the path of its entry on the dock."""
    return terminal.dock.open_app("editor", "Editor")


def of_dock(on_session: Stranger, name: str) -> Any:
    """A property of the dock."""
    return on_session.call(dock.INTERFACE, dock.PATH, PROPERTIES, "Get", dock.INTERFACE, name, signature="ss")


def of_entry(on_session: Stranger, path: str, name: str) -> Any:
    """A property of one of the dock's entries."""
    return on_session.call(dock.INTERFACE, path, PROPERTIES, "Get", dock.ENTRY, name, signature="ss")


def signals(terminal: Terminal, after: int) -> list[tuple[Any, ...]]:
    """Members and arguments of the signals since a mark."""
    return [(event.member, *event.args) for event in terminal.events.all(kind="signal", after=after)]


def test_a_dock_has_no_entries_at_first(on_session: Stranger) -> None:
    assert of_dock(on_session, "Entries") == []


def test_an_open_application_is_an_entry_of_its_own(terminal: Terminal, on_session: Stranger) -> None:
    path = terminal.dock.open_app("editor", "编辑器", docked=True, windows=2)

    assert of_dock(on_session, "Entries") == [path]
    properties = {name: of_entry(on_session, path, name) for name in ("Id", "Name", "IsDocked")}
    assert properties == {"Id": "editor", "Name": "编辑器", "IsDocked": True}
    assert len(of_entry(on_session, path, "WindowInfos")) == 2


def test_entries_are_announced_with_their_place_and_keep_their_order(
    terminal: Terminal, on_session: Stranger
) -> None:
    mark = terminal.events.mark()

    paths = [terminal.dock.open_app(app, app) for app in ("a", "b", "c")]
    terminal.dock.close_app("b")

    assert signals(terminal, mark) == [
        ("EntryAdded", paths[0], 0),
        ("EntryAdded", paths[1], 1),
        ("EntryAdded", paths[2], 2),
        ("EntryRemoved", "b"),
    ]
    assert of_dock(on_session, "Entries") == [paths[0], paths[2]]


def test_an_entry_that_has_gone_is_no_object_but_asking_for_it_no_mistake(
    terminal: Terminal, on_session: Stranger, editor: str
) -> None:
    terminal.dock.close_app("editor")

    with pytest.raises(dbus.DBusException) as raised:
        of_entry(on_session, editor, "Id")

    assert raised.value.get_dbus_name() == "org.freedesktop.DBus.Error.UnknownObject"
    assert terminal.violations() == []


@pytest.mark.parametrize(
    ("announces", "members"),
    [
        (["values"], ["PropertiesChanged"]),
        (["invalidated"], ["PropertiesChanged"]),
        (["signal"], ["WindowInfosChanged"]),
        (["signal", "values"], ["WindowInfosChanged", "PropertiesChanged"]),
        ([], []),
    ],
    ids=str,
)
def test_a_change_is_announced_in_the_ways_that_the_dock_knows(
    terminal: Terminal, on_session: Stranger, editor: str, announces: list[Announcement], members: list[str]
) -> None:
    terminal.dock.announces = tuple(announces)
    mark = terminal.events.mark()

    terminal.dock.set_windows("editor", 3)

    assert [member for member, *_ in signals(terminal, mark)] == members
    assert len(of_entry(on_session, editor, "WindowInfos")) == 3


@pytest.mark.parametrize(
    ("way", "announced"),
    [
        ("invalidated", [("PropertiesChanged", dock.ENTRY, {}, [name]) for name in ("Name", "IsDocked")]),
        ("signal", [("NameChanged", "Text")]),
    ],
    ids=["names without values", "no signal for being kept on the dock"],
)
def test_other_changes_are_announced_by_their_names_or_by_a_signal_of_their_own(
    terminal: Terminal, on_session: Stranger, editor: str, way: Announcement, announced: list[Any]
) -> None:
    terminal.dock.announces = (way,)
    mark = terminal.events.mark()

    terminal.dock.rename("editor", "Text")
    terminal.dock.pin("editor")

    assert signals(terminal, mark) == announced
    assert [of_entry(on_session, editor, name) for name in ("Name", "IsDocked")] == ["Text", True]


@pytest.mark.parametrize("window_type", dock.WINDOW_TYPES)
def test_windows_are_of_the_type_that_the_dock_knows(terminal: Terminal, window_type: str) -> None:
    terminal.dock.window_type = window_type
    terminal.dock.open_app("editor", "Editor")
    terminal.dock.announces = ("values", "signal")
    mark = terminal.events.mark()

    for number in (2, 0):
        terminal.dock.set_windows("editor", number)

    signals = terminal.events.all(kind="signal", member="WindowInfosChanged", after=mark)
    assert [signal.detail["signature"] for signal in signals] == [window_type] * 2
    assert [len(signal.args[0]) for signal in signals] == [2, 0]


def test_other_windows_are_other_identifiers(terminal: Terminal, on_session: Stranger, editor: str) -> None:
    before = of_entry(on_session, editor, "WindowInfos")

    terminal.dock.set_windows("editor", 1)

    assert set(before).isdisjoint(of_entry(on_session, editor, "WindowInfos"))


def test_what_happens_on_an_absent_dock_is_there_when_it_appears() -> None:
    with Terminal(absent=("dock",)) as terminal:
        path = terminal.dock.open_app("editor", "Editor")
        terminal.dock.set_windows("editor", 2)
        terminal.dock.open_app("mail", "Mail")
        terminal.dock.close_app("mail")
        silent = terminal.events.all(kind="signal")

        terminal.dock.appear()

        client = Stranger(terminal.session_bus)
        assert (silent, of_dock(client, "Entries")) == ([], [path])
        client.close()


def test_a_launcher_lists_its_items(terminal: Terminal, on_session: Stranger) -> None:
    terminal.launcher.items = [EDITOR]

    items = on_session.call(launcher.INTERFACE, launcher.PATH, launcher.INTERFACE, "GetAllItemInfos")

    assert items == [("/usr/share/applications/editor.desktop", "编辑器", "a", "b", 3, 1 << 40)]


def test_a_launcher_announces_each_change_with_the_exact_signature(terminal: Terminal) -> None:
    newer = LauncherItem(EDITOR.path, "Editor 2")
    mark = terminal.events.mark()

    terminal.launcher.install(EDITOR)
    terminal.launcher.update(newer)
    terminal.launcher.remove(newer)
    terminal.launcher.announce("moved", EDITOR, category=7)

    announced = terminal.events.all(member="ItemChanged", after=mark)
    assert [(change.args[0], change.args[1][1], change.args[2]) for change in announced] == [
        ("created", "编辑器", 0),
        ("update", "Editor 2", 0),
        ("deleted", "Editor 2", 0),
        ("moved", "编辑器", 7),
    ]
    assert {change.detail["signature"] for change in announced} == {"s(ssssxx)x"}
    assert terminal.launcher.items == []


def test_an_update_keeps_the_other_items(terminal: Terminal) -> None:
    mail = LauncherItem("/mail.desktop", "Mail")
    terminal.launcher.items = [EDITOR, mail]

    terminal.launcher.update(LauncherItem(EDITOR.path, "Editor 2"))

    assert [item.name for item in terminal.launcher.items] == ["Editor 2", "Mail"]
