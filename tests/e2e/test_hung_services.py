"""Services that accept calls and never answer: each costs the D-Bus limit of 25 s and no more."""

from __future__ import annotations

import pytest

from sandbox.fakes.fault import Fault
from sandbox.periods import DBUS_LIMIT
from sandbox.terminal import Terminal
from tests.e2e.wire import (
    begin_countdown,
    carries_out_policies,
    comes_in_a_minute,
    log_lines,
    next_status,
    push,
    wait_on_notification,
    warnings,
)


def test_hung_login_manager_at_start_gives_an_empty_name(terminal: Terminal) -> None:
    terminal.logind.fault = Fault("hang")
    mark = terminal.events.mark()
    terminal.start_agent(
        ready=lambda: terminal.events.wait_for(target="logind", member="Get", count=2, after=mark)
    )
    terminal.jump(DBUS_LIMIT)
    announced = terminal.events.wait_for(target="daemon", member="UpdateUserInfo", after=mark)
    assert announced.args == ("", 0)
    assert next_status(terminal, mark) == (1, "")


def start_with_slow_login_manager(terminal: Terminal) -> None:
    """Start the agent; it gets the user's name and uid just before the limit."""
    terminal.logind.fault = Fault("hold")
    mark = terminal.events.mark()

    def answer_late() -> None:
        terminal.events.wait_for(target="logind", member="Get", count=2, after=mark)
        terminal.jump(DBUS_LIMIT - 5)
        terminal.logind.release()

    terminal.start_agent(ready=answer_late)


def test_slow_login_manager_is_waited_for(terminal: Terminal) -> None:
    mark = terminal.events.mark()
    start_with_slow_login_manager(terminal)
    announced = terminal.events.wait_for(target="daemon", member="UpdateUserInfo", after=mark)
    assert announced.args == ("zhang.wei", 20001)


def test_five_minutes_begin_when_the_name_is_known(terminal: Terminal) -> None:
    mark = terminal.events.mark()
    start_with_slow_login_manager(terminal)
    next_status(terminal, mark)
    mark = terminal.events.mark()
    terminal.advance(299)
    assert terminal.events.all(member="SendUserStatus", after=mark) == []


def test_slow_notifications_are_no_failure(session: Terminal) -> None:
    mark = wait_on_notification(session, Fault("hold"))
    session.jump(DBUS_LIMIT - 5)
    session.notifications.release()
    session.sync()
    assert warnings(session, mark) == []


@pytest.mark.parametrize(
    ("hung", "status"), [("screensaver", 2), ("session_manager", 3), ("logind", 3)], ids=str
)
def test_hung_service_reads_as_no_and_the_report_comes(terminal: Terminal, hung: str, status: int) -> None:
    terminal.screensaver.run()
    terminal.session_manager.set("Locked", True)
    terminal.start_agent()
    terminal.fakes[hung].fault = Fault("hang")
    mark = terminal.events.mark()

    terminal.daemon.push_online()
    terminal.events.wait_for(target=hung, member="Get", after=mark)
    terminal.jump(DBUS_LIMIT)
    assert next_status(terminal, mark) == (status, "" if hung == "logind" else "zhang.wei")


@pytest.mark.parametrize(("code", "action"), [(1201, "Terminate"), (1200, "Reboot")])
def test_minute_before_a_forced_action_begins_when_its_warning_has_been_tried(
    session: Terminal, code: int, action: str
) -> None:
    mark = wait_on_notification(session, Fault("hang"), code)
    session.daemon.push_policy({"type": 5})
    session.jump(DBUS_LIMIT)
    session.events.wait_for(target="policy_service", member="onPolicyMsg", after=mark)

    comes_in_a_minute(session, action, mark)


def test_hung_policy_service_does_not_hold_up_the_agent(session: Terminal) -> None:
    session.policy_service.fault = Fault("hang")
    session.daemon.push_policy({"type": 5})
    carries_out_policies(session)


def test_no_signal_is_handled_while_a_notification_is_waited_for(session: Terminal) -> None:
    mark = wait_on_notification(session, Fault("hang"))
    session.daemon.push_policy({"type": 5})
    session.jump(DBUS_LIMIT)
    session.sync()

    lines = log_lines(session, mark)
    given_up = next(number for number, line in enumerate(lines) if line.startswith("--@@@@--"))
    forwarded = lines.index('onPolicyMsg ---------payload: "{\\"type\\": 5}"')
    assert given_up < forwarded


def test_failed_warning_is_logged(session: Terminal) -> None:
    session.notifications.fault = Fault("fail", "com.norix.Error")
    mark = push(session, {"type": 1201})
    session.sync()
    assert warnings(session, mark) == ['--@@@@-- QDBusError("com.norix.Error", "simulated failure")']


def test_hung_login_manager_at_the_forced_action_does_not_stop_later_policies(session: Terminal) -> None:
    mark = begin_countdown(session)
    session.logind.fault = Fault("hang")
    session.jump(60)
    session.events.wait_for(target="logind", member="Terminate", after=mark)
    session.daemon.push_policy({"type": 5})
    session.jump(DBUS_LIMIT)
    session.events.wait_for(target="policy_service", member="onPolicyMsg", after=mark)


@pytest.mark.real_time
def test_limit_holds_by_the_clock_on_the_wall(session: Terminal) -> None:
    session.notifications.fault = Fault("hang")
    mark = push(session, {"type": 1300})
    session.daemon.push_policy({"type": 5})
    session.events.wait_for(target="policy_service", member="onPolicyMsg", after=mark, timeout=120)
    session.sync()
    assert warnings(session, mark) == [
        '--@@@@-- QDBusError("org.freedesktop.DBus.Error.NoReply", "Did not receive a reply. Possible causes '
        "include: the remote application did not send a reply, the message bus security policy blocked the "
        'reply, the reply timeout expired, or the network connection was broken.")'
    ]
