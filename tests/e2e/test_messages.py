"""The platform's messages: polled, shown as notifications, marked read."""

from __future__ import annotations

import json
from typing import Any

import pytest

from sandbox.periods import BEFORE_ANY_POLL, SURELY_FIRST_POLL, SURELY_NEXT_POLL
from sandbox.platform.server import HttpFault
from sandbox.terminal import Terminal
from tests.e2e.messages import USER, answer_always, as_reply, begin_poll, message, poll, requests
from tests.e2e.wire import log_lines, next_notification


@pytest.fixture
def session(terminal: Terminal) -> Terminal:
    """A terminal with a platform, and an agent that is ready."""
    assert terminal.platform
    terminal.start_agent()
    return terminal


def test_message_is_shown_with_its_action_and_marked_read(session: Terminal) -> None:
    uuid = session.platform.post_message(USER, "升级", "今晚, 22:00", sender="admin")
    mark = poll(session)

    sent = session.platform.messages()[0]
    notification = next_notification(session, mark)
    assert (notification.application, notification.summary, notification.body) == (
        "升级",
        "升级",
        "今晚, 22:00",
    )
    assert notification.actions == ["_open", "查看"]
    action = f"/usr/bin/velkm,升级,今晚, 22:00,admin,{sent['created_at']}"
    assert notification.hints == {"x-norix-action-_open": action}
    assert notification.timeout == 0

    receipt = requests(session, "read", mark)
    assert [json.loads(event.args[1]) for event in receipt] == [{"uuid": uuid}]
    assert sent["read_at"]


def test_receipt_goes_out_before_the_notification(session: Terminal) -> None:
    session.platform.post_message(USER, "T", "C")
    mark = poll(session)
    read = session.events.wait_for(kind="http", member="read", after=mark)
    notify = session.events.wait_for(member="Notify", after=mark)
    assert read.time < notify.time


def test_list_request_is_written_to_the_letter(session: Terminal) -> None:
    mark = poll(session)
    request = requests(session, "list", mark)[0]
    line, body = request.args
    target, _, seconds = line.removesuffix(" HTTP/1.1").rpartition("=")
    assert target == (
        f"GET /notification/v2/list?uid={USER}&is_not_read=1&limit=1&offset=0"
        "&order=create_at&desc=1&timestaps"
    )
    assert seconds.isdecimal()
    assert body == ""
    assert dict(request.detail["headers"])["Host"] == "platform.box:8443"
    logged = [text for text in log_lines(session, mark) if text.startswith("Rquest[GET]: ")]
    assert logged == [f'Rquest[GET]:  "https://platform.box:8443{line.split()[1]}"']


def test_receipt_is_written_to_the_letter(session: Terminal) -> None:
    uuid = session.platform.post_message(USER, "T", "C")
    mark = poll(session)
    line, body = requests(session, "read", mark)[0].args
    assert line.startswith("PUT /notification/v2/read?timestaps=")
    assert line.removesuffix(" HTTP/1.1").rpartition("=")[2].isdecimal()
    assert body == f'{{"uuid":"{uuid}"}}'
    url = f"https://platform.box:8443{line.split()[1]}"
    logged = json.dumps(body)
    assert f'---------Qurl "{url}" :qJsonBuf: {logged}' in log_lines(session, mark)


def test_all_messages_are_drained_one_after_the_other(session: Terminal) -> None:
    titles = [f"message {number}" for number in range(7)]
    for title in titles:
        session.platform.post_message(USER, title, "text")
    mark = poll(session)

    road = [
        event.member
        for event in session.events.all(source="velks", after=mark)
        if event.member in ("list", "read", "Notify")
    ]
    assert road == ["list", "read", "Notify"] * 7
    assert [event.args[3] for event in session.events.all(member="Notify", after=mark)] == titles
    assert all(sent["read_at"] for sent in session.platform.messages())


def test_messages_of_others_stay_where_they_are(session: Terminal) -> None:
    session.platform.post_message("li.na", "T", "C")
    mark = poll(session)
    assert [event.member for event in session.events.all(kind="http", after=mark)] == ["list"]


def test_poll_is_drawn_anew_and_never_early(terminal: Terminal) -> None:
    assert terminal.platform
    terminal.start_agent()
    mark = terminal.events.mark()
    terminal.advance(BEFORE_ANY_POLL)
    assert requests(terminal, "list", mark) == []
    terminal.advance(SURELY_FIRST_POLL - BEFORE_ANY_POLL)
    assert len(requests(terminal, "list", mark)) == 1
    terminal.advance(BEFORE_ANY_POLL)
    assert len(requests(terminal, "list", mark)) == 1
    terminal.advance(SURELY_NEXT_POLL - BEFORE_ANY_POLL)
    assert len(requests(terminal, "list", mark)) == 2


@pytest.mark.parametrize(
    ("running", "locked", "state"), [(True, False, 0), (False, True, 1), (True, True, 0)]
)
def test_nothing_is_polled_while_the_screen_is_locked_or_saved(
    session: Terminal, running: bool, locked: bool, state: int
) -> None:
    session.platform.post_message(USER, "T", "C")
    session.screensaver.set("isRunning", running)
    session.session_manager.set("Locked", locked)
    mark = poll(session)
    assert session.events.all(kind="http", after=mark) == []
    assert f"screen state-----: {state}" in log_lines(session, mark)

    session.screensaver.set("isRunning", False)
    session.session_manager.set("Locked", False)
    assert len(requests(session, "list", poll(session))) >= 1


def test_drain_goes_on_although_the_screen_is_locked_meanwhile(session: Terminal) -> None:
    for number in range(3):
        session.platform.post_message(USER, f"message {number}", "text")
    session.platform.faults["list"] = HttpFault.hang()
    mark = begin_poll(session)
    session.session_manager.set("Locked", True)
    session.platform.release()
    session.sync()
    assert len(requests(session, "read", mark)) == 3


def test_read_message_is_neither_shown_nor_marked(session: Terminal) -> None:
    answer_always(session, as_reply(message(read_at="2026-01-01"), message(uuid="u2", title="new")))
    mark = poll(session)
    assert [event.args[3] for event in session.events.all(member="Notify", after=mark)] == ["new"]
    assert [event.args[1] for event in requests(session, "read", mark)] == ['{"uuid":"u2"}']


@pytest.mark.parametrize("status", [200, 204, 404, 500])
def test_status_is_not_looked_at(session: Terminal, status: int) -> None:
    body = b"" if status == 204 else as_reply(message())
    answer_always(session, body, status=status)
    mark = poll(session)
    assert len(session.events.all(member="Notify", after=mark)) == (0 if status == 204 else 1)


@pytest.mark.parametrize(
    "body",
    [
        b"",
        b"garbage",
        b"{}",
        b'{"messages":[{"uuid":"u"}]}',
        b"[]",
        b"null",
        b"5",
        b'[{"uuid":"u"}',
        b"\xff\xfe[",
    ],
    ids=repr,
)
def test_body_that_is_no_list_shows_nothing(session: Terminal, body: bytes) -> None:
    answer_always(session, body)
    mark = poll(session)
    assert requests(session, "read", mark) == []
    assert session.events.all(member="Notify", after=mark) == []


@pytest.mark.parametrize("element", [7, "text", None, [], {}], ids=repr)
def test_element_without_fields_is_a_message_of_empty_fields(session: Terminal, element: Any) -> None:
    answer_always(session, as_reply(element))
    mark = poll(session)
    assert requests(session, "read", mark)[0].args[1] == '{"uuid":""}'
    notification = next_notification(session, mark)
    assert (notification.summary, notification.body) == ("", "")
    assert notification.hints == {"x-norix-action-_open": "/usr/bin/velkm,,,,"}


@pytest.mark.parametrize("value", [1767225600, None, True, {}], ids=repr)
def test_field_that_is_no_text_reads_as_empty(session: Terminal, value: Any) -> None:
    answer_always(session, as_reply(message(read_at=value, uuid=value)))
    mark = poll(session)
    assert requests(session, "read", mark)[0].args[1] == '{"uuid":""}'
    assert next_notification(session, mark).summary == "T"


@pytest.mark.parametrize(
    "text",
    ["%1 %2 %8", 'a "quoted" text', "a,b,,c", "line\nbreak\ttab", " blanks  inside ", "终端😀", "a\\b"],
    ids=repr,
)
def test_unusual_values_are_shown_as_they_are(session: Terminal, text: str) -> None:
    answer_always(session, as_reply(message(title=text, content=text, send_uid=text, created_at=text)))
    mark = poll(session)
    notification = next_notification(session, mark)
    assert (notification.summary, notification.body) == (text, text)
    joined = ",".join(["/usr/bin/velkm", text, text, text, text])
    assert notification.hints == {"x-norix-action-_open": joined}


def test_uuid_goes_into_the_receipt_without_escaping(session: Terminal) -> None:
    session.contracts.allow_violations("read-receipt")
    answer_always(session, as_reply(message(uuid='%1"},{"uuid":"二')))
    mark = poll(session)
    assert requests(session, "read", mark)[0].args[1] == '{"uuid":"%1"},{"uuid":"二"}'


COUNTS = [
    ({"X-Total-Count": "2"}, True),
    ({"X-Total-Count": " 3 "}, True),
    ({"X-Total-Count": "1"}, False),
    ({"X-Total-Count": "0"}, False),
    ({"X-Total-Count": "-5"}, False),
    ({"X-Total-Count": "many"}, False),
    ({"X-Total-Count": "2x"}, False),
    ({"X-Total-Count": "0x10"}, False),
    ({"X-Total-Count": "99999999999999"}, False),
    ({"X-Total-Count": ""}, False),
    ({"x-total-count": "5"}, False),
    ({"X-TOTAL-COUNT": "5"}, False),
    ({"X-Total-Limit": "5", "X-Total-Offset": "5"}, False),
    ({"X-Total-Count": "5\r\nX-Total-Count: 1"}, False),
    ({"X-Total-Count": "1\r\nX-Total-Count: 5"}, True),
    ({}, False),
]


@pytest.mark.parametrize("body", [b"garbage", b"[]", b""], ids=repr)
@pytest.mark.parametrize(("headers", "follows"), COUNTS, ids=str)
def test_count_above_one_asks_for_the_next_whatever_the_body(
    session: Terminal, headers: dict[str, str], follows: bool, body: bytes
) -> None:
    answer_always(session, body, headers)
    session.events.subscribe(lambda event: answer_always(session, b"[]") if event.member == "list" else None)
    mark = poll(session)
    assert len(requests(session, "list", mark)) == (2 if follows else 1)


def test_count_is_logged(session: Terminal) -> None:
    answer_always(session, b"", {"X-Total-Count": "1"})
    mark = poll(session)
    lines = log_lines(session, mark)
    assert lines[lines.index("OnRecvMsg") + 1] == "msg----count: 1"
