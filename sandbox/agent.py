"""The session agent: starts the real binary, reads its log, ends it."""

from __future__ import annotations

import contextlib
import os
import signal
import subprocess
import threading
from io import TextIOWrapper
from pathlib import Path
from typing import IO, Callable, Mapping, Sequence

from sandbox import REPOSITORY
from sandbox.bus.senders import Senders
from sandbox.events import PATIENCE, Events
from sandbox.machine.clock import Clock

# For instrumented agents: the preloaded clock may come before the sanitizer's library (if both were
# preloaded, the agent's child processes would hang), and the leak check is off because it fails with a
# stopped clock.
_ASAN_WITH_PRELOAD = "verify_asan_link_order=0:detect_leaks=0"
_NEVER_STARTED = "the agent was never started"
# Control characters delimit a record: messages may contain line breaks, and other output (a sanitizer's
# report, a crash) must not be taken for a message.
_START, _FIELD, _END = "\x1e", "\x1f", "\x1d"
_PATTERN = _START + _FIELD.join(("%{type}", "%{file}", "%{line}", "%{function}", "%{message}")) + _END
_FIELDS = 5


def default_binary() -> Path:
    """The binary under test: $VELK_AGENT, else that of $VELK_BUILD_DIR, else that of the release build."""
    if "VELK_AGENT" in os.environ:
        return Path(os.environ["VELK_AGENT"])
    build = Path(os.environ.get("VELK_BUILD_DIR", REPOSITORY / "build" / "release"))
    return build / "src" / "velks"


class StillRunning(Exception):
    """The agent did not end on SIGTERM; it has been killed."""


class Agent:
    """At most one agent process at a time; it can be started again after it has ended."""

    def __init__(self, events: Events, senders: Senders) -> None:
        self.binary = default_binary()
        self._events = events
        self._senders = senders
        self._process: subprocess.Popen[bytes] | None = None
        self._log: LogReader | None = None
        self._ending_wanted = False

    def start(
        self,
        clock: Clock = Clock(),
        extra_env: Mapping[str, str] | None = None,
        extra_argv: Sequence[str] = (),
    ) -> None:
        """Start the process and return at once."""
        assert not self.alive, "the agent runs already"
        env = {**os.environ, "QT_MESSAGE_PATTERN": _PATTERN, **clock.environment()}
        if "LD_PRELOAD" in env:
            env["ASAN_OPTIONS"] = ":".join(filter(None, (os.environ.get("ASAN_OPTIONS"), _ASAN_WITH_PRELOAD)))
        self._ending_wanted = False
        with self._senders.lock:
            self._process = subprocess.Popen(
                [self.binary, *extra_argv],
                env={**env, **(extra_env or {})},
                stdin=subprocess.DEVNULL,
                stdout=subprocess.DEVNULL,
                stderr=subprocess.PIPE,
                start_new_session=True,
            )
            self._senders.register(self._process.pid, "velks")
        assert self._process.stderr
        self._log = LogReader(self._process.stderr, self._events)
        self._events.record("box", "velks", "life", "starts", (self._process.pid,))

    @property
    def alive(self) -> bool:
        """Whether the process runs."""
        return self._process is not None and self._process.poll() is None

    @property
    def pid(self) -> int:
        """Process id of the agent started last."""
        assert self._process, _NEVER_STARTED
        return self._process.pid

    @property
    def log(self) -> str:
        """The agent's standard error so far, in a readable form."""
        return self._log.text if self._log else ""

    @property
    def died_unexpectedly(self) -> bool:
        """Whether the process ended although neither `stop`, `kill` nor `wait` was called."""
        return self._process is not None and not self.alive and not self._ending_wanted

    @property
    def exit_status(self) -> int | None:
        """The exit status, negative for a signal, None while the process runs."""
        return self._process.poll() if self._process else None

    def stop(self) -> None:
        """Send SIGTERM, as the end of a session does, and wait for the end of the process and its log."""
        self._end(lambda process: process.terminate())

    def kill(self) -> None:
        """Send SIGKILL, and wait for the end of the process and its log."""
        self._end(lambda process: process.kill())

    def wait(self) -> int:
        """Wait until the agent ends by itself, as expected; returns its exit status."""
        assert self._process and self._log, _NEVER_STARTED
        self._ending_wanted = True
        status = self._process.wait(PATIENCE)
        with contextlib.suppress(ProcessLookupError):
            # Children of the agent's scripts are left; the end of a session kills them, too.
            os.killpg(self.pid, signal.SIGKILL)
        self._log.join()
        return status

    def resident_bytes(self) -> int:
        """The process's resident memory."""
        pages = int(Path(f"/proc/{self.pid}/statm").read_text().split()[1])
        return pages * os.sysconf("SC_PAGE_SIZE")

    def _end(self, how: Callable[[subprocess.Popen[bytes]], None]) -> None:
        if self._process is None or not self.alive:
            return
        self._ending_wanted = True
        how(self._process)
        try:
            self.wait()
        except subprocess.TimeoutExpired:
            self._process.kill()
            self.wait()
            raise StillRunning("the agent did not end on SIGTERM") from None


class LogReader(threading.Thread):
    """Turns an agent's log into events while it is written, until the writer ends.

    A message becomes an event of kind "log" with the level as member, the message as its only argument, and
    file, line and function as detail; any other line becomes an event of kind "output".
    """

    def __init__(self, stream: IO[bytes], events: Events) -> None:
        super().__init__(name="log of velks", daemon=True)
        self._stream = stream
        self._events = events
        self._lines: list[str] = []
        self.start()

    @property
    def text(self) -> str:
        """The log so far, in a readable form."""
        return "\n".join(self._lines)

    def run(self) -> None:
        """Read to the end."""
        piece = ""
        with TextIOWrapper(self._stream, "utf-8", "backslashreplace", newline="\n") as lines:
            for line in lines:
                piece += line
                # A message may have several lines.
                if not piece.startswith(_START) or piece.endswith(_END + "\n"):
                    self._take(piece.removesuffix("\n"))
                    piece = ""

    def _take(self, piece: str) -> None:
        fields = piece.removeprefix(_START).removesuffix(_END).split(_FIELD, _FIELDS - 1)
        if not piece.startswith(_START) or len(fields) < _FIELDS:
            if piece:
                self._lines.append(piece)
                self._events.record("velks", "log", "output", "", (piece,))
            return
        level, file, line, function, message = fields
        self._lines.append(f"{level:8} {file}:{line} {function}: {message}")
        detail = {"file": file, "line": int(line), "function": function}
        self._events.record("velks", "log", "log", level, (message,), detail)
