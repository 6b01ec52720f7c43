"""What the agent reports of the session: active (1), locked (2), behind the screen saver (3)."""

from __future__ import annotations

from typing import Any

import pytest

from sandbox.fakes.exported import Reply
from sandbox.fakes.fault import Fault
from sandbox.fakes.logind import USER
from sandbox.machine import layout
from sandbox.terminal import Terminal
from tests.e2e.wire import FIVE_MINUTES, log_lines, next_status, start_agent, warnings

ACTIVE, LOCKED, SCREEN_SAVER = 1, 2, 3


def five_minute_report(terminal: Terminal) -> tuple[Any, ...]:
    """Let five minutes pass; the result is the status report that they bring."""
    mark = terminal.events.mark()
    terminal.advance(FIVE_MINUTES)
    return next_status(terminal, mark)


def screen_lines(terminal: Terminal, after: int) -> list[str]:
    """What the agent has logged of the screen since a mark."""
    return [line for line in log_lines(terminal, after) if line.startswith("get screen")]


def show(terminal: Terminal, running: bool, locked: bool) -> None:
    """Set what the desktop's two services answer."""
    terminal.screensaver.set("isRunning", running)
    terminal.session_manager.set("Locked", locked)


@pytest.mark.parametrize(
    ("running", "locked", "absent", "status"),
    [
        (False, False, (), ACTIVE),
        (False, True, (), LOCKED),
        (True, False, (), SCREEN_SAVER),
        (True, True, (), SCREEN_SAVER),
        (True, True, ("screensaver",), LOCKED),
        (True, True, ("session_manager",), SCREEN_SAVER),
        (True, True, ("screensaver", "session_manager"), ACTIVE),
    ],
    ids=str,
)
def test_screen_saver_goes_before_lock_and_an_absent_service_counts_as_no(
    terminal: Terminal, running: bool, locked: bool, absent: tuple[str, ...], status: int
) -> None:
    show(terminal, running, locked)
    for name in absent:
        terminal.fakes[name].leave()
    terminal.start_agent()
    assert five_minute_report(terminal) == (status, "zhang.wei")


@pytest.mark.parametrize(
    ("absent", "logged"),
    [
        ((), ["get screenSaver state  true", "get screenLocked state  false"]),
        (("session_manager",), ["get screenSaver state  true"]),
        (("screensaver",), ["get screenLocked state  false"]),
    ],
    ids=str,
)
def test_each_present_service_is_logged(
    terminal: Terminal, absent: tuple[str, ...], logged: list[str]
) -> None:
    show(terminal, running=True, locked=False)
    for name in absent:
        terminal.fakes[name].leave()
    terminal.start_agent()
    mark = terminal.events.mark()
    five_minute_report(terminal)
    assert (screen_lines(terminal, mark), warnings(terminal, mark)) == (logged, [])


@pytest.mark.parametrize(
    ("name", "running", "locked", "status"),
    [
        ("screensaver", True, False, SCREEN_SAVER),
        ("screensaver", False, False, ACTIVE),
        ("session_manager", False, True, LOCKED),
        ("session_manager", False, False, ACTIVE),
    ],
)
def test_service_that_the_bus_can_start_is_started_and_read(
    terminal: Terminal, name: str, running: bool, locked: bool, status: int
) -> None:
    show(terminal, running, locked)
    service = terminal.fakes[name]
    service.leave()
    terminal.start_agent()
    terminal.commands.hold("start-service")
    terminal.session_bus.offer(service.bus_name, str(layout.COMMANDS / "start-service"))
    mark = terminal.events.mark()
    terminal.sync()
    terminal.jump(FIVE_MINUTES)
    terminal.events.wait_for(kind="command", member="start-service", after=mark)
    service.appear()
    terminal.commands.release("start-service")
    terminal.sync()

    assert next_status(terminal, mark)[0] == status
    assert len(screen_lines(terminal, mark)) == 2


def test_service_that_the_bus_cannot_start_counts_as_no_and_is_not_logged(terminal: Terminal) -> None:
    show(terminal, running=True, locked=True)
    terminal.screensaver.leave()
    terminal.start_agent()
    terminal.session_bus.offer(terminal.screensaver.bus_name, "/bin/false")
    mark = terminal.events.mark()

    assert five_minute_report(terminal)[0] == LOCKED
    assert screen_lines(terminal, mark) == ["get screenLocked state  true"]


def test_report_reads_the_name_then_the_screen_saver_then_the_lock(session: Terminal) -> None:
    mark = session.events.mark()
    five_minute_report(session)
    calls = session.events.all(source="velks", kind="call", after=mark)
    assert [call.target for call in calls] == ["logind", "screensaver", "session_manager", "daemon"]


def test_status_at_start_is_active_whatever_the_screen_shows(terminal: Terminal) -> None:
    show(terminal, running=True, locked=True)
    mark = start_agent(terminal)
    assert next_status(terminal, mark) == (ACTIVE, "zhang.wei")


def test_report_comes_every_five_minutes_and_a_change_waits_for_it(session: Terminal) -> None:
    mark = session.events.mark()
    session.session_manager.set("Locked", True)
    session.advance(299)
    assert session.events.all(member="SendUserStatus", after=mark) == []
    session.advance(2)
    assert next_status(session, mark)[0] == LOCKED
    session.advance(FIVE_MINUTES)
    next_status(session, mark, count=2)
    assert len(session.events.all(member="SendUserStatus", after=mark)) == 2


def test_name_is_read_afresh_and_loses_every_at_sign(session: Terminal) -> None:
    session.logind.rename("@new@name@")
    assert five_minute_report(session) == (ACTIVE, "newname")


def test_login_manager_without_user_object_gives_an_empty_name(session: Terminal) -> None:
    session.logind.forget_user()
    assert five_minute_report(session) == (ACTIVE, "")


WRONG_VALUES = [("s", "true?"), ("as", ["a", "b"]), ("(ii)", (1, 2)), ("a{sv}", {}), ("i", 7)]


@pytest.mark.parametrize(("signature", "value"), WRONG_VALUES, ids=str)
def test_properties_of_another_type_do_not_keep_the_report_back(
    terminal: Terminal, signature: str, value: Any
) -> None:
    terminal.screensaver.set("isRunning", value, signature)
    terminal.session_manager.set("Locked", value, signature)
    terminal.start_agent()
    status, name = five_minute_report(terminal)
    assert status in (ACTIVE, LOCKED, SCREEN_SAVER)
    assert name == "zhang.wei"


@pytest.mark.parametrize(
    ("signature", "value"), [("as", ["a", "b"]), ("(ii)", (1, 2)), ("a{sv}", {})], ids=str
)
def test_user_of_another_type_is_reported_as_unknown(terminal: Terminal, signature: str, value: Any) -> None:
    for name in ("Name", "UID"):
        terminal.logind.set(name, value, signature, path=USER)
    mark = start_agent(terminal)
    announced = terminal.events.wait_for(target="daemon", member="UpdateUserInfo", after=mark)
    assert announced.args == ("", 0)
    assert five_minute_report(terminal) == (ACTIVE, "")


@pytest.mark.parametrize(
    ("service", "status", "name"),
    [
        ("logind", SCREEN_SAVER, ""),
        ("screensaver", LOCKED, "zhang.wei"),
        ("session_manager", SCREEN_SAVER, "zhang.wei"),
    ],
)
@pytest.mark.parametrize("reply", [Reply("", ()), Reply("s", ("bare",)), None], ids=str)
def test_service_that_fails_or_replies_in_another_form_reads_as_no(
    terminal: Terminal, service: str, status: int, name: str, reply: Reply | None
) -> None:
    show(terminal, running=True, locked=True)
    terminal.start_agent()
    if reply:
        terminal.fakes[service].answers["Get"] = reply
    else:
        terminal.fakes[service].fault = Fault("fail")
    assert five_minute_report(terminal) == (status, name)


@pytest.mark.parametrize("service", ["logind", "screensaver", "session_manager"])
def test_service_that_does_not_introspect_is_read_all_the_same(terminal: Terminal, service: str) -> None:
    show(terminal, running=True, locked=True)
    terminal.fakes[service].faults["Introspect"] = Fault("hang")
    terminal.start_agent()
    assert five_minute_report(terminal) == (SCREEN_SAVER, "zhang.wei")
