"""A real web server as the platform: nginx that offers HTTP/2 and requires the terminal's certificate."""

from __future__ import annotations

import json

import pytest
import trustme

from tests.booted.machine import Machine
from tests.booted.patience import wait_for
from tests.booted.platform import LIST, MESSAGES, TIPS, Platform

USER = "zhang@corp.example"


@pytest.mark.parametrize("protocol", ["TLSv1.2", "TLSv1.3"])
def test_server_that_offers_http_2_is_spoken_to_by_http_1(
    machine: Machine, platform: Platform, protocol: str
) -> None:
    platform.start(protocol)
    assert platform.agreed_protocol("h2,http/1.1") == "h2"
    machine.log_in(USER)
    request = wait_for("the check of the password", lambda: platform.requests(TIPS))[0]
    seen = (request.status, request.http, request.tls, request.client)
    assert seen == ("200", "HTTP/1.1", protocol, "SUCCESS")


def test_connection_that_the_server_has_closed_is_made_anew(hasty: Machine, platform: Platform) -> None:
    platform.start(keepalive="1s")
    mark = hasty.mark()
    hasty.log_in(USER)
    shown = hasty.wait_for_event(lambda event: event.member == "Notify", mark)
    assert json.loads(MESSAGES)[0]["content"] in str(shown.args)
    asked = platform.requests(TIPS) + platform.requests(LIST)
    assert {request.status for request in asked} == {"200"}
    assert len({request.connection for request in asked}) > 1


def test_certificate_of_another_authority_is_refused_and_named(machine: Machine, platform: Platform) -> None:
    platform.give_terminal_a_certificate(trustme.CA())
    platform.start()
    machine.log_in(USER)
    request = wait_for("the check of the password", lambda: platform.requests(TIPS))[0]
    assert (request.status, request.client.split(":")[0]) == ("400", "FAILED")
    assert "does not accept this terminal's certificate" in machine.check(USER)
