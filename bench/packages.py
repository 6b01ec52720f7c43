"""A package database as large as a desktop's, generated once and read by the real package tools."""

from __future__ import annotations

import shutil
from pathlib import Path
from random import Random
from typing import Iterator

from sandbox import REPOSITORY
from sandbox.machine.packages import Package

PACKAGES, PATHS = 2_000, 300_000
_FOLDER = REPOSITORY / "build" / "bench" / "packages"
_SEED = 1
# Most packages are small, a few have thousands of files.
_SPREAD = 1.6
_FILES_OF_A_FOLDER = 12
_DESCRIPTION = "".join(
    f" Line {line} of a description that is as long as those of Debian.\n" for line in range(9)
)


def database() -> Path:
    """The folder of the database, which is generated if it does not exist."""
    if not _FOLDER.is_dir():
        unfinished = _FOLDER.with_suffix(".new")
        shutil.rmtree(unfinished, ignore_errors=True)
        make(unfinished)
        unfinished.rename(_FOLDER)
    return _FOLDER


def make(folder: Path, packages: int = PACKAGES, paths: int = PATHS) -> None:
    """Write a database with this many packages and paths; it has the same bytes each time."""
    (folder / "info").mkdir(parents=True)
    names = [f"software-{number}" for number in range(packages)]
    for name, count in zip(names, _sizes(packages, paths)):
        (folder / "info" / f"{name}.list").write_text("".join(f"{path}\n" for path in _paths(name, count)))
    (folder / "status").write_text("".join(map(_stanza, names)))


def _sizes(packages: int, paths: int) -> list[int]:
    """The number of paths of each package: at least one, in total exactly `paths`."""
    random = Random(_SEED)
    weights = [random.lognormvariate(0, _SPREAD) for _ in range(packages)]
    sizes = [1 + int((paths - packages) * weight / sum(weights)) for weight in weights]
    sizes[-1] += paths - sum(sizes)
    return sizes


def _paths(name: str, count: int) -> Iterator[str]:
    """A package's files in its own folders, each listed after its folder, as dpkg does."""
    folder = f"/usr/share/{name}"
    for number in range(count):
        if number % _FILES_OF_A_FOLDER == 0:
            folder = f"/usr/share/{name}/part-{number // _FILES_OF_A_FOLDER:04}"
            yield folder
        else:
            yield f"{folder}/file-with-a-usual-name-{number:05}.data"


def _stanza(name: str) -> str:
    return Package(name, "1.0-1", "all", None).stanza.rstrip("\n") + f"\n{_DESCRIPTION}\n"
