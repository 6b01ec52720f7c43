"""Policy messages: what each code does in the session of a domain user."""

from __future__ import annotations

import json

import pytest

from sandbox import policies
from sandbox.policies import FORWARDED_CODES, Policy
from sandbox.terminal import Terminal
from tests.e2e.wire import (
    SHUTDOWN_NOTICE,
    Notification,
    begin_countdown,
    comes_in_a_minute,
    forced_actions,
    log_lines,
    next_notification,
    push,
    settled,
)

REMINDER = "提醒"


def plain(body: str, timeout: int) -> Notification:
    """The agent's plain notification with its own title."""
    return Notification(REMINDER, 0, "velkw", REMINDER, body, [], {}, timeout)


@pytest.mark.parametrize("policy", policies.with_action("WarnThenLogOut"), ids=str)
def test_user_is_warned_and_logged_out_after_a_minute(session: Terminal, policy: Policy) -> None:
    mark = push(session, {"type": policy.code, "payload": {"uid": session.user.uid}})

    assert next_notification(session, mark) == plain(policy.notice, timeout=-1)
    comes_in_a_minute(session, "Terminate", mark)
    session.advance(120)
    assert forced_actions(session, mark) == ["Terminate"]


BYTE_ORDER_MARK = "\ufeff"


@pytest.mark.parametrize(
    ("app_id", "text"),
    [
        ("", '{"type":1300}'),
        ("another", '{"type":1300}'),
        ("终端", '{"type":1300}'),
        ("box", '{"type":1300,"reason":"停用"}'),  # outside Latin-1
        ("box", BYTE_ORDER_MARK + '{"type":1300}'),  # the mark is lost on the bus
    ],
)
def test_policy_is_obeyed_whatever_its_application_and_characters(
    session: Terminal, app_id: str, text: str
) -> None:
    mark = push(session, text, app_id)
    assert next_notification(session, mark).body == SHUTDOWN_NOTICE


@pytest.mark.parametrize(
    ("code", "action", "path", "interface", "args"),
    [
        (1201, "Terminate", "/org/freedesktop/login1/session/auto", "org.freedesktop.login1.Session", ()),
        (1200, "Reboot", "/org/freedesktop/login1", "org.freedesktop.login1.Manager", (False,)),
    ],
    ids=["of the caller's own session", "without asking for a password"],
)
def test_login_manager_is_asked_for_the_forced_action(
    session: Terminal, code: int, action: str, path: str, interface: str, args: tuple[object, ...]
) -> None:
    mark = begin_countdown(session, code)
    session.advance(60)

    call = session.events.wait_for(target="logind", member=action, after=mark)
    assert (call.detail["path"], call.detail["interface"], call.args) == (path, interface, args)


@pytest.mark.parametrize("policy", policies.for_one_account(), ids=str)
@pytest.mark.parametrize(
    "payload",
    [
        {"payload": {"uid": 20002}},
        {"payload": {"uid": "20001"}},
        {"payload": {"uid": 20001.5}},
        {"payload": {}},
        {"payload": 20001},
        {"uid": 20001},
        {},
    ],
    ids=str,
)
def test_account_policy_for_anyone_else_does_nothing(
    session: Terminal, policy: Policy, payload: dict[str, object]
) -> None:
    mark = push(session, json.dumps({"type": policy.code, **payload}))

    assert settled(session, mark) == []
    session.advance(60)
    assert forced_actions(session, mark) == []


def test_account_check_is_logged_with_both_uids(session: Terminal) -> None:
    mark = push(session, {"type": 1202, "payload": {"uid": 7}})
    session.sync()
    assert "sendUID : 7 , localUID: 20001 ,flag : false" in log_lines(session, mark)


@pytest.mark.parametrize("policy", policies.with_action("Notify", "RequestPasswordChange"), ids=str)
def test_notice_is_a_notice_only(session: Terminal, policy: Policy) -> None:
    mark = push(session, {"type": policy.code, "payload": {"uid": session.user.uid}})

    assert next_notification(session, mark) == plain(policy.notice, timeout=0)
    assert [event.member for event in settled(session, mark)] == ["Notify"]
    session.advance(60)
    assert forced_actions(session, mark) == []


@pytest.mark.parametrize(
    "payload",
    [
        *(f'{{"type":{code}}}' for code in FORWARDED_CODES),
        '{"type":-1}',
        '{"type":"1201"}',
        '{"type":1201.5}',
        '{"type":99999999999}',
        '{"type":null}',
        '{"type":{"type":1201}}',
        ' {"type" : 5,\n "text": "a \\"quoted\\" %1 text", "payload":{"uid":20001} }\n',
        '{"type":5,"text":"终端😀"}',
    ],
)
def test_any_other_code_is_forwarded_unchanged(session: Terminal, payload: str) -> None:
    mark = push(session, payload)

    done = settled(session, mark)
    assert [(event.target, event.member, event.args) for event in done] == [
        ("policy_service", "onPolicyMsg", (payload,))
    ]
    assert done[0].detail["signature"] == "s"
    assert done[0].detail["path"] == "/com/norix/velk/prys"


@pytest.mark.parametrize(
    "payload",
    [
        "",
        "no JSON",
        "null",
        "5",
        '[{"type":1201}]',
        '{"Type":1201}',
        '{"payload":{"type":1201}}',
        '{"type":1201',
        '{"type":1201} x',
        '{"type":1201,"name":"é"}',
        '{"type":1201，"name":"a"}',
    ],
)
def test_text_that_is_no_policy_is_logged_and_ignored(session: Terminal, payload: str) -> None:
    mark = push(session, payload)

    assert settled(session, mark) == []
    quoted = json.dumps(payload, ensure_ascii=False)
    assert f"onPolicyMsg ---------payload: {quoted}" in log_lines(session, mark)


def test_leading_byte_order_mark_alone_is_not_forwarded(session: Terminal) -> None:
    text = f'{{"type":5,"text":"{BYTE_ORDER_MARK}"}}'
    mark = push(session, BYTE_ORDER_MARK + text)
    assert [event.args for event in settled(session, mark)] == [(text,)]


def test_second_byte_order_mark_makes_a_policy_unreadable(session: Terminal) -> None:
    mark = push(session, 2 * BYTE_ORDER_MARK + '{"type":1300}')
    assert settled(session, mark) == []


def test_second_policy_restarts_the_minute_and_its_kind_wins(session: Terminal) -> None:
    mark = begin_countdown(session, 1200)
    session.advance(30)
    session.daemon.push_policy({"type": 1201})
    next_notification(session, mark, count=2)

    comes_in_a_minute(session, "Terminate", mark)
    session.advance(60)
    assert forced_actions(session, mark) == ["Terminate"]


@pytest.mark.parametrize("later", [{"type": 1300}, {"type": 1304}, {"type": 5}, "no JSON"], ids=str)
def test_no_other_message_stops_the_countdown(session: Terminal, later: str | dict[str, object]) -> None:
    mark = begin_countdown(session)
    session.advance(30)
    session.daemon.push_policy(later)
    session.advance(30)
    assert forced_actions(session, mark) == ["Terminate"]
