"""What the agent reports to the daemon when the session begins."""

from __future__ import annotations

import pytest

from sandbox.machine.users import DOMAIN_USER, LOCAL_USER
from sandbox.terminal import Terminal


def reports(terminal: Terminal, after: int = 0) -> list[tuple[object, ...]]:
    """Member and arguments of the session reports that reached the daemon, in their order."""
    members = ("UpdateUserInfo", "SendUserStatus")
    calls = terminal.events.all(kind="call", source="velks", target="daemon", after=after)
    return [(call.member, *call.args) for call in calls if call.member in members]


def test_announces_the_user_and_an_active_session(session: Terminal) -> None:
    name = DOMAIN_USER.plain_name
    assert reports(session) == [("UpdateUserInfo", name, DOMAIN_USER.uid), ("SendUserStatus", 1, name)]


@pytest.mark.local_user
def test_announces_a_local_user(session: Terminal) -> None:
    name = LOCAL_USER.plain_name
    assert reports(session) == [("UpdateUserInfo", name, LOCAL_USER.uid), ("SendUserStatus", 1, name)]


def test_removes_every_at_sign_of_the_login_managers_name(terminal: Terminal) -> None:
    terminal.logind.rename("@zhang@wei@corp")

    terminal.start_agent()

    assert ("UpdateUserInfo", "zhangweicorp", DOMAIN_USER.uid) in reports(terminal)


def test_announces_an_unknown_user_as_empty_and_goes_on(terminal: Terminal) -> None:
    terminal.logind.forget_user()

    terminal.start_agent()

    assert reports(terminal) == [("UpdateUserInfo", "", 0), ("SendUserStatus", 1, "")]
