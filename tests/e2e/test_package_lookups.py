"""How the real package tools answer for the launcher's items."""

from __future__ import annotations

import subprocess
from pathlib import Path
from typing import Any

import pytest

from sandbox.fakes.launcher import LauncherItem
from sandbox.machine.commands import Answer
from sandbox.machine.packages import desktop_file, native_architecture
from sandbox.terminal import Terminal
from tests.e2e.software import EDITOR, PLAYER, install, inventory_at_start, tool_calls
from tests.e2e.wire import warnings

FOREIGN = "i386" if native_architecture() != "i386" else "amd64"
NO_NAME = "get version failed, empty packageName"


def lookup(terminal: Terminal, path: str) -> tuple[str, str]:
    """Package and version that the agent finds for a desktop file when it starts."""
    terminal.launcher.items = [LauncherItem(path, "Item")]
    return found(inventory_at_start(terminal)[0])


def found(record: dict[str, Any]) -> tuple[str, str]:
    """Package and version of a record."""
    return record["package_name"], record["version"]


def link(path: str, target: str) -> str:
    """Make a symbolic link; its path."""
    Path(path).parent.mkdir(parents=True, exist_ok=True)
    Path(path).symlink_to(target)
    return path


@pytest.mark.parametrize(
    ("version", "kind"),
    [
        ("1:2.1~rc1+deb12u3-4", {}),
        ("3", {"multi_arch": "same"}),  # the tool names its architecture, too
        ("7", {"architecture": FOREIGN}),
    ],
    ids=["plain", "for several architectures", "foreign"],
)
def test_item_is_known_by_the_package_of_its_desktop_file(
    terminal: Terminal, version: str, kind: dict[str, Any]
) -> None:
    terminal.packages.install("editor", version, **kind)

    assert lookup(terminal, EDITOR.path) == ("editor", version)


def test_architecture_is_the_machines(terminal: Terminal) -> None:
    install(terminal, EDITOR, PLAYER)
    shown = subprocess.run(["dpkg-architecture", "-q", "DEB_HOST_ARCH_CPU"], capture_output=True, text=True)

    records = inventory_at_start(terminal)

    assert [record["arch"] for record in records] == [shown.stdout.strip()] * 2


def test_package_for_two_architectures_gives_both_versions(terminal: Terminal) -> None:
    """The quotes between them are the tool's; only the outer ones are taken off."""
    files = [desktop_file("lib")]
    for architecture in (native_architecture(), FOREIGN):
        terminal.packages.install("lib", "3", files, architecture, "same")

    assert lookup(terminal, files[0]) == ("lib", "3''3")


def test_file_of_several_packages_is_known_by_all_their_names(terminal: Terminal) -> None:
    """They are looked up as two words, of which only the last is a package's name."""
    versions = {"one": "1.0", "two": "2.0"}
    for name, version in versions.items():
        terminal.packages.install(name, version, ["/var/opt/common.desktop"])

    package, version = lookup(terminal, "/var/opt/common.desktop")

    assert package in ("one, two", "two, one")
    assert version == versions[package.split(", ")[1]]


@pytest.mark.parametrize(
    ("by", "name"), [("player", "diversion by player from"), (None, "local diversion from")]
)
def test_diverted_file_is_known_by_the_diversion(terminal: Terminal, by: str | None, name: str) -> None:
    install(terminal, EDITOR, PLAYER)
    terminal.packages.divert(EDITOR.path, f"{EDITOR.path}.distrib", by)

    assert lookup(terminal, EDITOR.path) == (name, "2" if by else "")


def test_file_that_no_package_owns_has_no_package(terminal: Terminal) -> None:
    Path(EDITOR.path).touch()

    assert lookup(terminal, EDITOR.path) == ("", "failed")


@pytest.mark.parametrize("linked", [False, True], ids=["file", "target of a link"])
def test_file_that_no_package_owns_is_warned_of(terminal: Terminal, tmp_path: Path, linked: bool) -> None:
    lookup(terminal, link(f"{tmp_path}/link.desktop", EDITOR.path) if linked else EDITOR.path)

    assert warnings(terminal, 0)[:2] == [f'get package name failed, desktop: "{EDITOR.path}" ""', NO_NAME]


def test_file_that_is_gone_is_still_its_packages(stocked: Terminal) -> None:
    Path(EDITOR.path).unlink()

    assert lookup(stocked, EDITOR.path) == ("editor", "1")


def test_link_is_looked_up_by_its_target(stocked: Terminal, tmp_path: Path) -> None:
    assert lookup(stocked, link(f"{tmp_path}/a link.desktop", EDITOR.path)) == ("editor", "1")


def test_links_relative_target_begins_at_the_link(stocked: Terminal) -> None:
    path = link(desktop_file("sub/link"), "../editor.desktop")

    assert lookup(stocked, path) == ("editor", "1")


def test_link_of_a_package_is_not_looked_up_itself(stocked: Terminal, tmp_path: Path) -> None:
    Path(EDITOR.path).unlink()

    assert lookup(stocked, link(EDITOR.path, f"{tmp_path}/unknown.desktop")) == ("", "failed")


def test_only_one_link_is_followed(stocked: Terminal, tmp_path: Path) -> None:
    first = link(f"{tmp_path}/first.desktop", EDITOR.path)

    assert lookup(stocked, link(f"{tmp_path}/second.desktop", first)) == ("", "failed")


def test_link_to_nowhere_is_looked_up_by_its_target(terminal: Terminal, tmp_path: Path) -> None:
    terminal.packages.install("suite", "5", ["/var/opt/suite.desktop"])
    Path("/var/opt/suite.desktop").unlink()

    assert lookup(terminal, link(f"{tmp_path}/link.desktop", "/var/opt/suite.desktop")) == ("suite", "5")


def test_loop_of_links_ends(terminal: Terminal, tmp_path: Path) -> None:
    link(f"{tmp_path}/other.desktop", f"{tmp_path}/loop.desktop")

    assert lookup(terminal, link(f"{tmp_path}/loop.desktop", f"{tmp_path}/other.desktop")) == ("", "failed")


@pytest.mark.parametrize(
    "name",
    [
        "two words",
        "'single'",
        'dou"ble"',
        "back\\\\slash",
        "-dash",
        "semi;colon$(true)`",
        "应用",
        "line\nbreak",
    ],
)
def test_path_is_one_argument_as_it_stands(terminal: Terminal, name: str) -> None:
    path = desktop_file(name)
    terminal.tools.record("dpkg")
    terminal.packages.install("odd", "1")

    lookup(terminal, path)

    assert tool_calls(terminal, "dpkg") == [("-S", path)]


def test_path_with_blanks_is_found(terminal: Terminal) -> None:
    path = desktop_file("two words")
    terminal.packages.install("words", "2", [path])

    assert lookup(terminal, path) == ("words", "2")


def test_path_with_a_wildcard_gives_the_first_match(stocked: Terminal) -> None:
    assert lookup(stocked, desktop_file("edit*")) == ("editor", "1")


@pytest.mark.parametrize("path", ["", "-l", "--help", "--", "/", "\\", "[", "*" * 5000], ids=range(8))
def test_odd_path_gives_a_record_all_the_same(terminal: Terminal, path: str) -> None:
    assert lookup(terminal, path) == ("", "failed")


@pytest.mark.parametrize(
    ("name", "arguments"),
    [
        ("two words", ("two", "words")),
        ("many   blanks ", ("many", "blanks")),
        ("'single quotes'", ("'single", "quotes'")),
        ('"double quotes"', ("double quotes",)),
        ('a"b c"d', ("ab cd",)),
        ('"""', ('"',)),
        ('open "quote', ("open", "quote")),
        ("back\\slash", ("back\\slash",)),
        ("wild*", ("wild*",)),
        ("-dash", ("-dash",)),
        ("$(reboot);`x`|y&", ("$(reboot);`x`|y&",)),
        ("%1 %2", ("%1", "%2")),
        ("应用", ("应用",)),
        (" ", ()),
    ],
)
def test_name_becomes_part_of_the_command_line(
    terminal: Terminal, name: str, arguments: tuple[str, ...]
) -> None:
    terminal.tools.answer("dpkg", Answer(stdout=f"{name}: /x\n".encode()))
    terminal.tools.record("dpkg-query")

    package, _ = lookup(terminal, EDITOR.path)

    assert package == name
    assert tool_calls(terminal, "dpkg-query") == [("-W", "-f='${Version}'", *arguments)]


@pytest.mark.parametrize(
    ("name", "version"),
    [
        ("two words", ""),
        ("editor player", "1''2"),
        ('"editor"', "1"),
        ("edit*", "1"),
        ("*", "1''2"),
        ("-x", ""),
        ("--help", ""),
        ("--admindir=/nowhere", ""),
        ("-f=${Package}", "ditorplaye"),
    ],
)
def test_version_of_an_odd_name_is_what_the_tool_makes_of_it(
    terminal: Terminal, name: str, version: str
) -> None:
    install(terminal, EDITOR, PLAYER)
    terminal.tools.answer("dpkg", Answer(stdout=f"{name}: /x\n".encode()))

    assert lookup(terminal, EDITOR.path) == (name, version)


def test_package_that_is_gone_has_an_empty_version(terminal: Terminal) -> None:
    terminal.tools.answer("dpkg", Answer(stdout=b"gone: /x\n"))

    assert lookup(terminal, EDITOR.path) == ("gone", "")
