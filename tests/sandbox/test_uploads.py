"""What the daemon uploads to the platform when sessions hand it over."""

from __future__ import annotations

import json
from typing import Any

import pytest

from sandbox.bus.stranger import Stranger
from sandbox.fakes import daemon
from sandbox.platform.server import HttpFault
from sandbox.terminal import Terminal

CHANGES = "https://%1:%2/uim/v3/client/upinfo_log"
INVENTORY = "https://%1:%2/uim/v3/client/upload_info"


def hand_over(on_system: Stranger, url: str, report: Any) -> None:
    """Give the daemon a report to upload."""
    text = report if isinstance(report, str) else json.dumps(report, ensure_ascii=False)
    on_system.call(
        daemon.INTERFACE, daemon.PATH, daemon.INTERFACE, "onUploadFinished", url, text, signature="ss"
    )


def change(name: str) -> dict[str, Any]:
    """A report of one program."""
    return {"type": 2002, "payload": {"type": 1, "software_name": name}}


def inventory(*names: str) -> dict[str, Any]:
    """A report of all programs."""
    return {"type": 1103, "payload": {"machine_id": "1", "list": [{"name": name} for name in names]}}


def test_nothing_is_uploaded_before_the_daemon_has_a_platform(
    terminal: Terminal, on_system: Stranger
) -> None:
    assert terminal.platform
    hand_over(on_system, INVENTORY, inventory("Editor"))
    terminal.daemon.uploads_to(terminal.platform)
    hand_over(on_system, CHANGES, change("Mail"))

    first = terminal.events.wait_for(source="daemon", target="platform")
    assert first.member == "software_change"


def test_uploads_go_out_in_order_as_they_were_handed_over(terminal: Terminal, on_system: Stranger) -> None:
    terminal.daemon.uploads_to(terminal.platform)
    hand_over(on_system, CHANGES, change("编辑器"))
    hand_over(on_system, INVENTORY, inventory("编辑器"))

    reply = terminal.events.wait_for(kind="reply", target="daemon", count=2)
    uploads = terminal.events.all(source="daemon", target="platform")
    assert [upload.args[0] for upload in uploads] == [
        "POST /uim/v3/client/upinfo_log HTTP/1.1",
        "POST /uim/v3/client/upload_info HTTP/1.1",
    ]
    assert uploads[0].args[1] == json.dumps(change("编辑器"), ensure_ascii=False)
    assert uploads[0].detail["client"] == "terminal"
    assert reply.args[:2] == ("inventory", 200)


def test_the_platform_keeps_every_change_and_the_last_inventory(
    terminal: Terminal, on_system: Stranger
) -> None:
    terminal.daemon.uploads_to(terminal.platform)
    before = (list(terminal.platform.software_changes), terminal.platform.inventory)
    for report in (change("Editor"), change("Mail")):
        hand_over(on_system, CHANGES, report)
    for report in (inventory("Editor"), inventory("Editor", "Mail")):
        hand_over(on_system, INVENTORY, report)
    terminal.events.wait_for(kind="reply", target="daemon", count=4)

    assert before == ([], None)
    assert [known["software_name"] for known in terminal.platform.software_changes] == ["Editor", "Mail"]
    assert terminal.platform.inventory == [{"name": "Editor"}, {"name": "Mail"}]


@pytest.mark.parametrize(
    "report", ["no JSON", "[]", {"type": 1103}, {"type": 2002, "payload": {"list": []}}], ids=str
)
def test_the_platform_refuses_what_is_no_inventory(
    terminal: Terminal, on_system: Stranger, report: Any
) -> None:
    terminal.daemon.uploads_to(terminal.platform)
    hand_over(on_system, INVENTORY, report)

    assert terminal.events.wait_for(kind="reply", target="daemon").args[1] == 400
    assert terminal.platform.inventory is None


def test_a_platform_that_hangs_does_not_hold_up_the_daemon(terminal: Terminal, on_system: Stranger) -> None:
    terminal.platform.fault = HttpFault("hang")
    terminal.daemon.uploads_to(terminal.platform)

    hand_over(on_system, INVENTORY, inventory())
    terminal.events.wait_for(source="daemon", kind="http", member="inventory")
    hand_over(on_system, INVENTORY, inventory())

    assert len(terminal.events.all(kind="call", member="onUploadFinished")) == 2
    assert not terminal.events.all(kind="reply")


@pytest.mark.parametrize("url", [INVENTORY, "%1 %2", "https://%1:port/"])
def test_an_upload_that_does_not_reach_the_platform_is_recorded(
    terminal: Terminal, on_system: Stranger, url: str
) -> None:
    terminal.daemon.uploads_to(terminal.platform)
    terminal.platform.leave()

    hand_over(on_system, url, inventory())

    failed = terminal.events.wait_for(source="daemon", target="platform", kind="upload")
    assert failed.member == "failed"
