"""External commands, replaced by recorders that come first in PATH."""

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
    """What a command does: its output and exit status (negative: the signal that ends it), or the `program`
    that it executes with the same arguments."""

    status: int = 0
    stdout: bytes = b""
    stderr: bytes = b""
    program: str = ""


def install_defaults() -> None:
    """Install the recorders of a fresh box and remove all others."""
    layout.COMMANDS.mkdir(parents=True, exist_ok=True)
    for left_over in layout.COMMANDS.iterdir():
        left_over.unlink()
    for name in DEFAULT_COMMANDS:
        _install(name)


def _install(name: str) -> None:
    """Replace command `name` by a recorder."""
    link = layout.COMMANDS / name
    if not link.is_symlink():
        link.symlink_to(RECORDER)


class Commands:
    """Records each call of a replaced command as an event of kind "command" and decides what the command
    does."""

    def __init__(self, events: Events) -> None:
        self._events = events
        self._answers: dict[str, Answer] = {}
        self._gates: dict[str, threading.Event] = {}
        self._held: dict[str, list[_Call]] = {}
        layout.COMMAND_SOCKET.unlink(missing_ok=True)
        self._server = _Server(str(layout.COMMAND_SOCKET), _Call)
        self._server.commands = self
        threading.Thread(
            target=self._server.serve_forever, args=(0.02,), name="commands", daemon=True
        ).start()

    def answer(self, name: str, answer: Answer) -> None:
        """Replace command `name`; its calls end with `answer` from now on."""
        self._replace(name)
        self._answers[name] = answer

    def hold(self, name: str) -> None:
        """Replace command `name`; its calls hang until `release`, then end as set by `answer`."""
        self._replace(name)
        self._gates[name] = threading.Event()

    def release(self, name: str) -> None:
        """Let the held calls of command `name` end, and hold no more."""
        gate = self._gates.pop(name, None)
        if gate:
            gate.set()

    def nudge(self, name: str, printed: bytes = b"") -> int:
        """Make the held calls of command `name` write `printed` to their standard output and an empty line to
        their standard error, so that their callers wake up and read the clock. Returns the number of calls
        that are still alive, once their output is read."""
        self._held[name] = [call for call in self._held.pop(name, []) if call.nudge(printed)]
        return len(self._held[name])

    def close(self) -> None:
        """Release all held calls and stop listening."""
        for name in list(self._gates):
            self.release(name)
        self._server.shutdown()
        self._server.server_close()
        layout.COMMAND_SOCKET.unlink(missing_ok=True)

    def handle_call(self, name: str, args: tuple[str, ...], detail: Mapping[str, Any], call: _Call) -> Answer:
        """Record one call; returns once the command may end."""
        gate = self._gates.get(name)
        if gate:
            self._held.setdefault(name, []).append(call)
        self._events.record("velks", name, "command", name, args, detail)
        if gate:
            gate.wait()
        return self._answers.get(name, Answer())

    def _replace(self, name: str) -> None:
        _install(name)


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
        answer = self.server.commands.handle_call(call["name"], args, detail, self)
        self._send(
            status=answer.status,
            stdout=answer.stdout.hex(),
            stderr=answer.stderr.hex(),
            program=answer.program,
        )

    def nudge(self, printed: bytes) -> bool:
        """Make the held command write its output; returns whether the output was read before the command was
        killed."""
        return self._send(nudge=True, stdout=printed.hex()) and self.rfile.readline() != b""

    def _send(self, **answer: Any) -> bool:
        try:
            self.wfile.write(json.dumps(answer).encode() + b"\n")
        except BrokenPipeError:
            return False  # the command was killed while it was held
        return True


def _environment(content: bytes) -> dict[str, str]:
    """The variables in a process's /proc/PID/environ."""
    return dict(os.fsdecode(entry).split("=", 1) for entry in content.split(b"\0") if b"=" in entry)
