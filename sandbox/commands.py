"""External commands of the terminal, replaced by recorders that come first in PATH."""

from __future__ import annotations

import json
import os
import socketserver
import threading
from dataclasses import dataclass

from sandbox import layout
from sandbox.events import Events

DEFAULT_COMMANDS = ("systemctl", "restore_config")
_RECORDER = layout.REPOSITORY / "sandbox" / "recorder"


@dataclass(frozen=True)
class Answer:
    """What a command does: its output and exit status, or minus the number of the signal that ends it."""

    status: int = 0
    stdout: bytes = b""
    stderr: bytes = b""


def install(name: str) -> None:
    """Put a recorder in the place of command `name`."""
    link = layout.COMMANDS / name
    if not link.is_symlink():
        link.symlink_to(_RECORDER)


def install_defaults() -> None:
    """Put the recorders of a fresh box in place."""
    layout.COMMANDS.mkdir(parents=True, exist_ok=True)
    for name in DEFAULT_COMMANDS:
        install(name)


class Commands:
    """Records each call of a replaced command as an event of kind "command" and decides how it ends."""

    def __init__(self, events: Events) -> None:
        self._events = events
        self._answers: dict[str, Answer] = {}
        self._gates: dict[str, threading.Event] = {}
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

    def close(self) -> None:
        """Let every held call end and stop listening."""
        for name in list(self._gates):
            self.release(name)
        self._server.shutdown()
        self._server.server_close()
        layout.COMMAND_SOCKET.unlink(missing_ok=True)

    def called(self, name: str, args: tuple[str, ...]) -> Answer:
        """Record one call; returns once the command may end."""
        gate = self._gates.get(name)
        self._events.record("velks", name, "command", name, args)
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
        answer = self.server.commands.called(call["name"], args)
        reply = {"status": answer.status, "stdout": answer.stdout.hex(), "stderr": answer.stderr.hex()}
        try:
            self.wfile.write(json.dumps(reply).encode() + b"\n")
        except BrokenPipeError:
            pass  # the caller was ended while it was held
