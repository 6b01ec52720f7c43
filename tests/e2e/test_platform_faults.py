"""A platform that is down, slow, lying or not the real one: the agent logs it, goes on, and recovers."""

from __future__ import annotations

import subprocess
from pathlib import Path
from tempfile import mkdtemp
from typing import Callable, Iterator

import pytest

from sandbox.machine import layout
from sandbox.periods import TRANSFER_LIMIT
from sandbox.platform.certificates import Authority, CertificateFiles
from sandbox.platform.server import HttpFault, Platform, trust
from sandbox.terminal import Terminal
from tests.e2e.messages import USER, begin_poll, poll, titles
from tests.e2e.wire import carries_out_policies, log_lines, next_notification, start_agent, warnings


def next_poll_is_well(terminal: Terminal) -> None:
    """Assert that a message posted now arrives with the next poll."""
    terminal.platform.post_message(USER, "later", "text")
    assert next_notification(terminal, poll(terminal)).summary == "later"


@pytest.mark.parametrize("fault", [HttpFault("close"), HttpFault("cut")], ids=lambda fault: fault.kind)
def test_broken_reply_is_one_warning_and_shows_nothing(polling: Terminal, fault: HttpFault) -> None:
    polling.platform.post_message(USER, "T", "C")
    polling.platform.fault = fault
    mark = poll(polling)
    (warning,) = warnings(polling, mark)
    assert warning.startswith("HTTP GET without a response: ")
    assert titles(polling, mark) == []

    polling.platform.release()
    carries_out_policies(polling)
    assert next_notification(polling, poll(polling)).summary == "T"


def test_platform_that_is_down_is_asked_again_with_every_poll(terminal: Terminal) -> None:
    terminal.platform.leave()
    mark = start_agent(terminal)
    assert len(warnings(terminal, mark)) == 1
    mark = poll(terminal)
    assert len(warnings(terminal, mark)) == 1
    carries_out_policies(terminal)
    terminal.platform.appear()
    next_poll_is_well(terminal)


def test_hanging_platform_costs_the_transfer_limit_and_no_more(polling: Terminal) -> None:
    polling.platform.post_message(USER, "T", "C")
    polling.platform.fault = HttpFault("hang")
    mark = begin_poll(polling)
    polling.daemon.push_policy({"type": 5})
    polling.jump(TRANSFER_LIMIT)
    polling.events.wait_for(target="policy_service", member="onPolicyMsg", after=mark)
    polling.sync()
    assert len(warnings(polling, mark)) == 1

    polling.platform.release()
    assert next_notification(polling, poll(polling)).summary == "T"


def test_hanging_receipt_does_not_keep_the_message_from_being_shown(polling: Terminal) -> None:
    polling.platform.post_message(USER, "T", "C")
    polling.platform.faults["read"] = HttpFault("hang")
    mark = begin_poll(polling, "read")
    polling.jump(TRANSFER_LIMIT)
    assert next_notification(polling, mark).summary == "T"


def test_reply_left_over_counts_are_not_read_again(polling: Terminal) -> None:
    """A reply that counted five is followed by none at all: the chain ends there."""
    polling.platform.faults["list"] = HttpFault("reply", 200, b"[]", {"X-Total-Count": "5"})

    def break_platform(event: object) -> None:
        if getattr(event, "member", "") == "list":
            polling.platform.faults["list"] = HttpFault("close")

    polling.events.subscribe(break_platform)
    mark = poll(polling)
    assert len(warnings(polling, mark)) == 1


def gets_nothing(terminal: Terminal, after: int) -> None:
    """Assert that the server saw no request, and that the agent has warned of each and goes on."""
    assert {event.member for event in terminal.events.all(kind="http", after=after)} <= {"tls"}
    assert len(warnings(terminal, after)) == 2
    carries_out_policies(terminal)


WRONG_CERTIFICATES: dict[str, Callable[[], CertificateFiles]] = {
    "unknown authority": lambda: Authority(Path(mkdtemp()), "Stranger").issue_server(layout.PLATFORM_HOST),
    "another host": lambda: trust().authority.issue_server("elsewhere.box"),
    "expired": lambda: trust().authority.issue_server(layout.PLATFORM_HOST, expired=True),
}


@pytest.mark.parametrize("issue", WRONG_CERTIFICATES.values(), ids=WRONG_CERTIFICATES)
def test_platform_with_a_wrong_certificate_gets_no_request(
    terminal: Terminal, issue: Callable[[], CertificateFiles]
) -> None:
    terminal.platform.close()
    stranger = Platform(terminal.events, server=issue())
    try:
        mark = start_agent(terminal)
        poll(terminal)
        gets_nothing(terminal, mark)
    finally:
        stranger.close()


def test_terminal_without_its_certificate_gets_nothing_and_goes_on(terminal: Terminal) -> None:
    assert terminal.platform
    layout.CLIENT_CERTIFICATE.unlink()
    mark = start_agent(terminal)
    poll(terminal)
    gets_nothing(terminal, mark)


WEB_SERVER = """
ServerRoot {folder}
ServerName {host}
PidFile {folder}/pid
DefaultRuntimeDir {folder}
ErrorLog /dev/stderr
Listen {front}
LoadModule mpm_event_module /usr/lib/apache2/modules/mod_mpm_event.so
LoadModule authz_core_module /usr/lib/apache2/modules/mod_authz_core.so
LoadModule http2_module /usr/lib/apache2/modules/mod_http2.so
LoadModule proxy_module /usr/lib/apache2/modules/mod_proxy.so
LoadModule proxy_http_module /usr/lib/apache2/modules/mod_proxy_http.so
LoadModule ssl_module /usr/lib/apache2/modules/mod_ssl.so
Protocols h2 http/1.1
SSLEngine on
SSLCertificateFile {server.certificate}
SSLCertificateKeyFile {server.key}
SSLCACertificateFile "{authority}"
SSLVerifyClient require
SSLProxyEngine on
SSLProxyMachineCertificateFile {folder}/terminal.pem
ProxyPass / https://{host}:{back}/
ProxyPreserveHost on
"""
WEB_SERVER_PORT = 9443


@pytest.fixture
def web_server(terminal: Terminal) -> Iterator[int]:
    """A common web server in front of the platform; the result is its port."""
    folder = Path(mkdtemp())
    known = trust()
    # It wants certificate and key in one file.
    both = (known.terminal.certificate, known.terminal.key)
    (folder / "terminal.pem").write_text("".join(path.read_text() for path in both))
    (folder / "server.conf").write_text(
        WEB_SERVER.format(
            folder=folder,
            front=WEB_SERVER_PORT,
            back=terminal.platform.port,
            host=layout.PLATFORM_HOST,
            server=known.server,
            authority=known.authority.certificate,
        )
    )
    process = subprocess.Popen(["/usr/sbin/apache2", "-D", "FOREGROUND", "-f", folder / "server.conf"])
    subprocess.run(
        ["bash", "-c", f"until : 2>/dev/null < /dev/tcp/127.0.0.1/{WEB_SERVER_PORT}; do :; done"],
        check=True,
        timeout=20,
    )
    yield WEB_SERVER_PORT
    process.terminate()
    process.wait()


def test_messages_come_through_a_web_server_that_offers_http_2(terminal: Terminal, web_server: int) -> None:
    terminal.files.write_platform_address(web_server)
    for title in ("first", "second", "third"):
        terminal.platform.post_message(USER, title, "text")
    terminal.start_agent()
    mark = poll(terminal)
    assert titles(terminal, mark) == ["first", "second", "third"]
    assert all(sent["read_at"] for sent in terminal.platform.messages())


@pytest.mark.parametrize(
    "content",
    [None, b"", b"garbage", b"[]", b'{"server_host":"platform.box"}', b'{"server_port":"8443"}'],
    ids=repr,
)
def test_without_host_and_port_the_platform_is_never_asked(terminal: Terminal, content: bytes | None) -> None:
    assert terminal.platform
    if content is None:
        layout.USERINFO.unlink()
    else:
        terminal.files.write_userinfo(content)
    mark = start_agent(terminal)
    poll(terminal)
    assert terminal.events.all(kind="http", after=mark) == []
    assert "---------load cfg" not in log_lines(terminal, mark)
    carries_out_policies(terminal)


@pytest.mark.local_user
def test_local_user_is_logged_and_the_platform_never_asked(terminal: Terminal) -> None:
    assert terminal.platform
    mark = start_agent(terminal)
    poll(terminal)
    assert terminal.events.all(kind="http", after=mark) == []
    assert f'is not ldap user: "{terminal.user.name}"' in log_lines(terminal, mark)
