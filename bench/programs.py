"""The measured programs and the load generators; everything here runs inside a box."""

from __future__ import annotations

import os
import queue
import signal
import subprocess
import threading
import time
from dataclasses import dataclass
from types import TracebackType
from typing import IO, Any, Mapping, Self, Sequence

from bench.processes import Running
from sandbox.agent import default_binary
from sandbox.machine.users import current_user

_SECONDS = 60.0
_CALM = 0.3  # seconds without CPU time after which a process counts as idle


@dataclass(frozen=True)
class Program:
    """A measured program: the agent or a floor. `start_ends` is callgrind's option for the function at which
    the start ends."""

    name: str
    argv: Sequence[str]
    start_ends: str = "--dump-before=startEnds*"


def agent() -> Program:
    """The agent under test. For a local user its start ends after the report of the user to the daemon, for a
    domain user after the handling of the password tips."""
    is_domain = current_user().is_domain_user
    end = (
        "after=HandleEvent::getPasswdExpiredTime*" if is_domain else "before=velkgInterface::SendUserStatus*"
    )
    return Program("agent", [str(default_binary())], f"--dump-{end}")


def bench_program(name: str) -> str:
    """The path of a program of bench/, in the agent's build folder."""
    return str(default_binary().parent.parent / "bench" / f"bench_{name}")


def floor(name: str, *arguments: str) -> Program:
    """The floor with this name."""
    return Program("floor", [bench_program(name), *arguments])


class Process(Running):
    """A program that runs until `stop` or the end of the context; its output is dropped."""

    def __init__(self, argv: Sequence[str], env: Mapping[str, str] | None = None) -> None:
        self.began = time.monotonic_ns()
        self._process: subprocess.Popen[Any] = subprocess.Popen(
            argv,
            env={**os.environ, **(env or {})},
            stdin=subprocess.DEVNULL,
            stdout=subprocess.DEVNULL,
            stderr=subprocess.DEVNULL,
        )
        super().__init__(self._process.pid)

    def __enter__(self) -> Self:
        return self

    def __exit__(
        self, kind: type[BaseException] | None, error: BaseException | None, trace: TracebackType | None
    ) -> None:
        self.stop()

    def stop(self) -> None:
        """End the process as the end of a session does."""
        if self._process.poll() is None:
            self._process.send_signal(signal.SIGTERM)
        self._process.wait(_SECONDS)

    def wait(self, timeout: float) -> None:
        """Wait until the process ends by itself."""
        self._process.wait(timeout)

    def await_calm(self, seconds: float = _CALM) -> None:
        """Wait until the process has used no CPU time for `seconds`."""
        worked = -1
        while worked != (worked := self.cpu_nanoseconds()):
            time.sleep(seconds)


class LoadGenerator(Process):
    """A program of bench/load: it reads commands and prints what happens, one per line."""

    def __init__(self, name: str, *arguments: str) -> None:
        self.began = time.monotonic_ns()
        self._process = subprocess.Popen(
            [bench_program(name), *arguments], stdin=subprocess.PIPE, stdout=subprocess.PIPE, text=True
        )
        Running.__init__(self, self._process.pid)
        assert self._process.stdin and self._process.stdout
        self._commands: IO[str] = self._process.stdin
        self._lines: queue.Queue[list[str]] = queue.Queue()
        threading.Thread(target=self._read, args=(self._process.stdout,), daemon=True).start()
        self.wait_for("ready")

    def stop(self) -> None:
        """Close the program's input, which ends it."""
        self._commands.close()
        self._process.wait(_SECONDS)

    def send(self, command: str) -> None:
        """Give a command."""
        self._commands.write(f"{command}\n")
        self._commands.flush()

    def wait_for(self, word: str, timeout: float = _SECONDS) -> list[int]:
        """Wait for the next line that begins with `word` and return its numbers; drops the lines before
        it."""
        numbers = self.await_line(word, timeout)
        assert numbers is not None, f"'{word}' did not come within {timeout:g} s"
        return numbers

    def await_line(self, word: str, timeout: float) -> list[int] | None:
        """As `wait_for`, but returns None if no such line comes."""
        end = time.monotonic() + timeout
        while True:
            try:
                found, *numbers = self._lines.get(timeout=max(0.0, end - time.monotonic()))
            except queue.Empty:
                return None
            if found == word:
                return [int(text) for text in numbers]

    def forget(self) -> None:
        """Drop the lines that have come so far."""
        while not self._lines.empty():
            self._lines.get_nowait()

    def _read(self, stream: IO[str]) -> None:
        for line in stream:
            self._lines.put(line.split())
