"""What the daemon uploads to the platform when sessions hand it over."""

from __future__ import annotations

import json
from typing import Any, Iterator

import pytest

from sandbox.bus.stranger import Stranger
from sandbox.fakes import daemon
from sandbox.platform.server import HttpFault
from sandbox.terminal import Terminal

CHANGES = "https://%1:%2/uim/v3/client/upinfo_log"
INVENTORY = "https://%1:%2/uim/v3/client/upload_info"


@pytest.fixture
def caller(terminal: Terminal) -> Iterator[Stranger]:
    """A session of the daemon."""
    stranger = Stranger(terminal.system_bus)
    yield stranger
    stranger.close()


def hand_over(caller: Stranger, url: str, report: Any) -> None:
    """Give the daemon a report to upload."""
    text = report if isinstance(report, str) else json.dumps(report, ensure_ascii=False)
    caller.call(
        daemon.INTERFACE, daemon.PATH, daemon.INTERFACE, "onUploadFinished", url, text, signature="ss"
    )


def change(name: str) -> dict[str, Any]:
    """A report of one program."""
    return {"type": 2002, "payload": {"type": 1, "software_name": name}}


def inventory(*names: str) -> dict[str, Any]:
    """A report of all programs."""
    return {"type": 1103, "payload": {"machine_id": "1", "list": [{"name": name} for name in names]}}


def test_nothing_is_uploaded_unless_the_daemon_is_told_to(terminal: Terminal, caller: Stranger) -> None:
    assert terminal.platform
    hand_over(caller, INVENTORY, inventory("Editor"))
    terminal.daemon.uploads_to(terminal.platform)
    hand_over(caller, CHANGES, change("Mail"))

    first = terminal.events.wait_for(source="daemon", target="platform")
    assert first.member == "software_change"


def test_uploads_go_out_in_order_as_they_were_handed_over(terminal: Terminal, caller: Stranger) -> None:
    terminal.daemon.uploads_to(terminal.platform)
    hand_over(caller, CHANGES, change("编辑器"))
    hand_over(caller, INVENTORY, inventory("编辑器"))

    reply = terminal.events.wait_for(kind="reply", target="daemon", count=2)
    uploads = terminal.events.all(source="daemon", target="platform")
    assert [upload.args[0] for upload in uploads] == [
        "POST /uim/v3/client/upinfo_log HTTP/1.1",
        "POST /uim/v3/client/upload_info HTTP/1.1",
    ]
    assert uploads[0].args[1] == json.dumps(change("编辑器"), ensure_ascii=False)
    assert (("commonName", "terminal"),) in uploads[0].detail["client"]
    assert reply.args[:2] == ("inventory", 200)


def test_the_platform_keeps_every_change_and_the_last_inventory(terminal: Terminal, caller: Stranger) -> None:
    terminal.daemon.uploads_to(terminal.platform)
    before = (terminal.platform.software_changes(), terminal.platform.inventory())
    for report in (change("Editor"), change("Mail")):
        hand_over(caller, CHANGES, report)
    for report in (inventory("Editor"), inventory("Editor", "Mail")):
        hand_over(caller, INVENTORY, report)
    terminal.events.wait_for(kind="reply", target="daemon", count=4)

    assert before == ([], None)
    assert [known["software_name"] for known in terminal.platform.software_changes()] == ["Editor", "Mail"]
    assert terminal.platform.inventory() == [{"name": "Editor"}, {"name": "Mail"}]


@pytest.mark.parametrize(
    "report", ["no JSON", "[]", {"type": 1103}, {"type": 2002, "payload": {"list": []}}], ids=str
)
def test_the_platform_refuses_what_is_no_inventory(terminal: Terminal, caller: Stranger, report: Any) -> None:
    terminal.daemon.uploads_to(terminal.platform)
    hand_over(caller, INVENTORY, report)

    assert terminal.events.wait_for(kind="reply", target="daemon").args[1] == 400
    assert terminal.platform.inventory() is None


def test_a_platform_that_hangs_does_not_hold_up_the_daemon(terminal: Terminal, caller: Stranger) -> None:
    terminal.platform.fault = HttpFault.hang()
    terminal.daemon.uploads_to(terminal.platform)

    hand_over(caller, INVENTORY, inventory())
    terminal.events.wait_for(source="daemon", kind="http", member="inventory")
    hand_over(caller, INVENTORY, inventory())

    assert len(terminal.events.all(kind="call", member="onUploadFinished")) == 2
    assert not terminal.events.all(kind="reply")


@pytest.mark.parametrize("url", [INVENTORY, "%1 %2", "https://%1:port/"])
def test_an_upload_that_does_not_reach_the_platform_is_told_of(
    terminal: Terminal, caller: Stranger, url: str
) -> None:
    terminal.daemon.uploads_to(terminal.platform)
    terminal.platform.leave()

    hand_over(caller, url, inventory())

    failed = terminal.events.wait_for(source="daemon", target="platform", kind="upload")
    assert failed.member == "failed"
