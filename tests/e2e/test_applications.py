"""Applications on the dock: the agent reports each one that opens or closes to the daemon, once."""

from __future__ import annotations

import pytest

from sandbox.bus.mainloop import MainLoop
from sandbox.events import Event
from sandbox.fakes.dock import INTERFACE
from sandbox.fakes.fault import Fault
from sandbox.terminal import Terminal
from tests.e2e.dockwatch import (
    CLOSED,
    Change,
    OPENED,
    at_start_or_later,
    closes,
    dock_warnings,
    follows,
    has_windows,
    let_happen,
    opens,
    reported,
    scans,
    settle,
    start,
    start_with,
)
from tests.e2e.wire import wait_on_notification


def test_running_applications_are_reported_once_at_start_in_the_docks_order(terminal: Terminal) -> None:
    for app, docked in (("z", False), ("y", True), ("m", False), ("x", True), ("a", False)):
        terminal.dock.open_app(app, app.upper(), docked=docked)

    start(terminal)

    assert reported(terminal) == [(OPENED, "Z"), (OPENED, "M"), (OPENED, "A")]
    assert scans(terminal) == ["dock entry size: 5"]
    assert dock_warnings(terminal) == []


def test_an_empty_dock_is_read_and_nothing_is_reported(terminal: Terminal) -> None:
    start(terminal)

    assert (reported(terminal), scans(terminal), dock_warnings(terminal)) == ([], ["dock entry size: 0"], [])


def test_the_session_is_announced_before_its_applications(terminal: Terminal) -> None:
    terminal.dock.open_app("editor", "Editor")

    start(terminal)

    members = [call.member for call in terminal.events.all(kind="call", source="velks", target="daemon")]
    assert members == ["UpdateUserInfo", "SendUserStatus", "sendAppOpenState"]


HISTORIES = {
    "comes without windows and goes": ([opens(windows=0), closes()], [(OPENED, "Mail")]),
    "comes with a window and goes": ([opens(), closes()], [(OPENED, "Mail"), (CLOSED, "Mail")]),
    "comes with three and goes": ([opens(windows=3), closes()], [(OPENED, "Mail"), (CLOSED, "Mail")]),
    "is put on the dock and taken off": ([opens(docked=True, windows=0), closes()], []),
    "is put there with a window": ([opens(docked=True, windows=1), closes()], [(CLOSED, "Mail")]),
    "is put there with two": ([opens(docked=True, windows=2), closes()], [(CLOSED, "Mail")]),
    "is kept there and then not": (
        [opens(), lambda dock: dock.pin("mail"), lambda dock: dock.pin("mail", False)],
        [(OPENED, "Mail")],
    ),
    "loses its windows first": (
        [opens(windows=2), has_windows(0), closes()],
        [(OPENED, "Mail"), (CLOSED, "Mail")],
    ),
    "comes and goes many times": ([opens(), closes()] * 3, [(OPENED, "Mail"), (CLOSED, "Mail")] * 3),
    "is put there again": ([opens(docked=True, windows=0), closes()] * 2, []),
    "has an odd name": ([opens("编辑器 2")], [(OPENED, "编辑器 2")]),
}


@pytest.mark.parametrize(("changes", "events"), HISTORIES.values(), ids=HISTORIES)
def test_what_an_application_does_is_reported_step_by_step(
    session: Terminal, changes: list[Change], events: list[tuple[int, str]]
) -> None:
    assert (follows(session, *changes), dock_warnings(session)) == (events, [])


@at_start_or_later
def test_an_entry_that_has_gone_is_followed_no_more(terminal: Terminal, at_start: bool) -> None:
    start_with(terminal, opens(), at_start)
    path = terminal.dock.apps["mail"]
    let_happen(terminal, closes())

    assert follows(terminal, lambda dock: dock.set("WindowInfos", {1: "a", 2: "b"}, path=path)) == []


def test_the_removal_of_an_unknown_entry_is_warned_of_and_nothing_else(session: Terminal) -> None:
    let_happen(session, opens())

    events = follows(session, lambda dock: dock.emit(INTERFACE, "EntryRemoved", "printer"))

    assert (events, dock_warnings(session)) == ([], ['unknow entry removed, id: "printer"'])


def test_an_entry_that_is_announced_twice_is_warned_of_and_then_followed_once(session: Terminal) -> None:
    let_happen(session, opens())
    path = session.dock.apps["mail"]

    events = follows(session, lambda dock: dock.emit(INTERFACE, "EntryAdded", path, 0))
    assert events == [(OPENED, "Mail")]
    assert dock_warnings(session) == [f'repeat entry added, path: "{path}"']

    assert follows(session, has_windows(2), closes()) == [(OPENED, "Mail"), (CLOSED, "Mail")]


def test_of_two_entries_with_one_identifier_the_newer_one_is_followed(session: Terminal) -> None:
    older = session.dock.open_app("mail", "Old")
    newer = session.dock.open_app("mail", "New")
    settle(session)

    assert reported(session) == [(OPENED, "Old"), (OPENED, "New")]
    assert dock_warnings(session) == [f'repeat entry added, path: "{newer}"']
    assert follows(session, lambda dock: dock.set("WindowInfos", {}, path=older)) == []
    assert follows(session, lambda dock: dock.set("WindowInfos", {}, path=newer)) == [(CLOSED, "New")]


def test_an_entry_that_does_not_exist_at_start_is_warned_of_and_the_others_are_reported(
    terminal: Terminal,
) -> None:
    terminal.dock.open_app("a", "A")
    missing = terminal.dock.open_app("b", "B", docked=True)
    terminal.dock.open_app("c", "C")
    terminal.dock.withdrawn.add(missing)

    start(terminal)

    # Nothing is known of the missing one, not even that it is docked.
    assert reported(terminal) == [(OPENED, "A"), (OPENED, ""), (OPENED, "C")]
    assert dock_warnings(terminal) == [f'entry is invalid, path: "{missing}"']


def test_entries_that_do_not_exist_stand_in_one_place_and_go_without_an_event(session: Terminal) -> None:
    let_happen(session, opens("a"), opens("b"))
    paths = [*session.dock.apps.values()]
    let_happen(session, closes("a"), closes("b"))
    mark = session.events.mark()

    events = follows(
        session,
        lambda dock: dock.emit(INTERFACE, "EntryAdded", paths[0], 0),
        lambda dock: dock.emit(INTERFACE, "EntryAdded", paths[1], 0),
        lambda dock: dock.emit(INTERFACE, "EntryRemoved", ""),
    )

    assert events == [(OPENED, ""), (OPENED, "")]
    assert dock_warnings(session, mark) == [
        f'entry is invalid, path: "{paths[0]}"',
        f'entry is invalid, path: "{paths[1]}"',
        f'repeat entry added, path: "{paths[1]}"',
    ]


def test_what_happens_while_the_daemon_is_absent_is_lost_and_nothing_else(session: Terminal) -> None:
    session.daemon.leave()
    mark = session.events.mark()
    let_happen(session, opens("lost"))

    session.daemon.appear(announce=True)
    let_happen(session, opens())

    assert reported(session, mark) == [(OPENED, "Mail")]
    assert dock_warnings(session, mark) == []


@pytest.mark.local_user
def test_a_local_users_applications_are_reported_too(terminal: Terminal) -> None:
    terminal.dock.open_app("a", "A")

    start(terminal)

    assert reported(terminal) == [(OPENED, "A")]
    assert follows(terminal, closes("a")) == [(CLOSED, "A")]


@pytest.mark.parametrize("known", [True, False], ids=["with another entry", "alone"])
def test_what_an_application_did_before_it_was_read_is_no_change(session: Terminal, known: bool) -> None:
    if known:
        let_happen(session, opens("editor", docked=True, windows=0))
    mark = wait_on_notification(session, Fault("hold"))
    session.dock.open_app("mail", "Mail", docked=True, windows=0)
    for number in (1, 2, 3):
        session.dock.set_windows("mail", number)
    session.dock.rename("mail", "Post")

    session.notifications.release()
    settle(session)

    assert reported(session, mark) == []
    assert follows(session, has_windows(1)) == [(CLOSED, "Post")]


def test_changes_right_after_a_new_entry_are_all_reported(session: Terminal) -> None:
    let_happen(session, opens(docked=True, windows=0))
    mark = session.events.mark()

    for number in range(40):
        session.dock.open_app(f"new {number}", "New", docked=True)
        session.dock.set_windows("mail", 1)
        session.dock.set_windows("mail", 0)
    settle(session)

    assert reported(session, mark) == [(OPENED, "Mail"), (CLOSED, "Mail")] * 40


def test_windows_that_come_right_after_an_entry_was_read_are_reported(session: Terminal) -> None:
    def open_window_after_answer(event: Event) -> None:
        if event.target == "dock" and event.args[1:] == ("WindowInfos",):
            newest = [*session.dock.apps][-1]
            MainLoop.later(0, lambda: session.dock.set_windows(newest, 1))

    session.events.subscribe(open_window_after_answer)
    for number in range(40):
        let_happen(session, opens(f"new {number}", docked=True, windows=0))

    assert reported(session) == [(OPENED, f"New {number}") for number in range(40)]
