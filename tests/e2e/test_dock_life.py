"""A dock that comes late, goes and comes back, or sends signals of another form."""

from __future__ import annotations

import pytest

from sandbox.bus.stranger import Stranger
from sandbox.fakes import dock
from sandbox.fakes.exported import PROPERTIES
from sandbox.terminal import Terminal
from tests.e2e.dockwatch import (
    CLOSED,
    OPENED,
    closes,
    dock_warnings,
    follows,
    has_windows,
    opens,
    reported,
    scans,
    settle,
    start,
)
from tests.e2e.strangers import Spoken, send, send_in_the_name_of
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


def test_an_absent_dock_is_warned_of_once_and_then_waited_for_without_asking(terminal: Terminal) -> None:
    terminal.dock.open_app("a", "A")
    start_without_dock(terminal)

    assert asked_of_the_session_bus(terminal, lambda: terminal.advance(3600)) == []

    carries_out_policies(terminal)
    terminal.sync()
    assert (reported(terminal), scans(terminal), dock_warnings(terminal)) == ([], [], [WAITING])


def test_a_late_dock_is_read_whole_and_then_followed(terminal: Terminal) -> None:
    start_without_dock(terminal)
    for app, docked in (("b", False), ("a", True), ("c", False)):
        terminal.dock.open_app(app, app.upper(), docked=docked)

    appear(terminal)

    assert (reported(terminal), scans(terminal)) == ([(OPENED, "B"), (OPENED, "C")], ["dock entry size: 3"])
    events = follows(terminal, opens("d"), has_windows(0, "a"), closes("b"))
    assert events == [(OPENED, "D"), (CLOSED, "A"), (CLOSED, "B")]


@pytest.mark.parametrize("late", [False, True], ids=["present at the start", "late"])
def test_a_dock_that_goes_and_comes_back_is_not_read_again_but_still_followed(
    terminal: Terminal, late: bool
) -> None:
    terminal.dock.open_app("a", "A")
    if late:
        start_without_dock(terminal)
        appear(terminal)
    else:
        start(terminal)
    mark = terminal.events.mark()

    terminal.dock.leave()
    terminal.dock.open_app("missed", "Missed")
    terminal.dock.appear()
    settle(terminal)

    assert (reported(terminal, mark), scans(terminal, mark), dock_warnings(terminal, mark)) == ([], [], [])
    assert follows(terminal, opens("b"), has_windows(2, "a")) == [(OPENED, "B"), (OPENED, "A")]


def test_a_stranger_is_ignored_while_the_dock_is_awaited(terminal: Terminal, on_session: Stranger) -> None:
    path = terminal.dock.open_app("mail", "Mail")
    start_without_dock(terminal)

    send(on_session, [Spoken(dock.PATH, dock.INTERFACE, "EntryAdded", "oi", (path, 0))])
    appear(terminal)

    assert (reported(terminal), dock_warnings(terminal)) == ([(OPENED, "Mail")], [WAITING])


def test_signals_of_another_form_do_nothing(terminal: Terminal) -> None:
    path = terminal.dock.open_app("mail", "Mail")
    start(terminal)
    mark = terminal.events.mark()

    signals = [
        Spoken(dock.PATH, dock.ENTRY, "EntryRemoved", "s", ("mail",)),
        Spoken(path, dock.ENTRY, "NameChanged"),
        Spoken(path, dock.ENTRY, "WindowInfosChanged"),
        Spoken(path, dock.ENTRY, "Changed", "s", ("Other",)),
        Spoken(path, PROPERTIES, "PropertiesChanged", "s", (dock.ENTRY,)),
        Spoken(path, PROPERTIES, "PropertiesChanged", "sa{sv}as", ("com.norix.Other", {"Name": "Other"}, [])),
    ]
    send_in_the_name_of(terminal.dock, signals)
    settle(terminal)

    assert (reported(terminal, mark), dock_warnings(terminal, mark)) == ([], [])
    assert follows(terminal, closes()) == [(CLOSED, "Mail")]
