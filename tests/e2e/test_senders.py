"""Only the owner of the daemon's name is obeyed, and only on the daemon's own path and interface."""

from __future__ import annotations

import json
from dataclasses import dataclass
from typing import Iterator

import pytest

from sandbox.bus.stranger import Stranger
from sandbox.terminal import Terminal
from tests.e2e.wire import SHUTDOWN_NOTICE, next_notification, next_status, settled

NAME = "com.norix.velk.velkg"
PATH = "/com/norix/velk/velkg"
POLICY = json.dumps({"type": 1201})


@pytest.fixture
def stranger(terminal: Terminal) -> Iterator[Stranger]:
    """Someone else on the system bus."""
    someone = Stranger(terminal.system_bus)
    yield someone
    someone.close()


@dataclass(frozen=True)
class Road:
    """How a signal is sent: to everyone, or straight to the agent."""

    straight: bool

    def destinations(self, terminal: Terminal) -> list[str | None]:
        """The receivers that the signal names."""
        return list(terminal.agent.bus_names(terminal.system_bus)) if self.straight else [None]


BROADCAST, STRAIGHT = Road(straight=False), Road(straight=True)


def send_policy(
    terminal: Terminal, stranger: Stranger, road: Road, path: str = PATH, interface: str = NAME
) -> None:
    """Let the stranger send a forced log-out, which a marker from it then follows to the same receiver."""
    for destination in road.destinations(terminal):
        stranger.emit(
            path, interface, "pushPolicyMsg", "box", POLICY, signature="ss", destination=destination
        )
        stranger.emit(path, interface, "pushOnlineMsg", destination=destination)
    terminal.system_bus.owner(stranger.unique_name)


@pytest.mark.parametrize("road", [BROADCAST, STRAIGHT], ids=str)
def test_stranger_is_ignored_while_the_daemon_is_there(
    session: Terminal, stranger: Stranger, road: Road
) -> None:
    mark = session.events.mark()
    send_policy(session, stranger, road)
    assert settled(session, mark) == []


@pytest.mark.parametrize("road", [BROADCAST, STRAIGHT], ids=str)
def test_stranger_is_ignored_before_the_daemon_comes(
    terminal: Terminal, stranger: Stranger, road: Road
) -> None:
    terminal.daemon.leave()
    terminal.start_agent()
    mark = terminal.events.mark()
    send_policy(terminal, stranger, road)
    terminal.daemon.appear()
    assert settled(terminal, mark) == []


@pytest.mark.parametrize("road", [BROADCAST, STRAIGHT], ids=str)
def test_stranger_is_ignored_after_the_daemon_has_gone(
    session: Terminal, stranger: Stranger, road: Road
) -> None:
    session.daemon.leave()
    mark = session.events.mark()
    send_policy(session, stranger, road)
    session.daemon.appear()
    assert settled(session, mark) == []


def test_stranger_that_queues_for_the_name_is_ignored(session: Terminal, stranger: Stranger) -> None:
    assert stranger.own(NAME, queue=True) == 2
    mark = session.events.mark()
    send_policy(session, stranger, BROADCAST)
    assert settled(session, mark) == []


@pytest.mark.parametrize("road", [BROADCAST, STRAIGHT], ids=str)
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
    terminal: Terminal, stranger: Stranger, road: Road, path: str, interface: str
) -> None:
    terminal.daemon.leave()
    assert stranger.own(NAME) == 1
    terminal.start_agent()
    mark = terminal.events.mark()
    send_policy(terminal, stranger, road, path, interface)
    stranger.close()
    terminal.daemon.appear()
    assert settled(terminal, mark) == []


def test_signal_of_another_signature_is_ignored(terminal: Terminal, stranger: Stranger) -> None:
    terminal.daemon.leave()
    assert stranger.own(NAME) == 1
    terminal.start_agent()
    mark = terminal.events.mark()
    for signature, args in (("s", (POLICY,)), ("is", (1, POLICY)), ("sss", ("a", POLICY, "b")), ("", ())):
        stranger.emit(PATH, NAME, "pushPolicyMsg", *args, signature=signature)
    stranger.close()
    terminal.daemon.appear()
    assert settled(terminal, mark) == []


def test_new_owner_of_the_name_is_obeyed(session: Terminal, stranger: Stranger) -> None:
    session.daemon.leave()
    assert stranger.own(NAME) == 1
    mark = session.events.mark()
    stranger.emit(PATH, NAME, "pushPolicyMsg", "box", '{"type":1300}', signature="ss")
    assert next_notification(session, mark).body == SHUTDOWN_NOTICE


def test_signals_that_the_agent_does_not_use_do_nothing(session: Terminal) -> None:
    mark = session.events.mark()
    session.daemon.emit(NAME, "requestSendAppOpenState", 1, "editor")
    session.daemon.emit(NAME, "requestSetStoragePerm", 1, 2)
    assert settled(session, mark) == []
    session.daemon.push_online()
    next_status(session, mark)
