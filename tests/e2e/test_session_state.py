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


def show(terminal: Terminal, running: bool, locked: bool) -> None:
    """Set what the desktop's two services answer."""
    terminal.screensaver.set("isRunning", running)
    terminal.session_manager.set("Locked", locked)


@pytest.mark.parametrize(
    ("running", "locked", "status"),
    [
        (False, False, ACTIVE),
        (False, True, LOCKED),
        (True, False, SCREEN_SAVER),
        (True, True, SCREEN_SAVER),
    ],
)
def test_screen_saver_goes_before_lock(terminal: Terminal, running: bool, locked: bool, status: int) -> None:
    show(terminal, running, locked)
    terminal.start_agent()
    assert five_minute_report(terminal) == (status, "zhang.wei")


@pytest.mark.parametrize(
    ("absent", "status"),
    [
        (("screensaver",), LOCKED),
        (("session_manager",), SCREEN_SAVER),
        (("screensaver", "session_manager"), ACTIVE),
    ],
    ids=str,
)
def test_absent_service_counts_as_no(terminal: Terminal, absent: tuple[str, ...], status: int) -> None:
    show(terminal, running=True, locked=True)
    for name in absent:
        terminal.fakes[name].leave()
    terminal.start_agent()
    assert five_minute_report(terminal)[0] == status


@pytest.mark.parametrize("name", ["screensaver", "session_manager"])
@pytest.mark.parametrize("yes", [True, False])
def test_service_that_the_bus_can_start_is_started_and_read(terminal: Terminal, name: str, yes: bool) -> None:
    show(terminal, running=yes and name == "screensaver", locked=yes and name == "session_manager")
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
    no = ACTIVE
    started = SCREEN_SAVER if name == "screensaver" else LOCKED

    assert next_status(terminal, mark)[0] == (started if yes else no)
    assert len([line for line in log_lines(terminal, mark) if line.startswith("get screen")]) == 2


def test_service_that_the_bus_cannot_start_counts_as_no_and_is_not_logged(terminal: Terminal) -> None:
    show(terminal, running=True, locked=True)
    terminal.screensaver.leave()
    terminal.start_agent()
    terminal.session_bus.offer(terminal.screensaver.bus_name, "/bin/false")
    mark = terminal.events.mark()

    assert five_minute_report(terminal)[0] == LOCKED
    states = [line for line in log_lines(terminal, mark) if line.startswith("get screen")]
    assert states == ["get screenLocked state  true"]


def test_each_present_service_is_logged(terminal: Terminal) -> None:
    show(terminal, running=True, locked=False)
    terminal.start_agent()
    mark = terminal.events.mark()
    five_minute_report(terminal)
    states = [line for line in log_lines(terminal, mark) if line.startswith("get screen")]
    assert states == ["get screenSaver state  true", "get screenLocked state  false"]


@pytest.mark.parametrize(
    ("absent", "logged"),
    [
        ("session_manager", ["get screenSaver state  true"]),
        ("screensaver", ["get screenLocked state  true"]),
    ],
)
def test_absent_service_is_not_logged(terminal: Terminal, absent: str, logged: list[str]) -> None:
    show(terminal, running=True, locked=True)
    terminal.fakes[absent].leave()
    terminal.start_agent()
    mark = terminal.events.mark()
    five_minute_report(terminal)
    assert [line for line in log_lines(terminal, mark) if line.startswith("get screen")] == logged
    assert warnings(terminal, mark) == []


def test_report_reads_the_name_then_the_screen_saver_then_the_lock(session: Terminal) -> None:
    mark = session.events.mark()
    five_minute_report(session)
    calls = session.events.all(source="velks", kind="call", after=mark)
    assert [call.target for call in calls] == ["logind", "screensaver", "session_manager", "daemon"]


def test_status_at_start_is_active_whatever_the_screen_shows(terminal: Terminal) -> None:
    show(terminal, running=True, locked=True)
    mark = start_agent(terminal)
    assert next_status(terminal, mark) == (ACTIVE, "zhang.wei")


def test_report_comes_every_five_minutes_even_without_a_change(session: Terminal) -> None:
    mark = session.events.mark()
    session.advance(299)
    assert session.events.all(member="SendUserStatus", after=mark) == []
    session.advance(2)
    next_status(session, mark, count=1)
    session.advance(FIVE_MINUTES)
    next_status(session, mark, count=2)
    assert len(session.events.all(member="SendUserStatus", after=mark)) == 2


def test_change_between_two_reports_waits_for_the_next(session: Terminal) -> None:
    mark = session.events.mark()
    session.session_manager.set("Locked", True)
    session.advance(299)
    assert session.events.all(member="SendUserStatus", after=mark) == []
    session.advance(2)
    assert next_status(session, mark)[0] == LOCKED


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


@pytest.mark.parametrize("service", ["logind", "screensaver", "session_manager"])
@pytest.mark.parametrize("reply", [Reply("", ()), Reply("s", ("bare",))], ids=str)
def test_replies_of_another_form_read_as_no(terminal: Terminal, service: str, reply: Reply) -> None:
    show(terminal, running=True, locked=True)
    terminal.start_agent()
    terminal.fakes[service].answers["Get"] = reply
    expected = {
        "logind": (SCREEN_SAVER, ""),
        "screensaver": (LOCKED, "zhang.wei"),
        "session_manager": (SCREEN_SAVER, "zhang.wei"),
    }
    assert five_minute_report(terminal) == expected[service]


@pytest.mark.parametrize("service", ["logind", "screensaver", "session_manager"])
def test_failing_service_reads_as_no(session: Terminal, service: str) -> None:
    session.fakes[service].fault = Fault.fail()
    assert five_minute_report(session) == (ACTIVE, "" if service == "logind" else "zhang.wei")


@pytest.mark.parametrize("service", ["logind", "screensaver", "session_manager"])
def test_service_that_does_not_introspect_is_read_all_the_same(terminal: Terminal, service: str) -> None:
    show(terminal, running=True, locked=True)
    terminal.fakes[service].faults["Introspect"] = Fault.hang()
    terminal.start_agent()
    assert five_minute_report(terminal) == (SCREEN_SAVER, "zhang.wei")
