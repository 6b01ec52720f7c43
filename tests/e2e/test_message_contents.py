"""Unusual contents of the platform's replies are shown as they are, or are harmless."""

from __future__ import annotations

import json
from typing import Any

import pytest

from sandbox.terminal import Terminal
from tests.e2e.messages import answer_always, poll
from tests.e2e.wire import next_notification

READ = "2026-01-01 00:00:00"


def replied(terminal: Terminal, body: str) -> int:
    """Let the agent have this reply to its next list request; the mark before it."""
    answer_always(terminal, body.encode())
    terminal.start_agent()
    return poll(terminal)


def titled(title: str, **fields: Any) -> dict[str, Any]:
    """A message of these fields alone."""
    return {"uuid": title, "title": title, **fields}


def receipts_and_notices(terminal: Terminal, after: int) -> list[tuple[str, str]]:
    """Receipts and notifications in the order in which they came, each with its message's title."""
    return [
        (event.member, json.loads(event.args[1])["uuid"] if event.member == "read" else event.args[3])
        for event in terminal.events.all(source="velks", after=after)
        if event.member in ("read", "Notify")
    ]


def test_messages_of_one_reply_are_marked_and_shown_one_by_one(terminal: Terminal) -> None:
    messages = [titled("a"), titled("b", read_at=READ), titled("c"), titled("a")]
    mark = replied(terminal, json.dumps(messages))
    shown = [(member, title) for title in ("a", "c", "a") for member in ("read", "Notify")]
    assert receipts_and_notices(terminal, mark) == shown


@pytest.mark.parametrize(
    ("text", "shown"),
    [
        ('"\\u0000end"', ""),
        ('"start\\u0000end"', "start"),
        ('"a\\u0001\\u001b\\u007f\\u0085b"', "a\x01\x1b\x7f\x85b"),
        ('"a\\uffff\\ufffeb"', "a\uffff\ufffeb"),
        ('"\\ud83d\\ude00"', "😀"),
    ],
)
def test_unusual_characters_reach_the_notification_service(terminal: Terminal, text: str, shown: str) -> None:
    mark = replied(terminal, f'[{{"uuid":"u","title":"T","content":{text}}}]')
    assert next_notification(terminal, mark).body == shown


@pytest.mark.parametrize("text", ['"\\ud83d"', '"\\ude00\\ud83d"', '"a\\ud800b"'])
def test_half_a_character_does_not_keep_the_next_message_from_being_shown(
    terminal: Terminal, text: str
) -> None:
    mark = replied(terminal, f'[{{"uuid":"u","title":{text}}},{{"uuid":"v","title":"next"}}]')
    assert next_notification(terminal, mark, count=2).summary == "next"


def test_message_of_a_megabyte_is_shown_whole(terminal: Terminal) -> None:
    content = "终端😀" * 100_000
    mark = replied(terminal, json.dumps([titled("T", content=content)], ensure_ascii=False))
    assert next_notification(terminal, mark).body == content


@pytest.mark.parametrize(
    "body",
    ["[" * 100_000, '[{"a":' * 100_000, "[" * 2000 + "]" * 2000],
    ids=["arrays", "objects", "closed arrays"],
)
def test_deeply_nested_reply_is_harmless(terminal: Terminal, body: str) -> None:
    mark = replied(terminal, body)
    assert receipts_and_notices(terminal, mark) == []
    terminal.sync()
