"""Only the owner of the daemon's name is obeyed, and only on the daemon's own path and interface."""

from __future__ import annotations

import json

import pytest

from sandbox.bus.stranger import Stranger
from sandbox.terminal import Terminal
from tests.e2e.strangers import let_reach_the_bus, receivers, straight_or_not
from tests.e2e.wire import SHUTDOWN_NOTICE, next_notification, next_status, settled

NAME = "com.norix.velk.velkg"
PATH = "/com/norix/velk/velkg"
POLICY = json.dumps({"type": 1201})


def send_policy(
    terminal: Terminal, on_system: Stranger, straight: bool, path: str = PATH, interface: str = NAME
) -> None:
    """Let the stranger send a forced log-out, which a marker from it then follows to the same receiver."""
    for receiver in receivers(terminal, terminal.system_bus, straight):
        on_system.emit(path, interface, "pushPolicyMsg", "box", POLICY, signature="ss", destination=receiver)
        on_system.emit(path, interface, "pushOnlineMsg", destination=receiver)
    let_reach_the_bus(on_system)


@straight_or_not
def test_stranger_is_ignored_while_the_daemon_is_there(
    session: Terminal, on_system: Stranger, straight: bool
) -> None:
    mark = session.events.mark()
    send_policy(session, on_system, straight)
    assert settled(session, mark) == []


@straight_or_not
def test_stranger_is_ignored_before_the_daemon_comes(
    terminal: Terminal, on_system: Stranger, straight: bool
) -> None:
    terminal.daemon.leave()
    terminal.start_agent()
    mark = terminal.events.mark()
    send_policy(terminal, on_system, straight)
    terminal.daemon.appear()
    assert settled(terminal, mark) == []


@straight_or_not
def test_stranger_is_ignored_after_the_daemon_has_gone(
    session: Terminal, on_system: Stranger, straight: bool
) -> None:
    session.daemon.leave()
    mark = session.events.mark()
    send_policy(session, on_system, straight)
    session.daemon.appear()
    assert settled(session, mark) == []


@straight_or_not
@pytest.mark.parametrize(
    ("path", "interface"),
    [
        ("/com/norix/velk/other", NAME),
        ("/", NAME),
        (PATH, "com.norix.velk.pryg"),
        (PATH, "com.norix.velk.velkg.other"),
    ],
)
def test_owner_of_the_name_is_ignored_on_another_path_or_interface(
    terminal: Terminal, on_system: Stranger, straight: bool, path: str, interface: str
) -> None:
    terminal.daemon.leave()
    assert on_system.own(NAME) == 1
    terminal.start_agent()
    mark = terminal.events.mark()
    send_policy(terminal, on_system, straight, path, interface)
    on_system.close()
    terminal.daemon.appear()
    assert settled(terminal, mark) == []


def test_new_owner_of_the_name_is_obeyed(session: Terminal, on_system: Stranger) -> None:
    session.daemon.leave()
    assert on_system.own(NAME) == 1
    mark = session.events.mark()
    on_system.emit(PATH, NAME, "pushPolicyMsg", "box", '{"type":1300}', signature="ss")
    assert next_notification(session, mark).body == SHUTDOWN_NOTICE


def test_signals_that_the_agent_does_not_use_do_nothing(session: Terminal) -> None:
    mark = session.events.mark()
    session.daemon.emit(NAME, "requestSendAppOpenState", 1, "editor")
    session.daemon.emit(NAME, "requestSetStoragePerm", 1, 2)
    assert settled(session, mark) == []
    session.daemon.push_online()
    next_status(session, mark)
