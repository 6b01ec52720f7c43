"""The large package database, by a small one that is made in the same way."""

from __future__ import annotations

import subprocess
from pathlib import Path

from bench import packages


def tool(folder: Path, *argv: str) -> str:
    """What a real package tool says of the database."""
    for name in ("updates", "triggers"):
        (folder / name).mkdir(exist_ok=True)
    (folder / "info" / "format").write_text("1\n")
    command = [argv[0], f"--admindir={folder}", *argv[1:]]
    return subprocess.run(command, capture_output=True, text=True, check=True).stdout


def content(folder: Path) -> dict[str, bytes]:
    """All files by their names."""
    files = (path for path in folder.rglob("*") if path.is_file())
    return {str(path.relative_to(folder)): path.read_bytes() for path in files}


def test_database_has_as_many_packages_and_paths_as_wanted(tmp_path: Path) -> None:
    packages.make(tmp_path / "made", packages=40, paths=3_000)

    lists = [path.read_text().splitlines() for path in (tmp_path / "made" / "info").glob("*.list")]
    assert len(lists) == 40
    assert sum(map(len, lists)) == len({path for known in lists for path in known}) == 3_000


def test_database_is_the_same_each_time(tmp_path: Path) -> None:
    for name in ("one", "other"):
        packages.make(tmp_path / name, packages=40, paths=3_000)

    assert content(tmp_path / "one") == content(tmp_path / "other")


def test_real_tools_read_it(tmp_path: Path) -> None:
    made = tmp_path / "made"
    packages.make(made, packages=40, paths=3_000)
    a_path = (made / "info" / "software-7.list").read_text().splitlines()[-1]

    assert len(tool(made, "dpkg-query", "-W").splitlines()) == 40
    assert tool(made, "dpkg", "-S", a_path) == f"software-7: {a_path}\n"
