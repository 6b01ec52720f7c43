"""Programs that are measured or that the measured ones talk to; everything here runs inside a box."""

from __future__ import annotations

import os
import queue
import signal
import subprocess
import threading
import time
from dataclasses import dataclass
from pathlib import Path
from types import TracebackType
from typing import IO, Any, Mapping, Self, Sequence

from sandbox.agent import default_binary
from sandbox.machine.users import current_user

_SECONDS = 60.0
_CALM = 0.3  # seconds without work that are taken for idleness


@dataclass(frozen=True)
class Program:
    """A program to be measured: the agent or a floor. `start_ends` is the option by which callgrind knows the
    function where its start ends."""

    name: str
    argv: Sequence[str]
    start_ends: str = "--dump-before=startEnds*"


def agent() -> Program:
    """The agent under test. For a local user its start ends when the daemon has been told of the user, for a
    domain user when the password tips have been handled."""
    is_domain = current_user().is_domain_user
    end = (
        "after=HandleEvent::getPasswdExpiredTime*" if is_domain else "before=velkgInterface::SendUserStatus*"
    )
    return Program("agent", [str(default_binary())], f"--dump-{end}")


def bench_program(name: str) -> str:
    """Path of one of the programs under bench/, which the agent's build folder holds too."""
    return str(default_binary().parent.parent / "bench" / f"bench_{name}")


def floor(name: str, *arguments: str) -> Program:
    """A floor."""
    return Program("floor", [bench_program(name), *arguments])


class Process:
    """A program that runs until `stop` or the end of the context; its output is not looked at."""

    def __init__(self, argv: Sequence[str], env: Mapping[str, str] | None = None) -> None:
        self.began = time.monotonic_ns()
        self._process: subprocess.Popen[Any] = subprocess.Popen(
            argv,
            env={**os.environ, **(env or {})},
            stdin=subprocess.DEVNULL,
            stdout=subprocess.DEVNULL,
            stderr=subprocess.DEVNULL,
        )

    def __enter__(self) -> Self:
        return self

    def __exit__(
        self, kind: type[BaseException] | None, error: BaseException | None, trace: TracebackType | None
    ) -> None:
        self.stop()

    @property
    def pid(self) -> int:
        """Process id."""
        return self._process.pid

    def stop(self) -> None:
        """End it as the end of a session does."""
        if self._process.poll() is None:
            self._process.send_signal(signal.SIGTERM)
        self._process.wait(_SECONDS)

    def wait(self, timeout: float) -> None:
        """Wait until it ends by itself."""
        self._process.wait(timeout)

    def await_calm(self, seconds: float = _CALM) -> None:
        """Wait until it has had nothing to do for so long."""
        worked = -1
        while worked != (worked := self.cpu_nanoseconds()):
            time.sleep(seconds)

    def memory(self, name: str) -> float:
        """A line of the kernel's sum over all of the process's memory, in KiB: "Rss", "Private_Dirty"..."""
        return _kibibytes(Path(f"/proc/{self.pid}/smaps_rollup"), name)

    def status(self, name: str) -> float:
        """A line of the process's status in KiB: "VmStk", "VmHWM"..."""
        return _kibibytes(Path(f"/proc/{self.pid}/status"), name)

    def voluntary_switches(self) -> int:
        """How often its threads have gone to sleep so far."""
        return sum(_field(task / "status", "voluntary_ctxt_switches") for task in self._tasks())

    def cpu_nanoseconds(self) -> int:
        """How long its threads have run so far."""
        return sum(int((task / "schedstat").read_text().split()[0]) for task in self._tasks())

    def threads(self) -> int:
        """How many threads it has now."""
        return len(self._tasks())

    def _tasks(self) -> list[Path]:
        return list(Path(f"/proc/{self.pid}/task").iterdir())


class LoadGenerator(Process):
    """One of the programs under bench/load: it takes commands and tells what happens, a line each."""

    def __init__(self, name: str, *arguments: str) -> None:
        self.began = time.monotonic_ns()
        self._process = subprocess.Popen(
            [bench_program(name), *arguments], stdin=subprocess.PIPE, stdout=subprocess.PIPE, text=True
        )
        assert self._process.stdin and self._process.stdout
        self._commands: IO[str] = self._process.stdin
        self._lines: queue.Queue[list[str]] = queue.Queue()
        threading.Thread(target=self._read, args=(self._process.stdout,), daemon=True).start()
        self.wait_for("ready")

    def stop(self) -> None:
        """End it."""
        self._commands.close()
        self._process.wait(_SECONDS)

    def tell(self, command: str) -> None:
        """Give a command."""
        self._commands.write(f"{command}\n")
        self._commands.flush()

    def wait_for(self, word: str, timeout: float = _SECONDS) -> list[int]:
        """The numbers of the next line that begins with `word`; others before it are dropped."""
        numbers = self.await_line(word, timeout)
        assert numbers is not None, f"'{word}' did not come within {timeout:g} s"
        return numbers

    def await_line(self, word: str, timeout: float) -> list[int] | None:
        """The same, but None when no such line came."""
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


def _kibibytes(path: Path, name: str) -> float:
    return float(_field(path, name))


def _field(path: Path, name: str) -> int:
    for line in path.read_text().splitlines():
        if line.startswith(f"{name}:"):
            return int(line.split()[1])
    raise AssertionError(f"no {name} in {path}")
