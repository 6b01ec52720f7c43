"""A copy of ./dev with stand-ins for the programs that it calls, so that nothing is installed or built.

These tests run outside the simulated terminal: ./dev is what opens it.
"""

from __future__ import annotations

import os
import shutil
import subprocess
from pathlib import Path
from typing import Sequence

import pytest

REPOSITORY = Path(__file__).resolve().parents[2]
_PARTS = ("dev", "dev.d", "packages.txt", "CMakePresets.json", "sandbox/can-box", "docs/policy.dot")
# Programs that would change the machine, take long, or are not installed everywhere.
_STAND_INS = (
    "apt-get cmake ctest bwrap dot lintian dpkg-buildpackage debootstrap gcovr "
    "clang-format clang-tidy black flake8 mypy shellcheck xmllint"
).split()
_GIT = """case $* in
    clone*) mkdir -p "${@: -1}" ;;
    *" -z "*) printf 'source.cpp\\0' ;;
    ls-files*) echo source.cpp ;;
esac"""
# A Python module that takes note of its call.
MODULE = """import os, sys
with open("calls", "a") as calls:
    print("{name}", *sys.argv[1:], file=calls)
sys.exit(int(os.environ.get("STATUS_OF_{name}", "0")))
"""


class Tree:
    """The copy, on a machine that has all packages, and how ./dev in it is called."""

    def __init__(self, root: Path) -> None:
        self.root = root
        self._programs = root.parent / "programs"
        self._programs.mkdir(parents=True)
        for part in _PARTS:
            self.copy(part)
        for name in _STAND_INS:
            self.stand_in(name)
        self.stand_in("sudo", '"$@"')
        self.stand_in("git", _GIT)
        self.stand_in("dpkg-query", "echo installed")
        for name in ("sandbox/__main__", "pytest", "bench/__main__"):
            self.write(f"{name}.py", MODULE.format(name=name.split("/")[0]))
        self.write("tests/lint/limits.py", MODULE.format(name="limits"))
        self.write("source.cpp", "")

    def copy(self, name: str) -> None:
        """Put one more part of the repository into the copy."""
        source, target = REPOSITORY / name, self.root / name
        target.parent.mkdir(parents=True, exist_ok=True)
        if source.is_dir():
            shutil.copytree(source, target)
        else:
            shutil.copy(source, target)

    def write(self, name: str, text: str) -> Path:
        """Put a file into the copy."""
        path = self.root / name
        path.parent.mkdir(parents=True, exist_ok=True)
        path.write_text(text)
        return path

    def stand_in(self, name: str, script: str = "") -> None:
        """A program that takes note of its call and then does what the shell script says."""
        note = f'printf "%s\\n" "{name} $*" >>"{self.root}/calls"'
        path = self._programs / name
        path.write_text(f"#!/bin/bash\n{note}\n{script}\n")
        path.chmod(0o755)

    def take_away(self, *names: str) -> None:
        """Let programs be missing, even if the machine has them."""
        for name in names:
            (self._programs / name).unlink()
        for folder in ("/usr/bin", "/usr/sbin"):
            for program in Path(folder).iterdir():
                known = self._programs / program.name
                if program.name not in names and not known.exists():
                    known.symlink_to(program)
        self.path = str(self._programs)

    path = ""

    def command(self, *arguments: str, uid: int = 1000) -> list[str]:
        """The command line of ./dev as a user of this number, who owns the copy."""
        who = ["/usr/bin/unshare", "--user", f"--map-user={uid}", f"--map-group={uid}"]
        return [*who, str(self.root / "dev"), *arguments]

    @property
    def environment(self) -> dict[str, str]:
        """With the stand-ins before the machine's own programs."""
        path = self.path or f"{self._programs}:/usr/bin:/bin:/usr/sbin:/sbin"
        return {"PATH": path, "HOME": str(self.root.parent), "LANG": "C.UTF-8", **self.extra}

    extra: dict[str, str] = {}

    def dev(
        self, *arguments: str, uid: int = 1000, folder: Path | None = None
    ) -> subprocess.CompletedProcess[str]:
        """Run ./dev to its end."""
        return self.run(self.command(*arguments, uid=uid), folder)

    def run(self, command: Sequence[str], folder: Path | None = None) -> subprocess.CompletedProcess[str]:
        """Run a command line of `command` to its end."""
        return subprocess.run(
            command,
            cwd=folder or self.root,
            env=self.environment,
            stdin=subprocess.DEVNULL,
            capture_output=True,
            text=True,
        )

    def calls(self, *programs: str) -> list[str]:
        """The calls of these programs so far, of all without names, each in a line."""
        noted = self.root / "calls"
        lines = noted.read_text().splitlines() if noted.exists() else []
        return [line for line in lines if not programs or line.split()[0] in programs]


def run_module(*arguments: str, **variables: str) -> subprocess.CompletedProcess[str]:
    """Run a Python program of the repository itself to its end."""
    command = ["/usr/bin/python3", "-m", *arguments]
    env = {**os.environ, **variables}
    return subprocess.run(command, cwd=REPOSITORY, env=env, capture_output=True, text=True)


def refused(ended: subprocess.CompletedProcess[str], status: int = 1) -> str:
    """The one line that a command ended with."""
    assert ended.returncode == status, ended
    (line,) = ended.stderr.splitlines()
    assert line.startswith("dev: ")
    return line.removeprefix("dev: ")


def commands() -> Sequence[str]:
    """All commands that have a help."""
    return sorted(path.stem for path in (REPOSITORY / "dev.d" / "help").iterdir() if path.stem != "dev")


@pytest.fixture
def tree(tmp_path: Path) -> Tree:
    """A copy in a folder with a plain name."""
    return Tree(tmp_path / "velks")
