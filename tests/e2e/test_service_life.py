"""Services that come late, restart, go for good or answer nonsense, and what the agent makes of each."""

from __future__ import annotations

import pytest

from sandbox.fakes.exported import Reply
from sandbox.fakes.fault import Fault
from sandbox.terminal import Terminal
from tests.e2e.wire import (
    FIVE_MINUTES,
    SHUTDOWN_NOTICE,
    forced_actions,
    next_notification,
    next_status,
)

ACTIVE, LOCKED, SCREEN_SAVER = 1, 2, 3
NOTICE = {"type": 1300}


def forward(terminal: Terminal, marker: str) -> None:
    """Push a policy that is meant for the session policy service."""
    terminal.daemon.push_policy({"type": 5, "marker": marker})
    terminal.sync()


def forwarded(terminal: Terminal) -> list[str]:
    """The markers of the policies that the session policy service was given."""
    calls = terminal.events.all(target="policy_service", member="onPolicyMsg")
    return [call.args[0].split('"')[-2] for call in calls]


def report(terminal: Terminal) -> tuple[int, str]:
    """Status and name that the daemon is told when it asks."""
    mark = terminal.events.mark()
    terminal.daemon.push_online()
    status, name = next_status(terminal, mark)
    return status, name


def warnings(terminal: Terminal, after: int) -> list[str]:
    """What the agent has warned of since a mark."""
    return [event.args[0] for event in terminal.events.all(kind="log", member="warning", after=after)]


def begin_countdown(terminal: Terminal) -> int:
    """Push a log-out and wait for its warning; the result is the mark before it."""
    mark = terminal.events.mark()
    terminal.daemon.push_policy({"type": 1201})
    next_notification(terminal, mark)
    terminal.sync()
    return mark


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
    terminal.policy_service.fault = Fault.fail()
    forward(terminal, "second")
    assert (forwarded(terminal), warnings(terminal, mark)) == (["first", "second"], [])


def test_the_login_manager_that_is_there_at_the_time_tells_the_name(terminal: Terminal) -> None:
    terminal.logind.leave()
    mark = terminal.events.mark()
    terminal.start_agent()
    assert next_status(terminal, mark) == (ACTIVE, "")
    terminal.logind.appear()
    assert report(terminal) == (ACTIVE, "zhang.wei")
    terminal.logind.leave()
    terminal.logind.rename("@other")
    assert report(terminal) == (ACTIVE, "")
    terminal.logind.appear()
    assert report(terminal) == (ACTIVE, "other")


def test_the_identity_of_the_start_is_announced_although_the_login_manager_came_later(
    terminal: Terminal,
) -> None:
    terminal.logind.leave()
    terminal.start_agent()
    terminal.logind.appear()
    mark = terminal.events.mark()
    report(terminal)
    announced = terminal.events.wait_for(target="daemon", member="UpdateUserInfo", after=mark)
    assert announced.args == ("", 0)


def test_a_login_manager_that_restarts_in_the_last_minute_ends_the_session(terminal: Terminal) -> None:
    terminal.start_agent()
    mark = begin_countdown(terminal)
    terminal.logind.restart()
    terminal.advance(60)
    assert forced_actions(terminal, mark) == ["Terminate"]


def test_a_login_manager_that_has_gone_by_the_last_second_is_one_warning(terminal: Terminal) -> None:
    terminal.start_agent()
    mark = begin_countdown(terminal)
    terminal.logind.leave()
    terminal.advance(60)
    assert [line.partition(":")[0] for line in warnings(terminal, mark)] == ["cannot call Terminate"]
    terminal.logind.appear()
    terminal.advance(FIVE_MINUTES)
    assert forced_actions(terminal, mark) == []


def test_a_countdown_goes_on_without_the_daemon_that_ordered_it(terminal: Terminal) -> None:
    terminal.start_agent()
    mark = begin_countdown(terminal)
    terminal.daemon.leave()
    terminal.daemon.appear()
    terminal.advance(60)
    assert forced_actions(terminal, mark) == ["Terminate"]


def leave_domain(terminal: Terminal) -> int:
    """Push the policy and wait for the step before the last; the result is the mark before it."""
    mark = terminal.events.mark()
    terminal.daemon.push_policy({"type": 1200})
    terminal.events.wait_for(target="daemon", member="onDomainConfig", after=mark)
    return mark


def test_an_identity_service_that_comes_after_the_exit_is_not_told(terminal: Terminal) -> None:
    terminal.start_agent()
    terminal.identity.leave()
    mark = leave_domain(terminal)
    terminal.identity.appear()
    terminal.advance(60)
    assert forced_actions(terminal, mark) == ["Reboot"]
    assert terminal.identity.value("Enable") is True


def test_an_identity_service_that_was_restarted_is_switched_off(terminal: Terminal) -> None:
    terminal.start_agent()
    terminal.identity.restart()
    mark = leave_domain(terminal)
    terminal.events.wait_for(target="identity", member="Set", after=mark)
    assert terminal.identity.value("Enable") is False


def test_an_identity_service_may_reply_what_it_likes(terminal: Terminal) -> None:
    terminal.start_agent()
    terminal.identity.answers["Set"] = Reply("a{sv}", ({},))
    mark = leave_domain(terminal)
    terminal.advance(60)
    assert (forced_actions(terminal, mark), warnings(terminal, mark)) == (["Reboot"], [])


def test_notices_go_to_the_notification_service_that_is_there_at_the_time(terminal: Terminal) -> None:
    terminal.notifications.leave()
    terminal.start_agent()
    for change in (terminal.notifications.appear, terminal.notifications.restart):
        change()
        mark = terminal.events.mark()
        terminal.daemon.push_policy(NOTICE)
        assert next_notification(terminal, mark).body == SHUTDOWN_NOTICE


def test_a_notification_service_that_has_gone_does_not_keep_the_log_out_back(terminal: Terminal) -> None:
    terminal.start_agent()
    terminal.notifications.leave()
    mark = terminal.events.mark()
    terminal.daemon.push_policy({"type": 1201})
    terminal.advance(60)
    assert forced_actions(terminal, mark) == ["Terminate"]
    assert [line.partition("(")[0] for line in warnings(terminal, mark)] == ["--@@@@-- QDBusError"]


@pytest.mark.parametrize("reply", [Reply("", ()), Reply("a{sv}", ({},)), Reply("s", ("one",))], ids=str)
def test_a_notification_service_may_reply_what_it_likes(terminal: Terminal, reply: Reply) -> None:
    terminal.start_agent()
    terminal.notifications.answers["Notify"] = reply
    mark = terminal.events.mark()
    terminal.daemon.push_policy({"type": 1201})
    terminal.advance(60)
    assert (forced_actions(terminal, mark), warnings(terminal, mark)) == (["Terminate"], [])


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
        reports.append(report(terminal)[0])
    assert reports == [status, status, ACTIVE, status]
