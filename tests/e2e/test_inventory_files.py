"""The inventory files of the daemon and of the device-control policy service go before what the tools say."""

from __future__ import annotations

import json
from pathlib import Path
from typing import Any, Callable

import pytest

from sandbox.fakes.launcher import LauncherItem
from sandbox.machine import layout
from sandbox.machine.commands import Answer
from sandbox.terminal import Terminal
from tests.e2e.software import (
    EDITOR,
    PLAYER,
    announce,
    install,
    inventory_at_start,
    next_inventory,
    tool_calls,
)
from tests.e2e.wire import log_lines

FILES = {"daemon": layout.SOFTWARE_LIST, "policy service": layout.PRYG_SOFTWARE_LIST}
LOGGED = " SoftwareGuard::getSoftwareList---------"
BROKEN = [
    b"",
    b" \n",
    b"{}",
    b'{"package_name": "editor", "id": 5}',
    b"null",
    b'"editor"',
    b"5",
    b'[{"package_name": "editor", "id": 5}',
    b'[{"package_name": "editor", "id": 5}] trailing',
    b'[{"package_name": "editor", "id": 5},]',
    b"\xff\xfe\x00",
    b"[" * 5000,
]


def record(name: str = "editor", number: int = 5, **keys: Any) -> dict[str, Any]:
    """A record of an inventory file."""
    known = {"package_name": name, "name": "Name in the file", "id": number}
    return {**known, "architecture": "mips64el", "installed_type": 1, **keys}


def write(terminal: Terminal, whose: str, *records: Any) -> None:
    """Fill one of the files."""
    terminal.files.write(FILES[whose], json.dumps(records, ensure_ascii=False))


def numbers(records: list[dict[str, Any]]) -> list[int]:
    """The platform's identifiers of reported records."""
    return [known["software_id"] for known in records]


def in_place_of_it_a_folder(file: Path) -> None:
    """A folder has the file's name."""
    file.unlink()
    file.mkdir()


def unreadable(file: Path) -> None:
    """The user may not read the file."""
    file.chmod(0)


@pytest.mark.parametrize("whose", FILES)
def test_what_a_file_knows_is_reported_with_the_launchers_name_and_the_installed_version(
    stocked: Terminal, whose: str
) -> None:
    write(stocked, whose, record(version="99"))

    assert inventory_at_start(stocked) == [
        {
            "arch": "mips64el",
            "installed_type": 1,
            "name": "Editor",
            "package_name": "editor",
            "software_id": 5,
            "version": "1",
        }
    ]


@pytest.mark.parametrize(
    ("daemons", "policy_services", "reported"),
    [
        pytest.param(
            [record("editor", 3)],
            [record("editor", 1), record("player", 2)],
            [3, 2],
            id="daemon's file first",
        ),
        pytest.param(
            [record("Editor", 1), record("editor", 2), record("editor", 3)],
            [],
            [2, -1],
            id="first of a package",
        ),
        pytest.param([record("other", 1), record("player", 2)], [], [-1, 2], id="none without an item"),
        pytest.param(
            [5, None, "editor", [record()], {}, {"package_name": 5}, record(number=9)],
            [],
            [9, -1],
            id="none of what is no record",
        ),
    ],
)
def test_record_of_an_item_is_the_first_of_its_package(
    terminal: Terminal, daemons: list[Any], policy_services: list[Any], reported: list[int]
) -> None:
    install(terminal, EDITOR, PLAYER)
    write(terminal, "daemon", *daemons)
    write(terminal, "policy service", *policy_services)

    assert numbers(inventory_at_start(terminal)) == reported


def test_items_of_one_package_share_its_record(stocked: Terminal) -> None:
    stocked.launcher.items = [EDITOR, LauncherItem(EDITOR.path, "Editor, safe mode")]
    write(stocked, "daemon", record())

    found = inventory_at_start(stocked)

    assert [(known["name"], known["software_id"]) for known in found] == [
        ("Editor", 5),
        ("Editor, safe mode", 5),
    ]


def test_record_without_a_package_is_that_of_a_file_that_no_package_owns(terminal: Terminal) -> None:
    terminal.launcher.items = [EDITOR]
    write(terminal, "daemon", record("", 8))

    found = inventory_at_start(terminal)[0]
    assert (found["software_id"], found["package_name"], found["version"]) == (8, "", "failed")


def test_each_record_costs_one_lookup_and_its_item_no_other(terminal: Terminal) -> None:
    install(terminal, EDITOR, PLAYER)
    terminal.tools.record("dpkg-query")
    write(terminal, "daemon", record("editor"), record("other"))
    write(terminal, "policy service", record("editor"))

    inventory_at_start(terminal)

    assert [call[-1] for call in tool_calls(terminal, "dpkg-query")] == [
        "editor",
        "other",
        "editor",
        "player",
    ]


@pytest.mark.parametrize("has_launcher", [True, False], ids=["no items", "no launcher"])
def test_records_are_looked_up_even_if_there_is_nothing_to_report(
    terminal: Terminal, has_launcher: bool
) -> None:
    if not has_launcher:
        terminal.launcher.leave()
    for tool in ("dpkg-query", "dpkg-architecture"):
        terminal.tools.record(tool)
    write(terminal, "daemon", record("editor"))
    write(terminal, "policy service", record("player"))

    terminal.start_agent()

    calls = [(event.target, event.args[-1]) for event in terminal.events.all(kind="command")]
    assert calls == [
        ("dpkg-query", "editor"),
        ("dpkg-query", "player"),
        ("dpkg-architecture", "DEB_HOST_ARCH_CPU"),
    ]
    assert "SoftwareGuard::getSoftwareList()--11111111111- 2" in log_lines(terminal, 0)


@pytest.mark.parametrize("content", BROKEN, ids=lambda content: repr(content[:20]))
@pytest.mark.parametrize("whose", FILES)
def test_broken_file_is_as_good_as_none(terminal: Terminal, whose: str, content: bytes) -> None:
    install(terminal, EDITOR, PLAYER)
    other = next(name for name in FILES if name != whose)
    terminal.files.write(FILES[whose], content)
    write(terminal, other, record("player"))

    assert numbers(inventory_at_start(terminal)) == [-1, 5]


@pytest.mark.parametrize("whose", FILES)
@pytest.mark.parametrize("spoil", [Path.unlink, in_place_of_it_a_folder, unreadable])
def test_file_that_cannot_be_read_is_as_good_as_none(
    stocked: Terminal, whose: str, spoil: Callable[[Path], None]
) -> None:
    write(stocked, whose, record())
    spoil(FILES[whose])

    assert numbers(inventory_at_start(stocked)) == [-1]


@pytest.mark.parametrize(
    ("stored", "reported"),
    [
        ({}, (0, 0, "")),
        ({"id": "5", "installed_type": None, "architecture": 5}, (0, 0, "")),
        ({"id": 1.5, "installed_type": True}, (0, 0, "")),
        ({"id": -7, "installed_type": 2**31 - 1}, (-7, 2**31 - 1, "")),
        ({"id": 2**31, "installed_type": 1e300}, (0, 0, "")),
        ({"architecture": "x" * 1000, "other": [{}]}, (0, 0, "x" * 1000)),
    ],
    ids=str,
)
def test_missing_or_odd_values_count_as_nothing(
    stocked: Terminal, stored: dict[str, Any], reported: tuple[int, int, str]
) -> None:
    write(stocked, "daemon", {"package_name": "editor", **stored})

    found = inventory_at_start(stocked)[0]
    assert (found["software_id"], found["installed_type"], found["arch"]) == reported


@pytest.mark.parametrize("name", ["two words", '"quoted"', "wild*", "-dash", "应用", "a\nb"])
def test_odd_package_names_are_matched_as_they_stand(terminal: Terminal, name: str) -> None:
    terminal.launcher.items = [EDITOR]
    terminal.tools.answer("dpkg", Answer(stdout=f"{name}: /x\n".encode()))
    write(terminal, "daemon", record(name, 6))

    assert numbers(inventory_at_start(terminal)) == [6]


def test_files_are_read_anew_for_each_report(stocked: Terminal) -> None:
    write(stocked, "daemon", record(number=1))
    inventory_at_start(stocked)
    write(stocked, "daemon", record(number=2))

    mark = announce(stocked, "deleted", EDITOR)

    assert numbers(next_inventory(stocked, mark)) == [2]


def test_reading_is_logged(stocked: Terminal) -> None:
    stocked.files.write(FILES["daemon"], '[{"package_name":"editor","id":7}]')
    stocked.files.write(FILES["policy service"], "broken")

    stocked.start_agent()

    events = stocked.events.all(lambda event: "SoftwareGuard" in event.args[0], kind="log")
    assert {event.member for event in events} == {"info"}
    assert [event.args[0] for event in events] == [
        f'{LOGGED} "/var/lib/velk/software_list.list" : "[{{\\"package_name\\":\\"editor\\",\\"id\\":7}}]"',
        f"{LOGGED} 1",
        f"{LOGGED} 7",
        f'{LOGGED} "/var/lib/pryg/software_list.list" : "broken"',
        "SoftwareGuard::getSoftwareList()--11111111111- 1",
        "SoftwareGuard::getSoftwareList()--- 1",
    ]


def test_files_stay_as_they_are(stocked: Terminal) -> None:
    write(stocked, "daemon", record())
    before = {path: path.read_bytes() for path in FILES.values()}

    inventory_at_start(stocked)

    assert {path: Path(path).read_bytes() for path in FILES.values()} == before
