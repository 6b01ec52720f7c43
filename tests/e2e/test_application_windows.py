"""Windows and names of applications on the dock, in all the ways in which docks announce their changes."""

from __future__ import annotations

import pytest

from sandbox.fakes import dock
from sandbox.fakes.dock import Announcement
from sandbox.terminal import Terminal
from tests.e2e.dockwatch import CLOSED, OPENED, follows, settle, start, warnings

WAYS: list[tuple[Announcement, ...]] = [
    ("values",),
    ("invalidated",),
    ("signal",),
    ("values", "signal"),
    ("signal", "values"),
    ("invalidated", "signal"),
    ("values", "invalidated"),
]


@pytest.mark.parametrize(
    ("before", "after", "events"),
    [
        (0, 3, [(OPENED, "Mail")]),
        (3, 2, [(CLOSED, "Mail")]),
        (3, 0, [(CLOSED, "Mail")]),
        (2, 2, []),
        (0, 0, []),
    ],
)
@pytest.mark.parametrize("at_start", [True, False], ids=["known at start", "came later"])
def test_a_change_of_the_number_of_windows_is_one_event(
    terminal: Terminal, at_start: bool, before: int, after: int, events: list[tuple[int, str]]
) -> None:
    if at_start:
        terminal.dock.open_app("mail", "Mail", docked=True, windows=before)
        start(terminal)
    else:
        start(terminal)
        terminal.dock.open_app("mail", "Mail", docked=True, windows=before)
        settle(terminal)

    assert follows(terminal, lambda: terminal.dock.set_windows("mail", after)) == events


@pytest.mark.parametrize("ways", WAYS, ids=str)
def test_each_change_of_windows_is_reported_once_however_the_dock_announces_it(
    session: Terminal, ways: tuple[Announcement, ...]
) -> None:
    session.dock.announces = ways
    session.dock.open_app("mail", "Mail", docked=True, windows=0)
    settle(session)

    counts = [lambda number=number: session.dock.set_windows("mail", number) for number in (2, 2, 0, 3, 1)]

    kinds = [kind for kind, _ in follows(session, *counts)]
    assert kinds == [OPENED, CLOSED, OPENED, CLOSED]


@pytest.mark.parametrize("ways", WAYS, ids=str)
def test_a_new_name_stands_in_later_events_however_the_dock_announces_it(
    session: Terminal, ways: tuple[Announcement, ...]
) -> None:
    session.dock.announces = ways
    session.dock.open_app("mail", "Mail")
    settle(session)

    events = follows(
        session,
        lambda: session.dock.rename("mail", "Post"),
        lambda: session.dock.set_windows("mail", 2),
        lambda: session.dock.rename("mail", "邮件"),
        lambda: session.dock.close_app("mail"),
    )

    assert events == [(OPENED, "Post"), (CLOSED, "邮件")]


@pytest.mark.parametrize("ways", WAYS, ids=str)
def test_an_empty_name_leaves_the_old_one(session: Terminal, ways: tuple[Announcement, ...]) -> None:
    session.dock.announces = ways
    session.dock.open_app("mail", "Mail")
    settle(session)

    events = follows(
        session, lambda: session.dock.rename("mail", ""), lambda: session.dock.set_windows("mail", 2)
    )

    assert events == [(OPENED, "Mail")]


@pytest.mark.parametrize("window_type", dock.WINDOW_TYPES)
@pytest.mark.parametrize("way", ["values", "invalidated", "signal"])
def test_windows_count_whatever_the_dock_knows_of_them(
    terminal: Terminal, window_type: str, way: Announcement
) -> None:
    terminal.dock.window_type = window_type
    terminal.dock.announces = (way,)
    terminal.dock.open_app("mail", "Mail", docked=True, windows=2)
    start(terminal)

    counts = [lambda number=number: terminal.dock.set_windows("mail", number) for number in (1, 3, 0)]

    assert [kind for kind, _ in follows(terminal, *counts)] == [CLOSED, OPENED, CLOSED]
    assert warnings(terminal) == []
