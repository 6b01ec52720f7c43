"""The check for an expiring password, once at the start."""

from __future__ import annotations

import json

import pytest

from sandbox.machine.users import User
from sandbox.platform.server import HttpFault
from sandbox.terminal import Terminal
from tests.e2e.wire import SHUTDOWN_NOTICE, log_lines, next_notification, start_agent

USER = "zhang.wei"
NOTICE = "用户密码快过期了！！"
# The notice's timer is coarse: half a second more or less.
EARLY, LATE = 59, 61


def test_notice_comes_a_minute_after_the_start(terminal: Terminal) -> None:
    terminal.platform.password_tip(USER, "您的密码还有3天过期")
    mark = start_agent(terminal)
    terminal.advance(EARLY)
    assert terminal.events.all(member="Notify", after=mark) == []
    terminal.advance(LATE - EARLY)
    notice = next_notification(terminal, mark)
    assert (notice.application, notice.summary, notice.body) == ("提醒", "提醒", "您的密码还有3天过期")
    assert (notice.actions, notice.hints, notice.timeout) == ([], {}, -1)
    assert log_lines(terminal, mark).count(f"{NOTICE}") == 3


def test_request_names_the_user_without_the_first_at_sign(terminal: Terminal) -> None:
    assert terminal.platform
    terminal.files.write_accounts(User("@@zhang@wei", terminal.user.uid))
    mark = start_agent(terminal)
    line, body = terminal.events.wait_for(kind="http", member="tips", after=mark).args
    assert line == "GET /uim/v3/client/password/tips HTTP/1.1"
    assert body == '{\n    "username": "@zhang@wei"\n}\n'


def test_password_that_does_not_expire_is_logged_twice_and_not_shown(terminal: Terminal) -> None:
    assert terminal.platform
    mark = start_agent(terminal)
    terminal.advance(LATE)
    assert terminal.events.all(member="Notify", after=mark) == []
    assert log_lines(terminal, mark).count(NOTICE) == 2


@pytest.mark.parametrize("body", [b"", b"garbage", b'{"code":0,"data":{"result":true'], ids=repr)
def test_reply_that_is_no_json_is_ignored(terminal: Terminal, body: bytes) -> None:
    terminal.platform.faults["tips"] = HttpFault("reply", 200, body)
    mark = start_agent(terminal)
    terminal.advance(LATE)
    assert NOTICE not in log_lines(terminal, mark)
    assert terminal.events.all(member="Notify", after=mark) == []


def test_hanging_check_delays_the_start_by_the_transfer_limit(terminal: Terminal) -> None:
    terminal.platform.faults["tips"] = HttpFault("hang")
    mark = terminal.events.mark()
    terminal.start_agent(ready=lambda: terminal.events.wait_for(kind="http", member="tips", after=mark))
    terminal.daemon.push_policy({"type": 1300})
    terminal.jump(30)
    assert next_notification(terminal, mark).body == SHUTDOWN_NOTICE


def test_tips_that_carry_a_count_ask_for_messages_at_once_and_mark_them_read(terminal: Terminal) -> None:
    terminal.platform.post_message(USER, "T", "C")
    body = json.dumps({"code": 0, "data": {"result": False, "msg": ""}}).encode()
    terminal.platform.faults["tips"] = HttpFault("reply", 200, body, {"X-Total-Count": "2"})
    mark = start_agent(terminal)
    assert next_notification(terminal, mark).summary == "T"
    assert [message["read_at"] != "" for message in terminal.platform.messages()] == [True]
