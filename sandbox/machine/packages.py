"""The terminal's package database, which the real package tools read, and the packages' files."""

from __future__ import annotations

import re
import shutil
import subprocess
from dataclasses import dataclass
from functools import lru_cache
from pathlib import Path
from typing import Literal, Sequence

from sandbox.machine import layout

_DATABASE = layout.PACKAGE_DATABASE
_INFO = _DATABASE / "info"
_STATUS = _DATABASE / "status"
_NAME = re.compile(r"[a-z0-9][a-z0-9+.-]+")

MultiArch = Literal["same", "foreign", "allowed"]


@dataclass(frozen=True)
class Package:
    """The database entry of an installed package."""

    name: str
    version: str
    architecture: str
    multi_arch: MultiArch | None

    @property
    def stanza(self) -> str:
        """The package's paragraph of the status file."""
        multi_arch = f"Multi-Arch: {self.multi_arch}\n" if self.multi_arch else ""
        return (
            f"Package: {self.name}\nStatus: install ok installed\nPriority: optional\nSection: misc\n"
            f"Maintainer: Terminal <terminal@{layout.PLATFORM_HOST}>\nArchitecture: {self.architecture}\n"
            f"{multi_arch}Version: {self.version}\nDescription: {self.name}\n\n"
        )

    @property
    def file_list(self) -> Path:
        """The database's list of the package's files."""
        qualified = self.name + (f":{self.architecture}" if self.multi_arch == "same" else "")
        return _INFO / f"{qualified}.list"


def desktop_file(name: str) -> str:
    """The path of an application's desktop file."""
    return str(layout.APPLICATIONS / f"{name}.desktop")


@lru_cache(maxsize=None)
def native_architecture() -> str:
    """The architecture of this host's package tools."""
    shown = subprocess.run(["dpkg", "--print-architecture"], capture_output=True, text=True, check=True)
    return shown.stdout.strip()


class Packages:
    """The installed packages; a new instance first removes those of the previous terminal, with their files.

    Files may lie under /usr/share/applications and wherever else the box is writable, such as /var and /etc.
    `others` is the folder of a database ("status" and "info") whose packages are installed as well, without
    their files.
    """

    def __init__(self, others: Path | None = None) -> None:
        self._others = (others / "status").read_text() if others else ""
        self._packages: dict[tuple[str, str], Package] = {}
        self._diversions: list[str] = []
        for file_list in _INFO.glob("*.list"):
            _remove_files(file_list)
        shutil.rmtree(_DATABASE, ignore_errors=True)
        (_DATABASE / "updates").mkdir(parents=True)
        _INFO.mkdir()
        if others:
            shutil.copytree(others / "info", _INFO, dirs_exist_ok=True)
        (_INFO / "format").write_text("1\n")
        self._write()

    def install(
        self,
        name: str,
        version: str,
        files: Sequence[str] | None = None,
        architecture: str | None = None,
        multi_arch: MultiArch | None = None,
    ) -> None:
        """Install a package, or update it and replace its files.

        By default its only file is a desktop file of its own name, and its architecture is the terminal's.
        Packages with `multi_arch` "same" can be installed for several architectures at once.
        """
        if not _NAME.fullmatch(name):
            raise ValueError(f"no package can be called {name!r}")
        package = Package(name, version, architecture or native_architecture(), multi_arch)
        self.remove(name, package.architecture)
        self._packages[name, package.architecture] = package
        paths = (desktop_file(name),) if files is None else files
        _write_files(package.file_list, name, paths)
        self._write()

    def remove(self, name: str, architecture: str | None = None) -> None:
        """Remove a package and its files, for one architecture or for all, if it is installed."""
        for key, package in list(self._packages.items()):
            if name == package.name and architecture in (None, package.architecture):
                _remove_files(package.file_list)
                package.file_list.unlink()
                del self._packages[key]
        self._write()

    def divert(self, path: str, to: str, by: str | None = None) -> None:
        """Divert other packages' file `path`, by package `by` or (by default) by the administrator."""
        self._diversions += [path, to, by or ":"]
        self._write()

    def _write(self) -> None:
        foreign = {package.architecture for package in self._packages.values()} - {"all"}
        architectures = [native_architecture(), *sorted(foreign - {native_architecture()})]
        (_DATABASE / "arch").write_text("".join(f"{name}\n" for name in architectures))
        (_DATABASE / "diversions").write_text("".join(f"{line}\n" for line in self._diversions))
        _STATUS.write_text(self._others + "".join(package.stanza for package in self._packages.values()))


def _write_files(file_list: Path, name: str, paths: Sequence[str]) -> None:
    folders = {str(folder) for path in paths for folder in Path(path).parents}
    for path in paths:
        Path(path).parent.mkdir(parents=True, exist_ok=True)
        Path(path).write_text(f"[Desktop Entry]\nType=Application\nName={name}\nExec=true\n")
    listed = ["/.", *sorted(folders - {"/"}), *paths]
    file_list.write_text("".join(f"{line}\n" for line in listed))


def _remove_files(file_list: Path) -> None:
    for line in file_list.read_text().splitlines():
        path = Path(line)
        if path.is_symlink() or path.is_file():
            path.unlink()
