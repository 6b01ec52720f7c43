"""Strangers who wait for a name, claim that a name has changed hands, or speak like the launcher."""

from __future__ import annotations

from typing import Any, Iterator

import pytest

from sandbox.bus.buses import Bus
from sandbox.bus.stranger import Stranger
from sandbox.fakes import daemon, dock, launcher
from sandbox.fakes.base import Fake
from sandbox.terminal import Terminal
from tests.e2e.dockwatch import settle, told
from tests.e2e.software import EDITOR, install, uploads
from tests.e2e.wire import (
    SHUTDOWN_NOTICE,
    carries_out_policies,
    log_lines,
    next_notification,
    next_status,
    settled,
)

BUS = "org.freedesktop.DBus"
BUS_PATH = "/org/freedesktop/DBus"
ITEM = ("/usr/share/applications/spoof.desktop", "Spoof", "", "", 0, 0)

straight_or_not = pytest.mark.parametrize("straight", [False, True], ids=["broadcast", "straight"])


@pytest.fixture
def on_system(terminal: Terminal) -> Iterator[Stranger]:
    """Someone else on the system bus."""
    someone = Stranger(terminal.system_bus)
    yield someone
    someone.close()


@pytest.fixture
def on_session(terminal: Terminal) -> Iterator[Stranger]:
    """Someone else on the session bus."""
    someone = Stranger(terminal.session_bus)
    yield someone
    someone.close()


def receivers(terminal: Terminal, bus: Bus, straight: bool) -> list[str | None]:
    """Whom a signal names: everyone, or the agent."""
    return [*terminal.agent.bus_names(bus)] if straight else [None]


def let_reach_the_bus(stranger: Stranger) -> None:
    """Return once the bus has passed on what the stranger sent."""
    stranger.call(BUS, BUS_PATH, BUS, "GetId")


def push(stranger: Stranger, payload: str) -> None:
    """Let the stranger send a policy as the daemon does."""
    stranger.emit(daemon.PATH, daemon.INTERFACE, "pushPolicyMsg", "box", payload, signature="ss")
    let_reach_the_bus(stranger)


def say_that_it_owns(stranger: Stranger, name: str, old: str, receiver: str | None) -> None:
    """Let the stranger say, as the bus does, that a name is its own now."""
    args = (name, old, stranger.unique_name)
    stranger.emit(BUS_PATH, BUS, "NameOwnerChanged", *args, signature="sss", destination=receiver)


def test_stranger_in_the_queue_is_obeyed_once_it_owns_the_name_and_not_before(
    terminal: Terminal, on_system: Stranger
) -> None:
    terminal.start_agent()
    assert on_system.own(daemon.INTERFACE, queue=True) == 2
    mark = terminal.events.mark()
    push(on_system, '{"type":1301}')
    assert settled(terminal, mark) == []

    terminal.daemon.leave()
    push(on_system, '{"type":1300}')
    assert next_notification(terminal, mark).body == SHUTDOWN_NOTICE


@straight_or_not
def test_daemon_is_not_replaced_by_somebody_who_says_so(
    terminal: Terminal, on_system: Stranger, straight: bool
) -> None:
    terminal.start_agent()
    mark = terminal.events.mark()
    for receiver in receivers(terminal, terminal.system_bus, straight):
        say_that_it_owns(on_system, daemon.INTERFACE, str(terminal.daemon.unique_name), receiver)
    push(on_system, '{"type":1201}')
    assert settled(terminal, mark) == []
    carries_out_policies(terminal)


@straight_or_not
@pytest.mark.parametrize(
    ("name", "bus_name", "arrived"),
    [("dock", dock.INTERFACE, "dock entry size: 0"), ("launcher", launcher.INTERFACE, "software inited")],
)
def test_awaited_service_has_not_come_because_somebody_says_so(
    terminal: Terminal, on_session: Stranger, straight: bool, name: str, bus_name: str, arrived: str
) -> None:
    fake: Fake = terminal.fakes[name]
    fake.leave()
    mark = terminal.events.mark()
    terminal.start_agent()
    for receiver in receivers(terminal, terminal.session_bus, straight):
        say_that_it_owns(on_session, bus_name, "", receiver)
    let_reach_the_bus(on_session)
    carries_out_policies(terminal)
    assert arrived not in log_lines(terminal, mark)

    fake.appear()
    terminal.events.wait_for(kind="log", args=(arrived,), after=mark)


@straight_or_not
def test_stranger_that_speaks_like_the_launcher_is_ignored(
    terminal: Terminal, on_session: Stranger, straight: bool
) -> None:
    install(terminal, EDITOR)
    terminal.start_agent()
    mark = terminal.events.mark()
    for receiver in receivers(terminal, terminal.session_bus, straight):
        on_session.emit(
            launcher.PATH,
            launcher.INTERFACE,
            "ItemChanged",
            "created",
            ITEM,
            0,
            signature="s(ssssxx)x",
            destination=receiver,
        )
    let_reach_the_bus(on_session)
    settle(terminal)
    assert (settled(terminal, mark), uploads(terminal, mark)) == ([], [])


# Every signal with arguments that the agent listens to: whose it is, where it is sent from, and what it
# should carry. The one without, pushOnlineMsg, says all by its name.
SIGNALS = [
    ("daemon", daemon.PATH, daemon.INTERFACE, "pushPolicyMsg", "ss"),
    ("dock", dock.PATH, dock.INTERFACE, "EntryAdded", "oi"),
    ("dock", dock.PATH, dock.INTERFACE, "EntryRemoved", "s"),
    ("launcher", launcher.PATH, launcher.INTERFACE, "ItemChanged", "s(ssssxx)x"),
]
ARGUMENTS: list[tuple[str, tuple[Any, ...]]] = [
    ("", ()),
    ("s", ("x",)),
    ("i", (1,)),
    ("v", ("x",)),
    ("as", (["x", "y"],)),
    ("a{sv}", ({"x": 1},)),
    ("si", ("x", 1)),
    ("ssi", ("x", '{"type":1201}', 1)),
    ("ass", (["x"], '{"type":1201}')),
    ("o", ("/x",)),
    ("oix", ("/x", 1, 1)),
    ("s(ssss)x", ("created", ("/x", "X", "", ""), 0)),
    ("s(ssssii)x", ("created", ("/x", "X", "", "", 0, 0), 0)),
    ("s(ssssxx)", ("created", ITEM)),
    ("sa(ssssxx)x", ("created", [ITEM], 0)),
]


@pytest.mark.parametrize(
    ("name", "path", "interface", "member", "wanted"), SIGNALS, ids=[known[3] for known in SIGNALS]
)
def test_signal_with_other_arguments_than_its_own_does_nothing(
    terminal: Terminal, name: str, path: str, interface: str, member: str, wanted: str
) -> None:
    fake = terminal.fakes[name]
    terminal.start_agent()
    settle(terminal)
    fake.leave()
    owner = Stranger(fake.bus)
    assert owner.own(interface) == 1
    mark = terminal.events.mark()
    for signature, args in ARGUMENTS:
        if signature != wanted:
            owner.emit(path, interface, member, *args, signature=signature)
    let_reach_the_bus(owner)
    owner.close()
    fake.appear()
    settle(terminal)
    assert settled(terminal, mark) == []
    assert told(terminal, mark) == []

    terminal.daemon.push_online()
    next_status(terminal, mark)
    carries_out_policies(terminal)
