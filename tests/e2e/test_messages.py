"""The platform's messages: polled, shown as notifications, marked read."""

from __future__ import annotations

import json
from typing import Any

import pytest

from sandbox.periods import BEFORE_ANY_POLL, SURELY_FIRST_POLL, SURELY_NEXT_POLL
from sandbox.platform.server import HttpFault
from sandbox.terminal import Terminal
from tests.e2e.messages import USER, answer_always, as_reply, begin_poll, message, poll, requests, titles
from tests.e2e.wire import Notification, log_lines, next_notification


def test_message_is_shown_with_its_action_and_marked_read(polling: Terminal) -> None:
    uuid = polling.platform.post_message(USER, "升级", "今晚, 22:00", sender="admin")
    mark = poll(polling)

    sent = polling.platform.messages()[0]
    action = f"/usr/bin/velkm,升级,今晚, 22:00,admin,{sent['created_at']}"
    assert next_notification(polling, mark) == Notification(
        "升级",
        0,
        "velkw",
        "升级",
        "今晚, 22:00",
        ["_open", "查看"],
        {"x-norix-action-_open": action},
        0,
    )

    receipt = requests(polling, "read", mark)
    assert [json.loads(event.args[1]) for event in receipt] == [{"uuid": uuid}]
    assert sent["read_at"]


def test_list_request_is_written_to_the_letter(polling: Terminal) -> None:
    mark = poll(polling)
    request = requests(polling, "list", mark)[0]
    line, body = request.args
    target, _, seconds = line.removesuffix(" HTTP/1.1").rpartition("=")
    assert target == (
        f"GET /notification/v2/list?uid={USER}&is_not_read=1&limit=1&offset=0"
        "&order=create_at&desc=1&timestaps"
    )
    assert seconds.isdecimal()
    assert body == ""
    assert dict(request.detail["headers"])["Host"] == "platform.box:8443"
    logged = [text for text in log_lines(polling, mark) if text.startswith("Rquest[GET]: ")]
    assert logged == [f'Rquest[GET]:  "https://platform.box:8443{line.split()[1]}"']


def test_receipt_is_written_to_the_letter(polling: Terminal) -> None:
    uuid = polling.platform.post_message(USER, "T", "C")
    mark = poll(polling)
    line, body = requests(polling, "read", mark)[0].args
    assert line.startswith("PUT /notification/v2/read?timestaps=")
    assert line.removesuffix(" HTTP/1.1").rpartition("=")[2].isdecimal()
    assert body == f'{{"uuid":"{uuid}"}}'
    url = f"https://platform.box:8443{line.split()[1]}"
    logged = json.dumps(body)
    assert f'---------Qurl "{url}" :qJsonBuf: {logged}' in log_lines(polling, mark)


def test_all_messages_are_drained_one_after_the_other(polling: Terminal) -> None:
    posted = [f"message {number}" for number in range(7)]
    for title in posted:
        polling.platform.post_message(USER, title, "text")
    mark = poll(polling)

    order = [
        event.member
        for event in polling.events.all(source="velks", after=mark)
        if event.member in ("list", "read", "Notify")
    ]
    assert order == ["list", "read", "Notify"] * 7
    assert titles(polling, mark) == posted
    assert all(sent["read_at"] for sent in polling.platform.messages())


def test_messages_of_others_stay_where_they_are(polling: Terminal) -> None:
    polling.platform.post_message("li.na", "T", "C")
    mark = poll(polling)
    assert [event.member for event in polling.events.all(kind="http", after=mark)] == ["list"]


def test_poll_is_drawn_anew_and_never_early(polling: Terminal) -> None:
    mark = polling.events.mark()
    polling.advance(BEFORE_ANY_POLL)
    assert requests(polling, "list", mark) == []
    polling.advance(SURELY_FIRST_POLL - BEFORE_ANY_POLL)
    assert len(requests(polling, "list", mark)) == 1
    polling.advance(BEFORE_ANY_POLL)
    assert len(requests(polling, "list", mark)) == 1
    polling.advance(SURELY_NEXT_POLL - BEFORE_ANY_POLL)
    assert len(requests(polling, "list", mark)) == 2


@pytest.mark.parametrize(
    ("running", "locked", "state"), [(True, False, 0), (False, True, 1), (True, True, 0)]
)
def test_nothing_is_polled_while_the_screen_is_locked_or_saved(
    polling: Terminal, running: bool, locked: bool, state: int
) -> None:
    polling.platform.post_message(USER, "T", "C")
    polling.screensaver.set("isRunning", running)
    polling.session_manager.set("Locked", locked)
    mark = poll(polling)
    assert polling.events.all(kind="http", after=mark) == []
    assert f"screen state-----: {state}" in log_lines(polling, mark)

    polling.screensaver.set("isRunning", False)
    polling.session_manager.set("Locked", False)
    assert len(requests(polling, "list", poll(polling))) >= 1


def test_drain_goes_on_although_the_screen_is_locked_meanwhile(polling: Terminal) -> None:
    for number in range(3):
        polling.platform.post_message(USER, f"message {number}", "text")
    polling.platform.faults["list"] = HttpFault("hang")
    mark = begin_poll(polling)
    polling.session_manager.set("Locked", True)
    polling.platform.release()
    polling.sync()
    assert len(requests(polling, "read", mark)) == 3


@pytest.mark.parametrize("status", [200, 204, 404, 500])
def test_status_is_not_looked_at(polling: Terminal, status: int) -> None:
    body = b"" if status == 204 else as_reply(message())
    answer_always(polling, body, status=status)
    mark = poll(polling)
    assert titles(polling, mark) == ([] if status == 204 else ["T"])


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
def test_body_that_is_no_list_shows_nothing(polling: Terminal, body: bytes) -> None:
    answer_always(polling, body)
    mark = poll(polling)
    assert (requests(polling, "read", mark), titles(polling, mark)) == ([], [])


@pytest.mark.parametrize("element", [7, "text", None, [], {}], ids=repr)
def test_element_without_fields_is_a_message_of_empty_fields(polling: Terminal, element: Any) -> None:
    answer_always(polling, as_reply(element))
    mark = poll(polling)
    assert requests(polling, "read", mark)[0].args[1] == '{"uuid":""}'
    notification = next_notification(polling, mark)
    assert (notification.summary, notification.body) == ("", "")
    assert notification.hints == {"x-norix-action-_open": "/usr/bin/velkm,,,,"}


@pytest.mark.parametrize("value", [1767225600, None, True, {}], ids=repr)
def test_field_that_is_no_text_reads_as_empty(polling: Terminal, value: Any) -> None:
    answer_always(polling, as_reply(message(read_at=value, uuid=value)))
    mark = poll(polling)
    assert requests(polling, "read", mark)[0].args[1] == '{"uuid":""}'
    assert next_notification(polling, mark).summary == "T"


@pytest.mark.parametrize(
    "text",
    ["%1 %2 %8", 'a "quoted" text', "a,b,,c", "line\nbreak\ttab", " blanks  inside ", "终端😀", "a\\b"],
    ids=repr,
)
def test_unusual_values_are_shown_as_they_are(polling: Terminal, text: str) -> None:
    answer_always(polling, as_reply(message(title=text, content=text, send_uid=text, created_at=text)))
    mark = poll(polling)
    notification = next_notification(polling, mark)
    assert (notification.summary, notification.body) == (text, text)
    joined = ",".join(["/usr/bin/velkm", text, text, text, text])
    assert notification.hints == {"x-norix-action-_open": joined}


def test_uuid_goes_into_the_receipt_without_escaping(polling: Terminal) -> None:
    polling.contracts.allow_violations("read-receipt")
    answer_always(polling, as_reply(message(uuid='%1"},{"uuid":"二')))
    mark = poll(polling)
    assert requests(polling, "read", mark)[0].args[1] == '{"uuid":"%1"},{"uuid":"二"}'


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
    polling: Terminal, headers: dict[str, str], follows: bool, body: bytes
) -> None:
    answer_always(polling, body, headers)
    polling.events.subscribe(lambda event: answer_always(polling, b"[]") if event.member == "list" else None)
    mark = poll(polling)
    assert len(requests(polling, "list", mark)) == (2 if follows else 1)


def test_count_is_logged(polling: Terminal) -> None:
    answer_always(polling, b"", {"X-Total-Count": "1"})
    mark = poll(polling)
    lines = log_lines(polling, mark)
    assert lines[lines.index("OnRecvMsg") + 1] == "msg----count: 1"
