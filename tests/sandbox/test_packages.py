"""The real package tools answer from the terminal's own database."""

from __future__ import annotations

import subprocess
from pathlib import Path

import pytest

from sandbox.machine.packages import desktop_file, native_architecture
from sandbox.terminal import Terminal

FOREIGN = "i386" if native_architecture() != "i386" else "amd64"


def run(*argv: str) -> str:
    """Standard output of a command; what it complains of on standard error is part of it."""
    return subprocess.run(argv, stdout=subprocess.PIPE, stderr=subprocess.STDOUT, text=True).stdout


def owner(path: str) -> str:
    return run("dpkg", "-S", path)


def owners(path: str) -> set[str]:
    return set(owner(path).removesuffix(f": {path}\n").split(", "))


def version(name: str) -> str:
    return run("/usr/bin/dpkg-query", "-W", "-f=${Version}\n", name)


def test_package_brings_its_desktop_file(terminal: Terminal) -> None:
    terminal.packages.install("editor", "1:2.1-3")

    path = desktop_file("editor")
    assert (owner(path), version("editor")) == (f"editor: {path}\n", "1:2.1-3\n")
    assert Path(path).read_text().startswith("[Desktop Entry]\n")


def test_package_brings_the_files_that_it_is_given(terminal: Terminal) -> None:
    files = ("/var/opt/suite/a file.desktop", "/var/opt/suite/other.desktop")
    terminal.packages.install("suite", "5", files)

    assert [owner(path) for path in files] == [f"suite: {path}\n" for path in files]
    assert owner("/var/opt/suite") == "suite: /var/opt/suite\n"


def test_update_changes_version_and_files(terminal: Terminal) -> None:
    terminal.packages.install("editor", "1", ["/var/opt/old.desktop"])
    terminal.packages.install("editor", "2")

    assert version("editor") == "2\n"
    assert "no path found" in owner("/var/opt/old.desktop")
    assert not Path("/var/opt/old.desktop").exists()


def test_removed_package_is_unknown_and_its_files_are_gone(terminal: Terminal) -> None:
    terminal.packages.install("editor", "1")
    terminal.packages.install("player", "1")

    terminal.packages.remove("editor")

    assert "no packages found matching editor" in version("editor")
    assert version("player") == "1\n"
    assert not Path(desktop_file("editor")).exists()


def test_file_of_several_packages_has_several_owners(terminal: Terminal) -> None:
    for name in ("one", "two"):
        terminal.packages.install(name, "1", ["/var/opt/common"])

    assert owners("/var/opt/common") == {"one", "two"}


def test_package_for_several_architectures_is_shown_with_its_architecture(terminal: Terminal) -> None:
    path = desktop_file("lib")
    for architecture in (native_architecture(), FOREIGN):
        terminal.packages.install("lib", "3", [path], architecture, "same")

    assert owners(path) == {f"lib:{native_architecture()}", f"lib:{FOREIGN}"}
    assert version(f"lib:{FOREIGN}") == "3\n"


def test_package_of_a_foreign_architecture_is_shown_with_it(terminal: Terminal) -> None:
    terminal.packages.install("game", "1", architecture=FOREIGN)

    assert owner(desktop_file("game")) == f"game:{FOREIGN}: {desktop_file('game')}\n"


@pytest.mark.parametrize(("by", "shown"), [("other", "diversion by other"), (None, "local diversion")])
def test_diversion_is_shown_before_the_owner(terminal: Terminal, by: str | None, shown: str) -> None:
    path = desktop_file("editor")
    terminal.packages.install("editor", "1")
    terminal.packages.divert(path, f"{path}.distrib", by)

    assert owner(path) == f"{shown} from: {path}\n{shown} to: {path}.distrib\neditor: {path}\n"


def test_architecture_is_the_hosts(terminal: Terminal) -> None:
    assert run("/usr/bin/dpkg-architecture", "-q", "DEB_HOST_ARCH") == f"{native_architecture()}\n"


def test_packages_and_their_files_are_gone_in_the_next_terminal() -> None:
    with Terminal() as before:
        before.packages.install("editor", "1", ["/var/opt/old.desktop"])

    with Terminal():
        assert run("dpkg-query", "-W") == ""
        assert not Path("/var/opt/old.desktop").exists()


def test_name_that_no_package_can_have_is_refused(terminal: Terminal) -> None:
    with pytest.raises(ValueError, match="no package can be called"):
        terminal.packages.install("Two Words", "1")
