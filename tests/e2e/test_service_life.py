"""Services that come late, restart, go for good or answer nonsense, and what the agent makes of each."""

from __future__ import annotations

import pytest

from sandbox.fakes.exported import Reply
from sandbox.fakes.fault import Fault
from sandbox.terminal import Terminal
from tests.e2e.wire import (
    FIVE_MINUTES,
    begin_countdown,
    carries_out_policies,
    forced_actions,
    next_status,
    push,
    push_online,
    start_agent,
    warnings,
)

ACTIVE, LOCKED, SCREEN_SAVER = 1, 2, 3


def forward(terminal: Terminal, marker: str) -> None:
    """Push a policy that is meant for the session policy service."""
    terminal.daemon.push_policy({"type": 5, "marker": marker})
    terminal.sync()


def forwarded(terminal: Terminal) -> list[str]:
    """The markers of the policies that the session policy service was given."""
    calls = terminal.events.all(target="policy_service", member="onPolicyMsg")
    return [call.args[0].split('"')[-2] for call in calls]


def asked_for(terminal: Terminal) -> tuple[int, str]:
    """Status and name that the agent reports when the daemon asks."""
    mark = push_online(terminal)
    status, name = next_status(terminal, mark)
    return status, name


def test_policies_go_to_the_policy_service_that_is_there_at_the_time(terminal: Terminal) -> None:
    terminal.policy_service.leave()
    terminal.start_agent()
    mark = terminal.events.mark()
    forward(terminal, "too early")
    terminal.policy_service.appear()
    forward(terminal, "first")
    terminal.policy_service.restart()
    forward(terminal, "second")
    terminal.policy_service.leave()
    forward(terminal, "too late")
    terminal.policy_service.appear()
    forward(terminal, "third")
    assert (forwarded(terminal), warnings(terminal, mark)) == (["first", "second", "third"], [])


@pytest.mark.parametrize("reply", [Reply("a{sv}", ({},)), Reply("(is)", ((1, "x"),))], ids=str)
def test_what_the_policy_service_replies_is_not_looked_at(terminal: Terminal, reply: Reply) -> None:
    terminal.policy_service.answers["onPolicyMsg"] = reply
    terminal.start_agent()
    mark = terminal.events.mark()
    forward(terminal, "first")
    terminal.policy_service.fault = Fault("fail")
    forward(terminal, "second")
    assert (forwarded(terminal), warnings(terminal, mark)) == (["first", "second"], [])


def test_the_name_is_read_from_the_login_manager_that_is_there_at_the_time(terminal: Terminal) -> None:
    terminal.logind.leave()
    mark = start_agent(terminal)
    assert next_status(terminal, mark) == (ACTIVE, "")
    terminal.logind.appear()
    assert asked_for(terminal) == (ACTIVE, "zhang.wei")
    terminal.logind.leave()
    terminal.logind.rename("@other")
    assert asked_for(terminal) == (ACTIVE, "")
    terminal.logind.appear()
    assert asked_for(terminal) == (ACTIVE, "other")


def test_the_identity_of_the_start_is_announced_although_the_login_manager_came_later(
    terminal: Terminal,
) -> None:
    terminal.logind.leave()
    terminal.start_agent()
    terminal.logind.appear()
    mark = terminal.events.mark()
    asked_for(terminal)
    announced = terminal.events.wait_for(target="daemon", member="UpdateUserInfo", after=mark)
    assert announced.args == ("", 0)


@pytest.mark.parametrize("name", ["logind", "daemon"])
def test_a_service_that_restarts_in_the_last_minute_does_not_stop_the_countdown(
    session: Terminal, name: str
) -> None:
    mark = begin_countdown(session)
    session.fakes[name].restart()
    session.advance(60)
    assert forced_actions(session, mark) == ["Terminate"]


def test_a_login_manager_that_has_gone_by_the_last_second_is_one_warning(session: Terminal) -> None:
    mark = begin_countdown(session)
    session.logind.leave()
    session.advance(60)
    assert [line.partition(":")[0] for line in warnings(session, mark)] == ["cannot call Terminate"]
    session.logind.appear()
    session.advance(FIVE_MINUTES)
    assert forced_actions(session, mark) == []


def test_an_identity_service_that_comes_after_the_exit_stays_as_it_is(session: Terminal) -> None:
    session.identity.leave()
    mark = begin_countdown(session, 1200)
    session.identity.appear()
    session.advance(60)
    assert forced_actions(session, mark) == ["Reboot"]
    assert session.identity.value("Enable") is True


def test_an_identity_service_that_was_restarted_is_switched_off(session: Terminal) -> None:
    session.identity.restart()
    mark = begin_countdown(session, 1200)
    session.events.wait_for(target="identity", member="Set", after=mark)
    assert session.identity.value("Enable") is False


def test_notices_go_to_the_notification_service_that_is_there_at_the_time(terminal: Terminal) -> None:
    terminal.notifications.leave()
    terminal.start_agent()
    for change in (terminal.notifications.appear, terminal.notifications.restart):
        change()
        carries_out_policies(terminal)


def test_a_notification_service_that_has_gone_does_not_keep_the_log_out_back(session: Terminal) -> None:
    session.notifications.leave()
    mark = push(session, {"type": 1201})
    session.advance(60)
    assert forced_actions(session, mark) == ["Terminate"]
    assert [line.partition("(")[0] for line in warnings(session, mark)] == ["--@@@@-- QDBusError"]


@pytest.mark.parametrize(
    ("name", "member", "reply", "code", "action"),
    [
        ("notifications", "Notify", Reply("", ()), 1201, "Terminate"),
        ("notifications", "Notify", Reply("a{sv}", ({},)), 1201, "Terminate"),
        ("notifications", "Notify", Reply("s", ("one",)), 1201, "Terminate"),
        ("identity", "Set", Reply("a{sv}", ({},)), 1200, "Reboot"),
    ],
)
def test_any_reply_lets_the_forced_action_come(
    session: Terminal, name: str, member: str, reply: Reply, code: int, action: str
) -> None:
    session.fakes[name].answers[member] = reply
    mark = push(session, {"type": code})
    session.advance(60)
    assert (forced_actions(session, mark), warnings(session, mark)) == ([action], [])


@pytest.mark.parametrize(("name", "status"), [("screensaver", SCREEN_SAVER), ("session_manager", LOCKED)])
def test_the_screen_is_as_the_service_says_that_is_there_at_the_time(
    terminal: Terminal, name: str, status: int
) -> None:
    {"screensaver": terminal.screensaver.run, "session_manager": terminal.session_manager.lock}[name]()
    fake = terminal.fakes[name]
    fake.leave()
    terminal.start_agent()
    reports = []
    for change in (fake.appear, fake.restart, fake.leave, fake.appear):
        change()
        reports.append(asked_for(terminal)[0])
    assert reports == [status, status, ACTIVE, status]
