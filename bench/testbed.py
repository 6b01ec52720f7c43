"""The environment of the measurements: real buses, real files, and fast load generators."""

from __future__ import annotations

from contextlib import ExitStack
from types import TracebackType
from typing import Mapping

from bench.programs import LoadGenerator, Process, Program
from sandbox.machine import layout
from sandbox.machine.clock import ManualClock
from sandbox.machine.files import FileView
from sandbox.machine.users import current_user
from sandbox.platform.server import trust

_PROGRAM_SECONDS = 120.0
ADDRESS = f"{layout.PLATFORM_HOST}:{layout.PLATFORM_PORT}"


class Testbed:
    """Runs the desktop's services and, on request, the platform, which a domain user's agent needs."""

    def __init__(self, items: int = 0, entries: int = 0, platform: bool = False) -> None:
        self._stack = ExitStack()
        self.files = FileView(current_user())
        self.files.reset()
        self.desktop = self._stack.enter_context(LoadGenerator("desktop", str(items), str(entries)))
        self._platform = self._start_platform() if platform else None

    def __enter__(self) -> Testbed:
        return self

    def __exit__(
        self, kind: type[BaseException] | None, error: BaseException | None, trace: TracebackType | None
    ) -> None:
        self._stack.close()

    @property
    def platform(self) -> LoadGenerator:
        """The platform."""
        assert self._platform, "this testbed has no platform"
        return self._platform

    def start(self, program: Program, env: Mapping[str, str] | None = None) -> Process:
        """Start a program."""
        self.forget()
        return Process(program.argv, env)

    def start_and_wait(self, program: Program, env: Mapping[str, str] | None = None) -> Process:
        """Start a program and wait until it has reported the user and is idle."""
        process = self.start(program, env)
        self.desktop.wait_for("UpdateUserInfo", _PROGRAM_SECONDS)
        if self._platform:
            self._platform.wait_for("tips", _PROGRAM_SECONDS)
        process.await_calm()
        return process

    def forget(self) -> None:
        """Drop what the load generators have reported so far."""
        self.desktop.forget()
        if self._platform:
            self._platform.forget()

    def policies(self, count: int, size: int = 200, window: int = 1) -> list[int]:
        """Push policies, wait until all are forwarded, and return begin, end and latencies in nanoseconds."""
        self.desktop.send(f"policies {count} {size} {window}")
        return self.desktop.wait_for("done", _PROGRAM_SECONDS + count * 0.01)

    def move_clock(self, clock: ManualClock, seconds: int) -> None:
        """Move a program's clock ahead and wake it up."""
        clock.jump(seconds)
        self.desktop.send("wake")

    def _start_platform(self) -> LoadGenerator:
        known = trust()
        server = known.server
        self.files.write_certificates(
            known.authority.certificate, known.terminal.certificate, known.terminal.key
        )
        self.files.write_platform_address(layout.PLATFORM_PORT)
        files = (server.certificate, server.key, known.authority.certificate)
        return self._stack.enter_context(
            LoadGenerator("platform", str(layout.PLATFORM_PORT), *map(str, files))
        )
