"""External commands of the terminal, replaced by recorders that come first in PATH."""

from __future__ import annotations

import json
import os
import socketserver
import threading
from dataclasses import dataclass
from pathlib import Path
from typing import Any, Mapping

from sandbox.events import Events
from sandbox.machine import layout

DEFAULT_COMMANDS = ("systemctl", "restore_config")
RECORDER = Path(__file__).with_name("recorder")


@dataclass(frozen=True)
class Answer:
    """What a command does: its output and exit status, or minus the number of the signal that ends it; or the
    program that is run instead, with the same arguments."""

    status: int = 0
    stdout: bytes = b""
    stderr: bytes = b""
    program: str = ""


def install(name: str) -> None:
    """Put a recorder in the place of command `name`."""
    link = layout.COMMANDS / name
    if not link.is_symlink():
        link.symlink_to(RECORDER)


def install_defaults() -> None:
    """Put the recorders of a fresh box in place, and no others."""
    layout.COMMANDS.mkdir(parents=True, exist_ok=True)
    for left_over in layout.COMMANDS.iterdir():
        left_over.unlink()
    for name in DEFAULT_COMMANDS:
        install(name)


class Commands:
    """Records each call of a replaced command as an event of kind "command" and decides how it ends."""

    def __init__(self, events: Events) -> None:
        self._events = events
        self._answers: dict[str, Answer] = {}
        self._gates: dict[str, threading.Event] = {}
        self._passed_on: dict[str, tuple[str, Answer]] = {}
        self._held: dict[str, list[_Call]] = {}
        layout.COMMAND_SOCKET.unlink(missing_ok=True)
        self._server = _Server(str(layout.COMMAND_SOCKET), _Call)
        self._server.commands = self
        threading.Thread(
            target=self._server.serve_forever, args=(0.02,), name="commands", daemon=True
        ).start()

    def answer(self, name: str, answer: Answer) -> None:
        """Let command `name`, replaced if it was not yet, end with `answer` from now on."""
        install(name)
        self._answers[name] = answer

    def hold(self, name: str) -> None:
        """Let command `name`, replaced if it was not yet, hang until `release`."""
        install(name)
        self._gates[name] = threading.Event()

    def release(self, name: str) -> None:
        """Let the held calls of command `name` end, and later ones pass."""
        gate = self._gates.pop(name, None)
        if gate:
            gate.set()

    def nudge(self, name: str, printed: bytes = b"") -> int:
        """Let the held calls of command `name` write `printed` to their standard output and a blank line to
        their standard error, which makes those who wait for them look at the clock again. Returns when all is
        read: the number of calls, without those that were ended meanwhile."""
        self._held[name] = [call for call in self._held.pop(name, []) if call.nudge(printed)]
        return len(self._held[name])

    def pass_on(self, name: str, unless: str, program: str) -> None:
        """Let `program` answer those calls of command `name` that lack the argument `unless`; they are not
        recorded."""
        self._passed_on[name] = (unless, Answer(program=program))

    def close(self) -> None:
        """Let every held call end and stop listening."""
        for name in list(self._gates):
            self.release(name)
        self._server.shutdown()
        self._server.server_close()
        layout.COMMAND_SOCKET.unlink(missing_ok=True)

    def called(self, name: str, args: tuple[str, ...], detail: Mapping[str, Any], call: _Call) -> Answer:
        """Record one call; returns once the command may end."""
        wanted, elsewhere = self._passed_on.get(name, ("", None))
        if elsewhere and wanted not in args:
            return elsewhere
        gate = self._gates.get(name)
        if gate:
            self._held.setdefault(name, []).append(call)
        self._events.record("velks", name, "command", name, args, detail)
        if gate:
            gate.wait()
        return self._answers.get(name, Answer())


class _Server(socketserver.ThreadingUnixStreamServer):
    daemon_threads = True
    block_on_close = False
    commands: Commands


class _Call(socketserver.StreamRequestHandler):
    def handle(self) -> None:
        call = json.loads(self.rfile.readline())
        args = tuple(os.fsdecode(bytes.fromhex(arg)) for arg in call["argv"])
        assert isinstance(self.server, _Server)
        detail = {"environment": _environment(bytes.fromhex(call["environ"])), "pid": call["pid"]}
        answer = self.server.commands.called(call["name"], args, detail, self)
        self._tell(
            status=answer.status,
            stdout=answer.stdout.hex(),
            stderr=answer.stderr.hex(),
            program=answer.program,
        )

    def nudge(self, printed: bytes) -> bool:
        """Let the held command print this and write to its standard error; false if it was ended before
        somebody read it."""
        return self._tell(nudge=True, stdout=printed.hex()) and self.rfile.readline() != b""

    def _tell(self, **what: Any) -> bool:
        try:
            self.wfile.write(json.dumps(what).encode() + b"\n")
        except BrokenPipeError:
            return False  # the caller was ended while it was held
        return True


def _environment(content: bytes) -> dict[str, str]:
    """What a process was started with, from the text that the system keeps of it."""
    return dict(os.fsdecode(entry).split("=", 1) for entry in content.split(b"\0") if b"=" in entry)
