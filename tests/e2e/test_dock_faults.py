"""A dock that fails, hangs or answers nonsense."""

from __future__ import annotations

from typing import Any

import pytest

from sandbox.fakes import dock
from sandbox.fakes.exported import Reply
from sandbox.fakes.fault import Fault, FirstCalls
from sandbox.periods import DBUS_LIMIT
from sandbox.terminal import Terminal
from tests.e2e.dockwatch import (
    CLOSED,
    OPENED,
    closes,
    dock_warnings,
    follows,
    has_windows,
    is_called,
    let_happen,
    opens,
    reported,
    scans,
    settle,
    start,
)
from tests.e2e.wire import carries_out_policies


@pytest.mark.parametrize(
    ("fault", "seconds"), [(Fault("fail"), 0), (Fault("hang"), DBUS_LIMIT)], ids=["fails", "hangs"]
)
def test_a_dock_that_does_not_answer_at_start_counts_as_empty_and_is_followed_when_it_is_well(
    terminal: Terminal, fault: Fault, seconds: int
) -> None:
    terminal.dock.open_app("a", "A")
    terminal.dock.fault = fault
    terminal.start_agent(ready=lambda: terminal.events.wait_for(target="dock", member="Get"))

    terminal.jump(seconds)

    terminal.events.wait_for(kind="log", member="info", args=("dock entry size: 0",))
    carries_out_policies(terminal)
    terminal.dock.fault = Fault()
    assert (reported(terminal), scans(terminal)) == ([], ["dock entry size: 0"])
    assert follows(terminal, opens("b")) == [(OPENED, "B")]


def test_a_dock_that_does_not_introspect_is_read_all_the_same(terminal: Terminal) -> None:
    terminal.dock.open_app("a", "A")
    terminal.dock.faults["Introspect"] = Fault("hang")

    start(terminal)

    assert reported(terminal) == [(OPENED, "A")]


def test_a_dock_that_hangs_later_holds_the_agent_up_by_the_limit_for_each_question(
    terminal: Terminal,
) -> None:
    start(terminal)
    terminal.dock.fault = Fault("hang")
    mark = terminal.events.mark()
    terminal.dock.open_app("a", "A")

    # The identifier twice, the name, the windows, and whether it is docked.
    for count in range(1, 6):
        terminal.events.wait_for(target="dock", member="Get", after=mark, count=count)
        terminal.jump(DBUS_LIMIT)

    carries_out_policies(terminal)
    terminal.dock.fault = Fault()
    settle(terminal)
    assert dock_warnings(terminal, mark) == []
    assert reported(terminal, mark) == [(OPENED, "")]


@pytest.mark.parametrize("name", ["Id", "IsDocked"])
@pytest.mark.parametrize("fault", [Fault("hang"), Fault("fail")], ids=lambda fault: fault.kind)
def test_an_entry_that_once_fails_to_answer_keeps_its_windows_and_signals(
    terminal: Terminal, fault: Fault, name: str
) -> None:
    start(terminal)
    mark = terminal.events.mark()
    terminal.dock.faults = FirstCalls({name: fault})
    terminal.dock.open_app("a", "A", windows=2)
    terminal.events.wait_for(lambda event: event.args[1] == name, target="dock", member="Get", after=mark)
    if fault.kind == "hang":
        terminal.jump(DBUS_LIMIT)
    settle(terminal)

    assert (reported(terminal, mark), dock_warnings(terminal, mark)) == ([(OPENED, "A")], [])
    assert follows(terminal, has_windows(1, "a"), closes("a")) == [(CLOSED, "A"), (CLOSED, "A")]


def test_an_entry_whose_identifier_cannot_be_read_is_followed_all_the_same(terminal: Terminal) -> None:
    terminal.dock.faults["Id"] = Fault("fail")
    terminal.dock.open_app("a", "A", windows=2)
    start(terminal)

    assert (reported(terminal), dock_warnings(terminal)) == ([(OPENED, "A")], [])
    assert follows(terminal, has_windows(1, "a")) == [(CLOSED, "A")]


def test_a_slow_answer_about_an_invalidated_property_blocks_nothing(terminal: Terminal) -> None:
    terminal.dock.open_app("a", "A", docked=True, windows=0)
    start(terminal)
    terminal.dock.announces = ("invalidated",)
    terminal.dock.fault = Fault("hold")
    mark = terminal.events.mark()

    terminal.dock.set_windows("a", 1)
    terminal.events.wait_for(target="dock", member="Get", after=mark)
    carries_out_policies(terminal)
    before = reported(terminal, mark)
    terminal.dock.release()
    settle(terminal)

    assert (before, reported(terminal, mark)) == ([], [(OPENED, "A")])


def test_an_invalidated_property_that_cannot_be_read_changes_nothing(terminal: Terminal) -> None:
    terminal.dock.open_app("a", "A", docked=True, windows=1)
    start(terminal)
    terminal.dock.announces = ("invalidated",)
    terminal.dock.faults["Get"] = Fault("fail")

    assert follows(terminal, has_windows(0, "a"), is_called("B", "a")) == []

    terminal.dock.faults.clear()
    assert follows(terminal, has_windows(2, "a")) == [(OPENED, "A")]


@pytest.mark.parametrize(
    ("value", "signature"), [("e1", "s"), (["e1"], "as"), ({}, "a{sv}"), (5, "i"), ((1, 2), "(ii)")], ids=str
)
def test_a_list_of_entries_of_another_type_counts_as_empty(
    terminal: Terminal, value: Any, signature: str
) -> None:
    terminal.dock.set("Entries", value, signature)

    start(terminal)

    assert (reported(terminal), scans(terminal)) == ([], ["dock entry size: 0"])
    terminal.dock.set("Entries", [])
    assert follows(terminal, opens("b")) == [(OPENED, "B")]


@pytest.mark.parametrize("name", ["Id", "Name", "WindowInfos"])
@pytest.mark.parametrize(
    ("value", "signature"), [(5, "i"), (["e1"], "as"), ({"a": "b"}, "a{ss}"), ((1, "x"), "(is)")], ids=str
)
def test_an_entry_with_a_property_of_another_type_does_not_stop_the_agent(
    terminal: Terminal, name: str, value: Any, signature: str
) -> None:
    path = terminal.dock.open_app("a", "A", windows=2)
    terminal.dock.objects[path].set(name, value, signature)

    start(terminal)

    assert reported(terminal) == [(OPENED, "" if name == "Name" else "A")]
    assert follows(terminal, opens("b")) == [(OPENED, "B")]


@pytest.mark.parametrize("name", ["Name", "WindowInfos"])
@pytest.mark.parametrize("way", ["values", "invalidated", "signal"])
@pytest.mark.parametrize(("value", "signature"), [(5, "i"), (["e1"], "as"), ({"a": "b"}, "a{ss}")], ids=str)
def test_a_change_to_a_value_of_another_type_is_passed_over(
    terminal: Terminal, way: dock.Announcement, name: str, value: Any, signature: str
) -> None:
    path = terminal.dock.open_app("a", "A", windows=2)
    start(terminal)
    terminal.dock.announces = (way,)

    events = follows(terminal, lambda dock: dock.set(name, value, signature, path), has_windows(3, "a"))

    assert events == [(OPENED, "A")]


@pytest.mark.parametrize("reply", [Reply("", ()), Reply("s", ("bare",))], ids=str)
def test_replies_of_another_form_do_not_stop_the_agent(terminal: Terminal, reply: Reply) -> None:
    start(terminal)
    terminal.dock.answers["Get"] = reply
    let_happen(terminal, opens("a"))
    del terminal.dock.answers["Get"]

    assert (reported(terminal), dock_warnings(terminal)) == ([(OPENED, "")], [])
    assert follows(terminal, opens("b")) == [(OPENED, "B")]
