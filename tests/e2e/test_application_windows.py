"""Windows and names of applications on the dock, in all the ways in which docks announce their changes."""

from __future__ import annotations

import pytest

from sandbox.fakes import dock
from sandbox.fakes.dock import Announcement
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
    is_called,
    opens,
    start_with,
)

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
@at_start_or_later
def test_a_change_of_the_number_of_windows_is_one_event(
    terminal: Terminal, at_start: bool, before: int, after: int, events: list[tuple[int, str]]
) -> None:
    start_with(terminal, opens(docked=True, windows=before), at_start)

    assert follows(terminal, has_windows(after)) == events


@pytest.mark.parametrize("ways", WAYS, ids=str)
@pytest.mark.parametrize(
    ("changes", "events"),
    [
        pytest.param(
            [opens(docked=True, windows=0), *map(has_windows, (2, 2, 0, 3, 1))],
            [(OPENED, "Mail"), (CLOSED, "Mail")] * 2,
            id="each change of windows is one event",
        ),
        pytest.param(
            [opens(), is_called("Post"), has_windows(2), is_called("邮件"), closes()],
            [(OPENED, "Mail"), (OPENED, "Post"), (CLOSED, "邮件")],
            id="a new name stands in later events",
        ),
        pytest.param(
            [opens(), is_called(""), has_windows(2)],
            [(OPENED, "Mail"), (OPENED, "Mail")],
            id="an empty name leaves the old one",
        ),
    ],
)
def test_changes_count_however_the_dock_announces_them(
    session: Terminal, ways: tuple[Announcement, ...], changes: list[Change], events: list[tuple[int, str]]
) -> None:
    session.dock.announces = ways

    assert follows(session, *changes) == events


@pytest.mark.parametrize("window_type", dock.WINDOW_TYPES)
@pytest.mark.parametrize("way", ["values", "invalidated", "signal"])
def test_windows_count_whatever_the_dock_knows_of_them(
    terminal: Terminal, window_type: str, way: Announcement
) -> None:
    terminal.dock.window_type = window_type
    terminal.dock.announces = (way,)
    start_with(terminal, opens(docked=True, windows=2), at_start=True)

    events = follows(terminal, *map(has_windows, (1, 3, 0)))

    assert [kind for kind, _ in events] == [CLOSED, OPENED, CLOSED]
    assert dock_warnings(terminal) == []
