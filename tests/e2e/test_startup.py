"""What the agent tells the daemon when the session begins and when the daemon comes back."""

from __future__ import annotations

import pytest

from sandbox.machine.users import DOMAIN_USER, LOCAL_USER
from sandbox.terminal import Terminal


def reports(terminal: Terminal, after: int = 0) -> list[tuple[object, ...]]:
    """Member and arguments of the session reports that reached the daemon, in their order."""
    members = ("UpdateUserInfo", "SendUserStatus")
    calls = terminal.events.all(kind="call", source="velks", target="daemon", after=after)
    return [(call.member, *call.args) for call in calls if call.member in members]


def test_announces_the_user_and_an_active_session(terminal: Terminal) -> None:
    terminal.start_agent()

    name = DOMAIN_USER.plain_name
    assert reports(terminal) == [("UpdateUserInfo", name, DOMAIN_USER.uid), ("SendUserStatus", 1, name)]


@pytest.mark.local_user
def test_announces_a_local_user(terminal: Terminal) -> None:
    terminal.start_agent()

    name = LOCAL_USER.plain_name
    assert reports(terminal) == [("UpdateUserInfo", name, LOCAL_USER.uid), ("SendUserStatus", 1, name)]


def test_removes_every_at_sign_of_the_login_managers_name(terminal: Terminal) -> None:
    terminal.logind.rename("@zhang@wei@corp")

    terminal.start_agent()

    assert ("UpdateUserInfo", "zhangweicorp", DOMAIN_USER.uid) in reports(terminal)


def test_announces_an_unknown_user_as_empty_and_goes_on(terminal: Terminal) -> None:
    terminal.logind.forget_user()

    terminal.start_agent()

    assert reports(terminal) == [("UpdateUserInfo", "", 0), ("SendUserStatus", 1, "")]


def test_announces_itself_to_a_daemon_that_comes_late(terminal: Terminal) -> None:
    terminal.daemon.leave()
    terminal.start_agent()

    terminal.daemon.appear(announce=True)
    terminal.sync()

    name = DOMAIN_USER.plain_name
    assert reports(terminal) == [("UpdateUserInfo", name, DOMAIN_USER.uid), ("SendUserStatus", 1, name)]


def test_announces_itself_again_to_a_daemon_that_restarts(terminal: Terminal) -> None:
    terminal.start_agent()
    terminal.session_manager.lock()
    before_restart = terminal.events.mark()

    terminal.daemon.leave()
    terminal.daemon.appear(announce=True)
    terminal.sync()

    name = DOMAIN_USER.plain_name
    again = [("UpdateUserInfo", name, DOMAIN_USER.uid), ("SendUserStatus", 2, name)]
    assert reports(terminal, after=before_restart) == again


def test_reports_the_session_every_five_minutes(terminal: Terminal) -> None:
    terminal.start_agent()
    at_start = terminal.events.mark()

    terminal.advance(299)
    early = reports(terminal, after=at_start)
    terminal.advance(1)

    assert (early, reports(terminal, after=at_start)) == ([], [("SendUserStatus", 1, DOMAIN_USER.plain_name)])
