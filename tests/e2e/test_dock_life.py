"""A dock that comes late, goes and comes back, and strangers that send its signals."""

from __future__ import annotations

from sandbox.bus.stranger import Stranger
from sandbox.fakes import dock
from sandbox.fakes.exported import PROPERTIES
from sandbox.terminal import Terminal
from tests.e2e.dockwatch import CLOSED, OPENED, follows, scans, settle, start, reported, warnings
from tests.e2e.strangers import let_reach_the_bus, receivers, straight_or_not
from tests.e2e.wire import asked_of_the_session_bus, carries_out_policies

WAITING = "dock service is not registered, wait.."


def start_without_dock(terminal: Terminal) -> None:
    """The agent misses the dock at its start."""
    terminal.dock.leave()
    terminal.start_agent()
    terminal.events.wait_for(kind="log", member="warning", args=(WAITING,))


def appear(terminal: Terminal) -> None:
    """The dock appears, and the agent has read it."""
    mark = terminal.events.mark()
    terminal.dock.appear()
    terminal.events.wait_for(
        lambda event: event.args[0].startswith("dock entry size:"), kind="log", after=mark
    )
    settle(terminal)


def test_an_absent_dock_is_warned_of_once_and_nothing_is_reported(terminal: Terminal) -> None:
    terminal.dock.open_app("a", "A")

    start_without_dock(terminal)
    carries_out_policies(terminal)
    terminal.sync()

    assert (reported(terminal), scans(terminal), warnings(terminal)) == ([], [], [WAITING])


def test_a_late_dock_is_waited_for_without_asking(terminal: Terminal) -> None:
    start_without_dock(terminal)

    assert asked_of_the_session_bus(terminal, lambda: terminal.advance(3600)) == []


def test_a_late_dock_is_read_whole_and_then_followed(terminal: Terminal) -> None:
    start_without_dock(terminal)
    for app, docked in (("b", False), ("a", True), ("c", False)):
        terminal.dock.open_app(app, app.upper(), docked=docked)

    appear(terminal)

    assert (reported(terminal), scans(terminal)) == ([(OPENED, "B"), (OPENED, "C")], ["dock entry size: 3"])
    events = follows(
        terminal,
        lambda: terminal.dock.open_app("d", "D"),
        lambda: terminal.dock.set_windows("a", 0),
        lambda: terminal.dock.close_app("b"),
    )
    assert events == [(OPENED, "D"), (CLOSED, "A"), (CLOSED, "B")]


def test_a_late_dock_that_comes_back_is_not_read_again(terminal: Terminal) -> None:
    start_without_dock(terminal)
    terminal.dock.open_app("a", "A")
    appear(terminal)
    mark = terminal.events.mark()

    terminal.dock.restart()
    settle(terminal)

    assert (reported(terminal, mark), scans(terminal, mark), warnings(terminal, mark)) == ([], [], [])


def test_a_dock_that_goes_and_comes_back_is_not_read_again_but_still_followed(terminal: Terminal) -> None:
    terminal.dock.open_app("a", "A")
    start(terminal)
    mark = terminal.events.mark()

    terminal.dock.leave()
    terminal.dock.open_app("missed", "Missed")
    terminal.dock.appear()
    settle(terminal)

    assert (reported(terminal, mark), scans(terminal, mark), warnings(terminal, mark)) == ([], [], [])
    events = follows(
        terminal, lambda: terminal.dock.open_app("b", "B"), lambda: terminal.dock.set_windows("a", 2)
    )
    assert events == [(OPENED, "B"), (OPENED, "A")]


@straight_or_not
def test_a_stranger_that_speaks_like_the_dock_is_ignored(
    terminal: Terminal, on_session: Stranger, straight: bool
) -> None:
    path = terminal.dock.open_app("mail", "Mail")
    start(terminal)
    mark = terminal.events.mark()

    for receiver in receivers(terminal, terminal.session_bus, straight):
        for place, interface, member, signature, args in (
            (path, dock.ENTRY, "NameChanged", "s", ("Spoof",)),
            (path, dock.ENTRY, "WindowInfosChanged", "a{us}", ({},)),
            (path, PROPERTIES, "PropertiesChanged", "sa{sv}as", (dock.ENTRY, {"Name": "Spoof"}, [])),
            (path, PROPERTIES, "PropertiesChanged", "sa{sv}as", (dock.ENTRY, {}, ["WindowInfos"])),
            (dock.PATH, dock.INTERFACE, "EntryAdded", "oi", (path, 0)),
            (dock.PATH, dock.INTERFACE, "EntryRemoved", "s", ("mail",)),
        ):
            on_session.emit(place, interface, member, *args, signature=signature, destination=receiver)
    let_reach_the_bus(on_session)
    settle(terminal)

    assert (reported(terminal, mark), warnings(terminal, mark)) == ([], [])
    assert terminal.events.all(source="velks", target="dock", after=mark) == []
    assert follows(terminal, lambda: terminal.dock.close_app("mail")) == [(CLOSED, "Mail")]


def test_a_stranger_is_ignored_while_the_dock_is_awaited(terminal: Terminal, on_session: Stranger) -> None:
    path = terminal.dock.open_app("mail", "Mail")
    start_without_dock(terminal)

    on_session.emit(dock.PATH, dock.INTERFACE, "EntryAdded", path, 0, signature="oi")
    let_reach_the_bus(on_session)
    appear(terminal)

    assert (reported(terminal), warnings(terminal)) == ([(OPENED, "Mail")], [WAITING])


def test_signals_of_another_form_do_nothing(terminal: Terminal, on_session: Stranger) -> None:
    path = terminal.dock.open_app("mail", "Mail")
    start(terminal)
    mark = terminal.events.mark()

    terminal.dock.leave()
    assert on_session.own(dock.INTERFACE) == 1
    for place, interface, member, signature, args in (
        (dock.PATH, dock.INTERFACE, "EntryAdded", "", ()),
        (dock.PATH, dock.INTERFACE, "EntryAdded", "si", (path, 0)),
        (dock.PATH, dock.INTERFACE, "EntryRemoved", "as", (["mail"],)),
        (dock.PATH, dock.ENTRY, "EntryRemoved", "s", ("mail",)),
        (path, dock.ENTRY, "NameChanged", "", ()),
        (path, dock.ENTRY, "WindowInfosChanged", "", ()),
        (path, dock.ENTRY, "Changed", "s", ("Other",)),
        (path, PROPERTIES, "PropertiesChanged", "s", (dock.ENTRY,)),
        (path, PROPERTIES, "PropertiesChanged", "sa{sv}as", ("com.norix.Other", {"Name": "Other"}, [])),
    ):
        on_session.emit(place, interface, member, *args, signature=signature)
    let_reach_the_bus(on_session)
    on_session.release(dock.INTERFACE)
    terminal.dock.appear()
    settle(terminal)

    assert (reported(terminal, mark), warnings(terminal, mark)) == ([], [])
    assert follows(terminal, lambda: terminal.dock.close_app("mail")) == [(CLOSED, "Mail")]
