"""What the agent reports of the user, and when: the daemon is there, comes late, restarts, hangs."""

from __future__ import annotations

import pytest

from sandbox.fakes.fault import Fault
from sandbox.machine.users import DOMAIN_USER, LOCAL_USER, User
from sandbox.terminal import Terminal
from tests.e2e.wire import (
    FIVE_MINUTES,
    carries_out_policies,
    log_lines,
    next_notification,
    next_status,
    push_online,
    start_agent,
    warnings,
)


def announcements(terminal: Terminal, after: int = 0) -> list[tuple[str, tuple[object, ...]]]:
    """The agent's calls at the daemon since a mark."""
    calls = terminal.events.all(source="velks", target="daemon", kind="call", after=after)
    return [(call.member, call.args) for call in calls]


@pytest.mark.parametrize(
    "user", [DOMAIN_USER, pytest.param(LOCAL_USER, marks=pytest.mark.local_user)], ids=lambda user: user.name
)
def test_user_and_an_active_session_are_reported_when_the_session_begins(
    session: Terminal, user: User
) -> None:
    assert announcements(session) == [
        ("UpdateUserInfo", (user.plain_name, user.uid)),
        ("SendUserStatus", (1, user.plain_name)),
    ]


def test_name_that_is_announced_has_no_at_sign_at_all(terminal: Terminal) -> None:
    terminal.logind.rename("@zhang@wei@corp")
    terminal.start_agent()
    assert ("UpdateUserInfo", ("zhangweicorp", 20001)) in announcements(terminal)


def test_unknown_user_is_announced_as_empty(terminal: Terminal) -> None:
    terminal.logind.forget_user()
    terminal.start_agent()
    assert announcements(terminal) == [("UpdateUserInfo", ("", 0)), ("SendUserStatus", (1, ""))]


@pytest.mark.parametrize("late", [True, False], ids=["late", "restarting"])
def test_daemon_that_announces_itself_gets_a_report_and_is_obeyed(terminal: Terminal, late: bool) -> None:
    if late:
        terminal.daemon.leave()
    terminal.start_agent()
    terminal.session_manager.lock()
    mark = terminal.events.mark()
    if not late:
        terminal.daemon.leave()
    terminal.daemon.appear(announce=True)
    next_status(terminal, mark)
    assert announcements(terminal, mark) == [
        ("UpdateUserInfo", ("zhang.wei", 20001)),
        ("SendUserStatus", (2, "zhang.wei")),
    ]
    carries_out_policies(terminal)


def test_daemon_that_appears_silently_hears_nothing_until_the_next_report(terminal: Terminal) -> None:
    terminal.daemon.leave()
    terminal.start_agent()
    mark = terminal.events.mark()
    terminal.daemon.appear()
    terminal.sync()
    assert announcements(terminal, mark) == []
    terminal.advance(FIVE_MINUTES)
    assert next_status(terminal, mark) == (1, "zhang.wei")


def test_every_online_signal_is_answered(session: Terminal) -> None:
    mark = push_online(session)
    session.daemon.push_online()
    next_status(session, mark, count=2)
    assert [member for member, _ in announcements(session, mark)] == ["UpdateUserInfo", "SendUserStatus"] * 2


def test_online_signal_is_logged_with_name_and_uid(session: Terminal) -> None:
    mark = push_online(session)
    next_status(session, mark)
    session.sync()
    assert 'velkg restart sendonline   "zhang.wei" 20001' in log_lines(session, mark)


def test_daemon_that_never_answers_still_gets_reports_and_is_obeyed(terminal: Terminal) -> None:
    terminal.daemon.fault = Fault("hang")
    mark = start_agent(terminal)
    carries_out_policies(terminal)
    terminal.advance(FIVE_MINUTES)
    next_status(terminal, mark, count=2)


def test_daemon_that_refuses_every_call_changes_nothing(terminal: Terminal) -> None:
    assert terminal.platform, "a missing one would be warned of"
    terminal.daemon.fault = Fault("fail")
    mark = start_agent(terminal)
    terminal.advance(FIVE_MINUTES)
    next_status(terminal, mark, count=2)
    assert warnings(terminal, mark) == []


def test_name_known_at_start_is_announced_even_if_it_changed_since(session: Terminal) -> None:
    session.logind.rename("@later")
    mark = push_online(session)
    assert next_status(session, mark) == (1, "later")
    assert announcements(session, mark)[0] == ("UpdateUserInfo", ("zhang.wei", 20001))


def test_signals_during_a_slow_start_are_handled_after_it_in_their_order(terminal: Terminal) -> None:
    terminal.logind.fault = Fault("hold")
    mark = terminal.events.mark()

    def signals_come_while_the_name_is_read() -> None:
        terminal.events.wait_for(target="logind", member="Get", count=2, after=mark)
        terminal.daemon.push_online()
        terminal.daemon.push_policy({"type": 1201})
        terminal.logind.release()

    terminal.start_agent(ready=signals_come_while_the_name_is_read)
    next_notification(terminal, mark)
    next_status(terminal, mark, count=2)
    assert announcements(terminal, mark) == [
        ("UpdateUserInfo", ("zhang.wei", 20001)),
        ("SendUserStatus", (1, "zhang.wei")),
        ("UpdateUserInfo", ("zhang.wei", 20001)),
        ("SendUserStatus", (1, "zhang.wei")),
    ]
    terminal.advance(60)
    terminal.events.wait_for(target="logind", member="Terminate", after=mark)
