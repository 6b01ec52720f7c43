"""velks-check on certificates, key and platform: each way in which the agent cannot get messages."""

from __future__ import annotations

import pytest

from sandbox.machine import layout
from sandbox.platform.certificates import Authority
from sandbox.platform.server import HttpFault, Platform
from sandbox.terminal import Terminal
from tests.e2e.checkreport import install_pair, pair, findings

CERTIFICATES = {
    "platform authority": layout.SERVER_CERTIFICATE,
    "terminal certificate": layout.CLIENT_CERTIFICATE,
    "terminal key": layout.CLIENT_KEY,
}
NOT_ACCEPTED = "answers, but does not accept this terminal's certificate or this user"
BROKEN = b"-----BEGIN CERTIFICATE-----\nAAAA\n"


@pytest.mark.parametrize("subject", CERTIFICATES)
@pytest.mark.parametrize("content", [b"", b"no PEM\n", BROKEN])
def test_file_that_is_no_pem_is_bad(working: Terminal, subject: str, content: bytes) -> None:
    working.files.write(CERTIFICATES[subject], content)
    assert findings(working).line(subject, " in PEM form").result == "bad"


@pytest.mark.parametrize("subject", ["platform authority", "terminal certificate"])
@pytest.mark.parametrize(
    ("begins", "ends", "result", "words"),
    [
        (-30, -1, "bad", " expired on "),
        (2, 30, "bad", " is not valid before "),
        (-30, 10, "warning", " is only valid until "),
        (-30, 40, "good", " is valid until "),
    ],
)
def test_time_of_a_certificate_counts(
    working: Terminal, subject: str, begins: int, ends: int, result: str, words: str
) -> None:
    working.files.write(CERTIFICATES[subject], pair(begins, ends).certificate)
    assert findings(working).line(subject, words).result == result


@pytest.mark.parametrize(
    ("second", "text"),
    [(BROKEN, " in PEM form"), (pair(-30, -1).certificate, " expired on ")],
    ids=["broken", "expired"],
)
def test_bad_certificate_after_a_sound_one_counts(working: Terminal, second: bytes, text: str) -> None:
    path = layout.SERVER_CERTIFICATE
    working.files.write(path, path.read_bytes() + second)
    assert findings(working).line("platform authority", text).result == "bad"


def test_key_of_another_certificate_is_bad(working: Terminal) -> None:
    working.files.write(layout.CLIENT_KEY, pair().key)
    found = findings(working)
    assert found.line("terminal key", "does not match").result == "bad"
    assert found.line("terminal certificate").result == "good"


def test_key_with_a_password_is_bad(working: Terminal) -> None:
    install_pair(working, pair(password=b"secret"))
    assert findings(working).line("terminal key", "no unencrypted private key").result == "bad"


def test_platform_that_is_down_is_bad_with_the_reason(working: Terminal) -> None:
    working.platform.leave()
    line = findings(working).line("platform")
    assert line.result == "bad"
    assert line.text.startswith("does not answer: HTTP GET without a response: ")
    assert "refused" in line.text or "connect" in line.text


def test_platform_with_a_certificate_of_another_authority_is_bad(working: Terminal) -> None:
    certificate = Authority(layout.BOX / "stranger", "stranger").issue_server(layout.PLATFORM_HOST)
    working.platform.leave()
    stranger = Platform(working.events, working.platform.port, certificate)
    try:
        line = findings(working).line("platform")
    finally:
        stranger.close()
    assert line.result == "bad"
    assert "certificate" in line.text


def test_platform_that_rejects_the_terminals_certificate_is_bad(working: Terminal) -> None:
    install_pair(working, pair())
    found = findings(working)
    assert found.line("terminal key").result == "good"
    assert found.line("platform").text.startswith("does not answer: ")


@pytest.mark.parametrize(
    ("fault", "text"),
    [
        *(
            (HttpFault("reply", status), f"{NOT_ACCEPTED} (HTTP status {status})")
            for status in (400, 401, 403)
        ),
        (HttpFault("reply", 500, b"[]"), "answers with HTTP status 500 instead of messages"),
        (HttpFault("reply", 200, b"{}"), "answers with something other than messages"),
        (HttpFault("reply", 200, b"<html>"), "answers with something other than messages"),
    ],
)
def test_platform_that_answers_otherwise_is_bad(working: Terminal, fault: HttpFault, text: str) -> None:
    working.platform.fault = fault
    line = findings(working).line("platform")
    assert (line.result, line.text) == ("bad", text)


def test_platform_is_asked_for_the_user_as_the_agent_asks(working: Terminal) -> None:
    mark = working.events.mark()
    findings(working)
    (request,) = working.events.all(kind="http", after=mark)
    assert request.args[0] == "GET /notification/v2/list?uid=zhang.wei&is_not_read=1&limit=1 HTTP/1.1"
