"""The platform as a client of its HTTPS interface sees it."""

from __future__ import annotations

import json
import ssl
from http.client import HTTPSConnection, RemoteDisconnected
from typing import Any

import pytest

from sandbox.machine import layout
from sandbox.platform.server import HttpFault
from sandbox.terminal import Terminal

LIST = "/notification/v2/list?uid=zhang&is_not_read=1&limit=1&offset=0&order=create_at&desc=1&timestaps=1"
READ = "/notification/v2/read?timestaps=1"
TIPS = "/uim/v3/client/password/tips"


def request(
    method: str, path: str, body: Any = None, with_certificate: bool = True
) -> tuple[Any, str | None]:
    """The JSON reply to a request with the terminal's certificates, and its count of messages."""
    connection = connect(with_certificate)
    try:
        connection.request(method, path, None if body is None else json.dumps(body))
        reply = connection.getresponse()
        return json.loads(reply.read()), reply.getheader("X-Total-Count")
    finally:
        connection.close()


def connect(with_certificate: bool = True) -> HTTPSConnection:
    """A connection to the platform, with the terminal's certificate or without."""
    context = ssl.create_default_context(cafile=str(layout.SERVER_CERTIFICATE))
    if with_certificate:
        context.load_cert_chain(layout.CLIENT_CERTIFICATE, layout.CLIENT_KEY)
    return HTTPSConnection(layout.PLATFORM_HOST, layout.PLATFORM_PORT, context=context, timeout=20)


def test_unread_messages_come_one_at_a_time_with_their_count(terminal: Terminal) -> None:
    first = terminal.platform.post_message("zhang", "one", "text")
    terminal.platform.post_message("zhang", "two", "text")
    terminal.platform.post_message("li", "three", "text")

    messages, count = request("GET", LIST)

    assert ([message["uuid"] for message in messages], count) == ([first], "2")


def test_a_message_marked_read_is_listed_no_more(terminal: Terminal) -> None:
    uuid = terminal.platform.post_message("zhang", "one", "text")

    request("PUT", READ, {"uuid": uuid})

    assert request("GET", LIST) == ([], "0")


@pytest.mark.parametrize("user, data", [("zhang", (True, "soon")), ("li", (False, ""))])
def test_password_tip_is_for_its_user_only(terminal: Terminal, user: str, data: tuple[bool, str]) -> None:
    terminal.platform.password_tip("zhang", "soon")

    reply, _ = request("GET", TIPS, {"username": user})

    assert reply == {"code": 0, "data": {"result": data[0], "msg": data[1]}}


def test_a_client_without_certificate_is_refused(terminal: Terminal) -> None:
    terminal.platform.post_message("zhang", "one", "text")

    with pytest.raises(OSError):
        request("GET", LIST, with_certificate=False)

    failed = terminal.events.wait_for(kind="http")
    assert failed.member == "tls"


def test_a_fault_of_one_route_spares_the_others(terminal: Terminal) -> None:
    terminal.platform.faults["list"] = HttpFault("reply", 500, b'"broken"')

    assert (request("GET", LIST)[0], request("GET", TIPS, {"username": "li"})[0]["code"]) == ("broken", 0)


def test_a_platform_that_left_refuses_until_it_appears_again(terminal: Terminal) -> None:
    uuid = terminal.platform.post_message("zhang", "one", "text")
    terminal.platform.leave()
    with pytest.raises(ConnectionRefusedError):
        request("GET", LIST)

    terminal.platform.appear()

    assert [message["uuid"] for message in request("GET", LIST)[0]] == [uuid]


def test_a_connection_that_was_open_when_the_platform_left_breaks_when_it_is_used(terminal: Terminal) -> None:
    assert terminal.platform
    connection = connect()
    connection.request("GET", LIST)
    connection.getresponse().read()

    terminal.platform.leave()
    mark = terminal.events.mark()
    connection.request("GET", LIST)

    with pytest.raises(RemoteDisconnected):
        connection.getresponse()
    assert not terminal.events.all(after=mark)
    connection.close()


def test_what_comes_to_the_platform_and_what_it_answers_is_recorded_in_order(terminal: Terminal) -> None:
    terminal.platform.post_message("zhang", "one", "text")
    terminal.platform.password_tip("zhang", "soon")
    request("GET", LIST)

    recorded = [event for event in terminal.events.all() if event.kind in ("post", "http", "reply")]
    assert [event.member for event in recorded] == ["message", "tip", "list", "reply"]
    assert recorded[-1].args[:2] == ("list", 200)


def test_every_request_is_recorded_with_the_clients_name(terminal: Terminal) -> None:
    terminal.platform.post_message("zhang", "one", "text")
    request("PUT", READ, {"uuid": "none"})

    recorded = terminal.events.wait_for(kind="http", member="read")
    assert recorded.args == (f"PUT {READ} HTTP/1.1", '{"uuid": "none"}')
    assert recorded.detail["client"] == "terminal"
