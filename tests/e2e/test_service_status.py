"""What the service manager shows of the agent: a countdown, during which it should not be restarted."""

from __future__ import annotations

import socket
from pathlib import Path
from typing import Iterator

import pytest

from sandbox.terminal import Terminal

PENDING = b"STATUS=within a minute the session is ended by a policy"
NOTHING = b"STATUS="
_WAIT_SECONDS = 20.0
_LARGEST = 4096


@pytest.fixture
def manager(tmp_path: Path) -> Iterator[socket.socket]:
    """The socket to which services send their status."""
    with socket.socket(socket.AF_UNIX, socket.SOCK_DGRAM) as heard:
        heard.bind(str(tmp_path / "notify"))
        heard.settimeout(_WAIT_SECONDS)
        yield heard


def start_as_service(terminal: Terminal, manager: socket.socket) -> None:
    """Start the agent as a service of this manager."""
    terminal.start_agent(extra_env={"NOTIFY_SOCKET": manager.getsockname()})


@pytest.mark.parametrize("code", [1200, 1201])
def test_countdown_is_shown_from_its_begin_to_its_end(
    terminal: Terminal, manager: socket.socket, code: int
) -> None:
    start_as_service(terminal, manager)
    terminal.daemon.push_policy({"type": code})
    assert manager.recv(_LARGEST).rstrip() == PENDING
    terminal.advance(60)
    assert manager.recv(_LARGEST).rstrip() == NOTHING


def test_countdown_that_begins_anew_is_not_shown_again(terminal: Terminal, manager: socket.socket) -> None:
    start_as_service(terminal, manager)
    terminal.daemon.push_policy({"type": 1201})
    terminal.sync()
    terminal.advance(30)
    terminal.daemon.push_policy({"type": 1201})
    terminal.sync()
    terminal.advance(60)
    assert [manager.recv(_LARGEST).rstrip() for _ in range(2)] == [PENDING, NOTHING]
