"""A local account, uid 10000 or below: account and password policies are not for it."""

from __future__ import annotations

import pytest

from sandbox import policies
from sandbox.policies import Policy
from sandbox.terminal import Terminal
from tests.e2e.wire import begin_countdown, forced_actions, push, settled

pytestmark = pytest.mark.local_user


@pytest.mark.parametrize("policy", policies.for_domain_users(), ids=str)
def test_policy_for_domain_users_does_nothing(session: Terminal, policy: Policy) -> None:
    mark = push(session, {"type": policy.code, "payload": {"uid": session.user.uid}})
    assert settled(session, mark) == []
    session.advance(60)
    assert forced_actions(session, mark) == []


def test_account_check_is_not_even_made(session: Terminal) -> None:
    mark = push(session, {"type": 1202, "payload": {"uid": session.user.uid}})
    session.sync()
    assert session.events.all(lambda event: "sendUID" in event.args[0], kind="log", after=mark) == []


def test_disabled_terminal_logs_a_local_user_out_too(session: Terminal) -> None:
    mark = begin_countdown(session)
    session.advance(60)
    assert forced_actions(session, mark) == ["Terminate"]


def test_domain_exit_reboots_under_a_local_user_too(session: Terminal) -> None:
    mark = push(session, {"type": 1200})
    session.events.wait_for(target="identity", member="Set", after=mark)
    session.advance(60)
    assert forced_actions(session, mark) == ["Reboot"]
