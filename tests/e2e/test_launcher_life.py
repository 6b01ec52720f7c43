"""The launcher is absent, late, restarting, gone, hung or wrong."""

from __future__ import annotations

from typing import Callable

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
    LISTED,
    announce,
    install,
    next_inventory,
    next_upload,
    uploads,
)
from tests.e2e.wire import asked_of_the_session_bus, log_lines, start_agent

WAITING = "launcher service is not registered, wait.."
NOT_THERE = "launcher service is not init"
ARRIVED = "software inited"
ASKED = "GetLauncerItems -------- QDBusError("


def marker_lines(terminal: Terminal, after: int = 0) -> list[tuple[str, str]]:
    """Level and text of the lines about the launcher's arrival."""
    lines = terminal.events.all(kind="log", after=after)
    return [(line.member, line.args[0]) for line in lines if line.args[0] in (WAITING, NOT_THERE, ARRIVED)]


def wait_for_list(terminal: Terminal, after: int) -> None:
    """Wait until the agent has made a list of the software, and sent it if there is any."""
    terminal.events.wait_for(lambda event: event.args[0].startswith(LISTED), kind="log", after=after)
    terminal.sync()


def start_without_launcher(terminal: Terminal) -> None:
    """Start the agent; software is installed, but no launcher lists it."""
    install(terminal, EDITOR)
    terminal.launcher.leave()
    terminal.start_agent()


def start_asking(terminal: Terminal, fault: Fault) -> int:
    """Start the agent; it has just asked the launcher. The mark before it."""
    install(terminal, EDITOR)
    terminal.launcher.fault = fault
    mark = terminal.events.mark()
    terminal.start_agent(ready=lambda: terminal.events.wait_for(member="GetAllItemInfos", after=mark))
    return mark


def test_inventory_is_reported_once_to_begin_with(stocked: Terminal) -> None:
    stocked.start_agent()

    assert [url for url, _ in uploads(stocked)] == [INVENTORY]
    assert marker_lines(stocked) == []


def test_inventory_is_reported_before_the_session_is_announced(stocked: Terminal) -> None:
    stocked.start_agent()

    on_system_bus = stocked.events.all(kind="call", source="velks")
    sent = sorted(
        (call for call in on_system_bus if call.target in ("daemon", "logind")),
        key=lambda call: call.detail["serial"],
    )
    assert [call.member for call in sent] == [
        "onUploadFinished",
        "Get",
        "Get",
        "UpdateUserInfo",
        "SendUserStatus",
    ]


def test_machine_is_read_before_the_launcher_is_asked(terminal: Terminal) -> None:
    """And the list is on its way before the user's name is asked for."""
    mark = start_asking(terminal, Fault("hold"))
    terminal.files.write_machine_id("too-late")
    assert terminal.events.all(target="logind", member="Get", after=mark) == []

    terminal.launcher.release()

    assert "box-file-machine-0001" in next_upload(terminal, INVENTORY, mark)


def test_absent_launcher_is_warned_of_once_and_then_waited_for_without_asking(terminal: Terminal) -> None:
    start_without_launcher(terminal)

    assert asked_of_the_session_bus(terminal, lambda: terminal.advance(3600)) == []

    assert uploads(terminal) == []
    assert marker_lines(terminal) == [("warning", WAITING), ("info", NOT_THERE)]


def test_late_launcher_is_read_and_then_followed(terminal: Terminal) -> None:
    start_without_launcher(terminal)
    mark = terminal.events.mark()

    terminal.launcher.appear()
    wait_for_list(terminal, mark)

    assert [url for url, _ in uploads(terminal)] == [INVENTORY]
    assert marker_lines(terminal, mark) == [("debug", ARRIVED)]
    mark = announce(terminal, "created", EDITOR)
    assert [url for url, _ in uploads(terminal, mark)] == [CHANGE, INVENTORY]


@pytest.mark.parametrize("late", [False, True], ids=["present at the start", "late"])
def test_restart_of_the_launcher_is_not_noticed(stocked: Terminal, late: bool) -> None:
    if late:
        stocked.launcher.leave()
    mark = start_agent(stocked)
    if late:
        stocked.launcher.appear()
    next_inventory(stocked, mark)
    stocked.sync()
    mark = stocked.events.mark()

    stocked.launcher.restart()
    # The announcement comes after the news of the restart: the one inventory is its own.
    announce(stocked, "deleted", EDITOR)

    assert [url for url, _ in uploads(stocked, mark)] == [INVENTORY]
    assert marker_lines(stocked, mark) == []


@pytest.mark.parametrize(
    ("fault", "then", "error"),
    [
        (Fault("hang"), lambda terminal: terminal.launcher.leave(), '"org.freedesktop.DBus.Error.'),
        (Fault("hang"), lambda terminal: terminal.jump(DBUS_LIMIT), '"org.freedesktop.DBus.Error.NoReply"'),
        (Fault("fail", "com.norix.Error"), lambda _: None, '"com.norix.Error", "simulated failure")'),
    ],
    ids=["goes", "hangs for the limit", "refuses"],
)
def test_launcher_that_does_not_answer_lists_nothing(
    terminal: Terminal, fault: Fault, then: Callable[[Terminal], None], error: str
) -> None:
    mark = start_asking(terminal, fault)

    then(terminal)
    wait_for_list(terminal, mark)

    assert uploads(terminal) == []
    assert any(line.startswith(f"{ASKED}{error}") for line in log_lines(terminal, mark))


def test_slow_launcher_is_waited_for(terminal: Terminal) -> None:
    mark = start_asking(terminal, Fault("hold"))

    terminal.jump(DBUS_LIMIT - 5)
    terminal.launcher.release()

    assert [record["name"] for record in next_inventory(terminal, mark)] == ["Editor"]


@pytest.mark.parametrize(
    ("signature", "values"),
    [
        ("as", (["x"],)),
        ("s", ("x",)),
        ("a(ss)", ([("/x", "X")],)),
        ("(ssssxx)", (("/x", "X", "", "", 0, 0),)),
        ("", ()),
    ],
    ids=str,
)
def test_list_of_a_wrong_type_counts_as_none(
    terminal: Terminal, signature: str, values: tuple[object, ...]
) -> None:
    terminal.launcher.answers["GetAllItemInfos"] = Reply(signature, values)

    terminal.start_agent()

    assert uploads(terminal) == []
    assert "SoftwareGuard::getSoftwareList()--- 0" in log_lines(terminal, 0)


def test_successive_changes_are_reported_in_their_order(terminal: Terminal) -> None:
    names = [f"application {number}" for number in range(20)]
    terminal.start_agent()
    mark = terminal.events.mark()

    for name in names:
        terminal.launcher.announce("created", LauncherItem(EDITOR.path, name))
    next_upload(terminal, CHANGE, mark, count=len(names))

    sent = [text for url, text in uploads(terminal, mark) if url == CHANGE]
    assert [name for name, text in zip(names, sent) if f'"{name}"' in text] == names
