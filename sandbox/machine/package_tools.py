"""The package tools dpkg, dpkg-query and dpkg-architecture, which a test can replace."""

from __future__ import annotations

import errno
import filecmp
import shutil
import time
from pathlib import Path
from typing import Any

from sandbox.events import Events
from sandbox.machine import layout
from sandbox.machine.commands import RECORDER, Answer, Commands

_PATHS = {path.name: path for path in layout.PACKAGE_TOOLS}
# Marks the agent's calls. The real tools call one another with other arguments and must reach the real ones.
_AGENTS_ARGUMENT = {"dpkg": "-S", "dpkg-query": "-W", "dpkg-architecture": "-q"}
_BUSY_SECONDS = 5.0


class Tools(Commands):
    """Replaces /usr/bin/dpkg and the like; a new terminal begins with the real ones.

    Each call of a tool replaced by any method but `write` becomes an event of kind "command", with the call's
    "environment" and "pid" as detail.
    """

    def __init__(self, events: Events) -> None:
        super().__init__(events)
        layout.REAL_TOOLS.mkdir(parents=True, exist_ok=True)
        for name in _PATHS:
            self.restore(name)

    def record(self, name: str) -> None:
        """Let a tool work normally, but record its calls."""
        self.answer(name, Answer(program=str(_real(name))))

    def write(self, name: str, script: str) -> None:
        """Replace a tool by a script."""
        _overwrite(_PATHS[name], script.encode())

    def forbid(self, name: str) -> None:
        """Make a tool not executable."""
        _PATHS[name].chmod(0o644)

    def restore(self, name: str) -> None:
        """Bring the real tool back."""
        real, path = _real(name), _PATHS[name]
        path.chmod(0o755)
        if not real.exists():
            shutil.copy(path, real)
        elif not filecmp.cmp(real, path, shallow=False):
            _overwrite(path, real.read_bytes())

    def handle_call(self, name: str, args: tuple[str, ...], *more: Any) -> Answer:
        """Run the real tool unless the agent calls."""
        if name in _PATHS and _AGENTS_ARGUMENT[name] not in args:
            return Answer(program=str(_real(name)))
        return super().handle_call(name, args, *more)

    def _replace(self, name: str) -> None:
        if name in _PATHS:
            _overwrite(_PATHS[name], RECORDER.read_bytes())
        else:
            super()._replace(name)


def _real(name: str) -> Path:
    return layout.REAL_TOOLS / name


def _overwrite(path: Path, content: bytes) -> None:
    """Overwrite a mounted file in place, as soon as no process executes it."""
    end = time.monotonic() + _BUSY_SECONDS
    while True:
        try:
            path.write_bytes(content)
            return
        except OSError as error:
            if error.errno != errno.ETXTBSY or time.monotonic() > end:
                raise
            time.sleep(0.01)
