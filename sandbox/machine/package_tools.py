"""The package tools dpkg, dpkg-query and dpkg-architecture, each of which a test may replace."""

from __future__ import annotations

import errno
import filecmp
import shutil
import time
from pathlib import Path

from sandbox.machine import layout
from sandbox.machine.commands import RECORDER, Answer, Commands

_PATHS = {path.name: path for path in layout.PACKAGE_TOOLS}
# How the agent calls each of them. The real tools call one another in other ways, and reach the real ones.
_AGENTS_ARGUMENT = {"dpkg": "-S", "dpkg-query": "-W", "dpkg-architecture": "-q"}
_BUSY_SECONDS = 5.0


class Tools:
    """Stands for /usr/bin/dpkg and the like; in each terminal they begin as the real ones.

    Each call of a tool that was replaced by other means than `write` is an event of kind "command", whose
    detail has the call's "environment" and "pid".
    """

    def __init__(self, commands: Commands) -> None:
        self._commands = commands
        layout.REAL_TOOLS.mkdir(parents=True, exist_ok=True)
        for name in _PATHS:
            self.restore(name)

    def record(self, name: str) -> None:
        """Let a tool do its work and record its calls."""
        self.answer(name, Answer(program=str(_real(name))))

    def answer(self, name: str, answer: Answer) -> None:
        """Let a tool end with `answer` from now on."""
        self._replace(name)
        self._commands.answer(name, answer)

    def hold(self, name: str) -> None:
        """Let a tool hang until `release`; it then ends as `answer` said, or else with no output."""
        self._replace(name)
        self._commands.hold(name)

    def release(self, name: str) -> None:
        """Let the held calls of a tool end, and later ones pass."""
        self._commands.release(name)

    def nudge(self, name: str, printed: bytes = b"") -> int:
        """Wake up those who wait for the held calls of a tool, which print this and go on; how many still
        wait."""
        return self._commands.nudge(name, printed)

    def write(self, name: str, script: str) -> None:
        """Replace a tool by a script."""
        _overwrite(_PATHS[name], script.encode())

    def forbid(self, name: str) -> None:
        """Let nobody run a tool."""
        _PATHS[name].chmod(0o644)

    def restore(self, name: str) -> None:
        """Bring the real tool back."""
        real, path = _real(name), _PATHS[name]
        path.chmod(0o755)
        if not real.exists():
            shutil.copy(path, real)
        elif not filecmp.cmp(real, path, shallow=False):
            _overwrite(path, real.read_bytes())

    def _replace(self, name: str) -> None:
        self._commands.pass_on(name, unless=_AGENTS_ARGUMENT[name], program=str(_real(name)))
        _overwrite(_PATHS[name], RECORDER.read_bytes())


def _real(name: str) -> Path:
    return layout.REAL_TOOLS / name


def _overwrite(path: Path, content: bytes) -> None:
    """Change the file where it is mounted, as soon as nobody runs it any more."""
    end = time.monotonic() + _BUSY_SECONDS
    while True:
        try:
            path.write_bytes(content)
            return
        except OSError as error:
            if error.errno != errno.ETXTBSY or time.monotonic() > end:
                raise
            time.sleep(0.01)
