"""Applications on the dock: the agent reports each one that opens or closes to the daemon, once."""

from __future__ import annotations

import pytest

from sandbox.bus.mainloop import MainLoop
from sandbox.events import Event
from sandbox.fakes import dock
from sandbox.fakes.fault import Fault
from sandbox.terminal import Terminal
from tests.e2e.dockwatch import CLOSED, OPENED, follows, scans, settle, start, reported, warnings
from tests.e2e.wire import wait_on_notification


def test_running_applications_are_reported_once_at_start_in_the_docks_order(terminal: Terminal) -> None:
    for app, docked in (("z", False), ("y", True), ("m", False), ("x", True), ("a", False)):
        terminal.dock.open_app(app, app.upper(), docked=docked)

    start(terminal)

    assert reported(terminal) == [(OPENED, "Z"), (OPENED, "M"), (OPENED, "A")]
    assert scans(terminal) == ["dock entry size: 5"]
    assert warnings(terminal) == []


def test_an_empty_dock_is_read_and_nothing_is_reported(terminal: Terminal) -> None:
    start(terminal)

    assert (reported(terminal), scans(terminal), warnings(terminal)) == ([], ["dock entry size: 0"], [])


def test_the_session_is_announced_before_its_applications(terminal: Terminal) -> None:
    terminal.dock.open_app("editor", "Editor")

    start(terminal)

    members = [call.member for call in terminal.events.all(kind="call", source="velks", target="daemon")]
    watched = [
        member for member in members if member in ("UpdateUserInfo", "SendUserStatus", "sendAppOpenState")
    ]
    assert watched == ["UpdateUserInfo", "SendUserStatus", "sendAppOpenState"]


@pytest.mark.parametrize("windows", [0, 1, 3])
def test_an_application_that_comes_to_the_dock_is_one_event_whatever_its_windows(
    session: Terminal, windows: int
) -> None:
    events = follows(session, lambda: session.dock.open_app("editor", "编辑器 2", windows=windows))

    assert events == [(OPENED, "编辑器 2")]


@pytest.mark.parametrize("windows", [0, 2])
def test_an_application_that_is_put_on_the_dock_is_not_reported(session: Terminal, windows: int) -> None:
    assert follows(session, lambda: session.dock.open_app("mail", "Mail", docked=True, windows=windows)) == []


def test_keeping_an_application_on_the_dock_or_not_is_not_reported(session: Terminal) -> None:
    session.dock.open_app("mail", "Mail")
    settle(session)

    assert follows(session, lambda: session.dock.pin("mail"), lambda: session.dock.pin("mail", False)) == []


@pytest.mark.parametrize(("windows", "events"), [(0, []), (1, [(CLOSED, "Mail")]), (2, [(CLOSED, "Mail")])])
@pytest.mark.parametrize("docked", [True, False], ids=["docked", "not docked"])
def test_an_entry_that_goes_is_a_close_if_it_had_windows(
    session: Terminal, docked: bool, windows: int, events: list[tuple[int, str]]
) -> None:
    session.dock.open_app("mail", "Mail", docked=docked, windows=windows)
    settle(session)

    assert follows(session, lambda: session.dock.close_app("mail")) == events
    assert warnings(session) == []


def test_an_application_that_lost_its_windows_first_is_closed_once(session: Terminal) -> None:
    session.dock.open_app("mail", "Mail", windows=2)
    settle(session)

    events = follows(
        session, lambda: session.dock.set_windows("mail", 0), lambda: session.dock.close_app("mail")
    )

    assert events == [(CLOSED, "Mail")]


@pytest.mark.parametrize("at_start", [True, False], ids=["known at start", "came later"])
def test_an_entry_that_has_gone_is_followed_no_more(terminal: Terminal, at_start: bool) -> None:
    if not at_start:
        start(terminal)
    path = terminal.dock.open_app("mail", "Mail")
    if at_start:
        start(terminal)
    settle(terminal)
    terminal.dock.close_app("mail")
    settle(terminal)

    assert follows(terminal, lambda: terminal.dock.set("WindowInfos", {1: "a", 2: "b"}, path=path)) == []


def test_an_application_may_come_and_go_many_times(session: Terminal) -> None:
    events = []
    for _ in range(3):
        events += follows(
            session, lambda: session.dock.open_app("mail", "Mail"), lambda: session.dock.close_app("mail")
        )

    assert events == [(OPENED, "Mail"), (CLOSED, "Mail")] * 3
    assert warnings(session) == []


def test_an_entry_without_windows_that_goes_and_comes_again_is_a_new_one(session: Terminal) -> None:
    for _ in range(2):
        session.dock.open_app("mail", "Mail", docked=True, windows=0)
        settle(session)
        session.dock.close_app("mail")
        settle(session)

    assert (reported(session), warnings(session)) == ([], [])


def test_the_removal_of_an_unknown_entry_is_warned_of_and_nothing_else(session: Terminal) -> None:
    session.dock.open_app("mail", "Mail")
    settle(session)

    events = follows(session, lambda: session.dock.emit(dock.INTERFACE, "EntryRemoved", "printer"))

    assert (events, warnings(session)) == ([], ['unknow entry removed, id: "printer"'])


def test_an_entry_that_is_announced_twice_is_warned_of_and_then_followed_once(session: Terminal) -> None:
    path = session.dock.open_app("mail", "Mail")
    settle(session)

    events = follows(session, lambda: session.dock.emit(dock.INTERFACE, "EntryAdded", path, 0))
    assert events == [(OPENED, "Mail")]
    assert warnings(session) == [f'repeat entry added, path: "{path}"']

    events = follows(
        session, lambda: session.dock.set_windows("mail", 2), lambda: session.dock.close_app("mail")
    )
    assert events == [(OPENED, "Mail"), (CLOSED, "Mail")]


def test_of_two_entries_with_one_identifier_the_newer_one_is_followed(session: Terminal) -> None:
    older = session.dock.open_app("mail", "Old")
    newer = session.dock.open_app("mail", "New")
    settle(session)

    assert reported(session) == [(OPENED, "Old"), (OPENED, "New")]
    assert warnings(session) == [f'repeat entry added, path: "{newer}"']
    assert follows(session, lambda: session.dock.set("WindowInfos", {}, path=older)) == []
    assert follows(session, lambda: session.dock.set("WindowInfos", {}, path=newer)) == [(CLOSED, "New")]


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
    assert warnings(terminal) == [f'entry is invalid, path: "{missing}"']


def test_entries_that_do_not_exist_stand_in_one_place_and_go_without_an_event(session: Terminal) -> None:
    paths = [session.dock.open_app(app, app) for app in ("a", "b")]
    settle(session)
    for app in ("a", "b"):
        session.dock.close_app(app)
    settle(session)
    mark = session.events.mark()

    events = follows(
        session,
        *(lambda path=path: session.dock.emit(dock.INTERFACE, "EntryAdded", path, 0) for path in paths),
        lambda: session.dock.emit(dock.INTERFACE, "EntryRemoved", ""),
    )

    assert events == [(OPENED, ""), (OPENED, "")]
    assert warnings(session, mark) == [
        f'entry is invalid, path: "{paths[0]}"',
        f'entry is invalid, path: "{paths[1]}"',
        f'repeat entry added, path: "{paths[1]}"',
    ]


def test_what_happens_while_the_daemon_is_absent_is_lost_and_nothing_else(session: Terminal) -> None:
    session.daemon.leave()
    mark = session.events.mark()
    session.dock.open_app("lost", "Lost")
    settle(session)

    session.daemon.appear(announce=True)
    session.dock.open_app("mail", "Mail")
    settle(session)

    assert reported(session, mark) == [(OPENED, "Mail")]
    assert warnings(session, mark) == []


@pytest.mark.local_user
def test_a_local_users_applications_are_reported_too(terminal: Terminal) -> None:
    terminal.dock.open_app("a", "A")

    start(terminal)

    assert reported(terminal) == [(OPENED, "A")]
    assert follows(terminal, lambda: terminal.dock.close_app("a")) == [(CLOSED, "A")]


@pytest.mark.parametrize("known", [True, False], ids=["with another entry", "alone"])
def test_what_an_application_did_before_it_was_read_is_no_change(session: Terminal, known: bool) -> None:
    if known:
        session.dock.open_app("editor", "Editor", docked=True, windows=0)
        settle(session)
    mark = wait_on_notification(session, Fault.hold())
    session.dock.open_app("mail", "Mail", docked=True, windows=0)
    for number in (1, 2, 3):
        session.dock.set_windows("mail", number)
    session.dock.rename("mail", "Post")

    session.notifications.release()
    settle(session)

    assert reported(session, mark) == []
    session.dock.set_windows("mail", 1)
    settle(session)
    assert reported(session, mark) == [(CLOSED, "Post")]


def test_changes_right_after_a_new_entry_are_all_reported(session: Terminal) -> None:
    session.dock.open_app("mail", "Mail", docked=True, windows=0)
    settle(session)
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
        session.dock.open_app(f"new {number}", f"New {number}", docked=True, windows=0)
        settle(session)

    assert reported(session) == [(OPENED, f"New {number}") for number in range(40)]
