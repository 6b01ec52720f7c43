"""The reports of the terminal's software that the agent hands to the daemon for upload."""

from __future__ import annotations

import json

import pytest

from sandbox.fakes.exported import Reply
from sandbox.fakes.fault import Fault
from sandbox.fakes.launcher import LauncherItem
from sandbox.periods import DBUS_LIMIT
from sandbox.terminal import Terminal
from tests.e2e.software import (
    CHANGE,
    EDITOR,
    INVENTORY,
    PLAYER,
    announce,
    install,
    inventory_at_start,
    next_change,
    next_inventory,
    next_upload,
    now,
    uploads,
)
from tests.e2e.wire import log_lines


def test_inventory_is_compact_json_with_sorted_keys(terminal: Terminal) -> None:
    install(terminal, EDITOR, PLAYER)

    terminal.start_agent()

    arch = json.loads(uploads(terminal)[0][1])["payload"]["list"][0]["arch"]
    record = (
        '{"arch":"%s","installed_type":2,"name":"%s","package_name":"%s","software_id":-1,"version":"%s"}'
    )
    records = record % (arch, "Editor", "editor", "1") + "," + record % (arch, "播放器", "player", "2")
    whole = '{"payload":{"list":[%s],"machine_id":"box-file-machine-0001"},"type":1103}' % records
    assert uploads(terminal) == [(INVENTORY, whole)]


@pytest.mark.parametrize(("action", "code"), [("created", 1), ("update", 2)])
def test_change_is_compact_json_with_sorted_keys(terminal: Terminal, action: str, code: int) -> None:
    install(terminal, EDITOR, PLAYER)
    terminal.start_agent()
    mark = terminal.events.mark()

    terminal.launcher.announce(action, PLAYER)

    assert next_upload(terminal, CHANGE, mark) == (
        '{"payload":{"mac":"F4:0B:93:00:00:07","machine_id":"box-machine-0001","operated_at":"%s",'
        '"pc_ip":"192.168.1.7","pc_name":"box-terminal","software_name":"播放器","software_version":"2",'
        '"type":%d},"type":2002}'
    ) % (now(), code)


@pytest.mark.parametrize("action", ["created", "update"])
def test_change_is_followed_by_the_inventory(stocked_session: Terminal, action: str) -> None:
    stocked_session.packages.install("editor", "1.1")
    mark = announce(stocked_session, action, EDITOR)

    assert [url for url, _ in uploads(stocked_session, mark)] == [CHANGE, INVENTORY]
    assert next_change(stocked_session, mark)["software_version"] == "1.1"
    assert next_inventory(stocked_session, mark)[0]["version"] == "1.1"


@pytest.mark.parametrize("action", ["deleted", "Created", "UPDATE", "updated", " created", "", "创建"])
def test_any_other_action_reports_the_inventory_alone_and_asks_nothing(
    stocked_session: Terminal, action: str
) -> None:
    mark = announce(stocked_session, action, EDITOR)

    assert [url for url, _ in uploads(stocked_session, mark)] == [INVENTORY]
    assert stocked_session.events.all(member="GetMachineID") == []


def test_change_without_items_reports_the_change_alone(terminal: Terminal) -> None:
    terminal.packages.install("editor", "1")
    terminal.start_agent()

    announce(terminal, "created", EDITOR)

    assert [url for url, _ in uploads(terminal)] == [CHANGE]


def test_nothing_is_reported_of_an_empty_inventory(session: Terminal) -> None:
    announce(session, "deleted", EDITOR)

    assert uploads(session) == []


def test_records_come_in_the_launchers_order(terminal: Terminal) -> None:
    items = [LauncherItem(EDITOR.path, name) for name in ("z", "a", "M", "a")]
    terminal.packages.install("editor", "1")
    terminal.launcher.items = items

    assert [record["name"] for record in inventory_at_start(terminal)] == ["z", "a", "M", "a"]


@pytest.mark.parametrize(
    "name", ["", 'say "hi" \\ / \t', "\x7f\u2028\U0001f600", "n" * 100_000], ids=range(4)
)
def test_any_display_name_is_reported_as_it_is(terminal: Terminal, name: str) -> None:
    item = LauncherItem(EDITOR.path, name)
    install(terminal, item)
    terminal.start_agent()

    terminal.launcher.announce("created", item)

    assert next_change(terminal)["software_name"] == name
    assert next_inventory(terminal)[0]["name"] == name


def test_change_of_an_unknown_file_has_no_known_version(session: Terminal) -> None:
    session.launcher.announce("created", EDITOR)

    assert next_change(session)["software_version"] == "failed"


def test_change_has_the_time_and_the_alias_of_that_moment(session: Terminal) -> None:
    session.files.write_userinfo(terminal_name="another name")
    session.advance(61)

    session.launcher.announce("created", EDITOR)

    change = next_change(session)
    assert (change["operated_at"], change["pc_name"]) == (now(), "another name")


def test_change_has_the_time_of_the_sessions_zone(terminal: Terminal) -> None:
    """The terminal's clock shows the local time of the program's zone."""
    terminal.start_agent(extra_env={"TZ": "Asia/Shanghai"})

    terminal.launcher.announce("created", EDITOR)

    assert next_change(terminal)["operated_at"] == now()


def test_change_asks_the_daemon_for_the_machine_and_the_inventory_keeps_the_one_of_the_start(
    stocked_session: Terminal,
) -> None:
    stocked_session.files.write_machine_id("another-in-the-file")
    stocked_session.daemon.answers["GetMachineID"] = Reply("s", ("another-at-the-daemon",))
    mark = stocked_session.events.mark()

    stocked_session.launcher.announce("created", EDITOR)

    assert next_change(stocked_session, mark)["machine_id"] == "another-at-the-daemon"
    inventory = json.loads(next_upload(stocked_session, INVENTORY, mark))
    assert inventory["payload"]["machine_id"] == "box-file-machine-0001"


@pytest.mark.parametrize(
    ("signature", "value"), [("i", (7,)), ("b", (True,)), ("as", (["x"],)), ("v", ("x",)), ("", ())], ids=str
)
def test_machine_of_a_wrong_type_is_reported_as_empty(
    session: Terminal, signature: str, value: tuple[object, ...]
) -> None:
    session.daemon.answers["GetMachineID"] = Reply(signature, value)

    session.launcher.announce("created", EDITOR)

    assert next_change(session)["machine_id"] == ""


def test_machine_that_the_daemon_refuses_is_reported_as_empty(session: Terminal) -> None:
    session.daemon.faults["GetMachineID"] = Fault("fail", "com.norix.Error")

    session.launcher.announce("created", EDITOR)

    assert next_change(session)["machine_id"] == ""


@pytest.mark.parametrize(
    ("fault", "seconds", "machine"),
    [(Fault("hang"), DBUS_LIMIT, ""), (Fault("hold"), DBUS_LIMIT - 5, "box-machine-0001")],
    ids=["hung", "slow"],
)
def test_machine_is_waited_for_until_the_limit(
    session: Terminal, fault: Fault, seconds: int, machine: str
) -> None:
    session.daemon.faults["GetMachineID"] = fault
    mark = session.events.mark()

    session.launcher.announce("created", EDITOR)
    session.events.wait_for(member="GetMachineID", after=mark)
    session.jump(seconds)
    session.daemon.release()

    assert next_change(session, mark)["machine_id"] == machine


def test_without_a_daemon_the_report_is_made_with_an_empty_machine(session: Terminal) -> None:
    mark = session.events.mark()
    session.daemon.leave()

    session.launcher.announce("created", EDITOR)
    line = session.events.wait_for(
        lambda event: event.args[0].startswith("uploadSoftware ---------"), kind="log", after=mark
    )

    assert '\\"machine_id\\":\\"\\"' in line.args[0]


def test_replies_to_the_uploads_are_not_waited_for(stocked: Terminal) -> None:
    stocked.daemon.faults["onUploadFinished"] = Fault("hang")
    stocked.start_agent()

    mark = announce(stocked, "created", EDITOR)

    assert [url for url, _ in uploads(stocked, mark)] == [CHANGE, INVENTORY]


def test_change_is_logged(terminal: Terminal) -> None:
    item = LauncherItem("/usr/share/applications/editor.desktop", "Editor", "one", "two", 3, -(2**63))
    install(terminal, item)
    terminal.start_agent()

    mark = announce(terminal, "created", item)

    escaped = next_upload(terminal, CHANGE, mark).replace('"', '\\"')
    assert log_lines(terminal, mark)[:3] == [
        'onItemChanged ---------- "created" "/usr/share/applications/editor.desktop" "Editor" "one" "two" 3 '
        "-9223372036854775808",
        '"created" ("Editor", "1")',
        f'uploadSoftware --------- "{escaped}"',
    ]


def test_levels_of_the_logged_lines(session: Terminal) -> None:
    mark = announce(session, "created", EDITOR)

    levels = [event.member for event in session.events.all(kind="log", after=mark)]
    assert levels[:5] == ["info", "warning", "warning", "debug", "info"]
