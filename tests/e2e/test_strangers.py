"""Strangers that queue for a name, forge a new owner of a name, or send the launcher's signals."""

from __future__ import annotations

from typing import Any

import pytest

from sandbox.bus.stranger import Stranger
from sandbox.fakes import daemon, dock, launcher
from sandbox.fakes.base import Fake
from sandbox.terminal import Terminal
from tests.e2e.dockwatch import settle, reported
from tests.e2e.software import EDITOR, install, uploads
from tests.e2e.strangers import BUS, BUS_PATH, let_reach_the_bus, receivers, straight_or_not
from tests.e2e.wire import (
    SHUTDOWN_NOTICE,
    carries_out_policies,
    log_lines,
    next_notification,
    next_status,
    settled,
    start_agent,
)

ITEM = ("/usr/share/applications/spoof.desktop", "Spoof", "", "", 0, 0)


def push(stranger: Stranger, payload: str) -> None:
    """Let the stranger send a policy as the daemon does."""
    stranger.emit(daemon.PATH, daemon.INTERFACE, "pushPolicyMsg", "box", payload, signature="ss")
    let_reach_the_bus(stranger)


def forge_owner(stranger: Stranger, name: str, old: str, receiver: str | None) -> None:
    """Let the stranger announce, as the bus does, that it owns a name now."""
    args = (name, old, stranger.unique_name)
    stranger.emit(BUS_PATH, BUS, "NameOwnerChanged", *args, signature="sss", destination=receiver)


def test_stranger_in_the_queue_is_obeyed_once_it_owns_the_name_and_not_before(
    session: Terminal, on_system: Stranger
) -> None:
    assert on_system.own(daemon.INTERFACE, queue=True) == 2
    mark = session.events.mark()
    push(on_system, '{"type":1301}')
    assert settled(session, mark) == []

    session.daemon.leave()
    push(on_system, '{"type":1300}')
    assert next_notification(session, mark).body == SHUTDOWN_NOTICE


@straight_or_not
def test_forged_new_owner_does_not_replace_the_daemon(
    session: Terminal, on_system: Stranger, straight: bool
) -> None:
    mark = session.events.mark()
    for receiver in receivers(session, session.system_bus, straight):
        forge_owner(on_system, daemon.INTERFACE, str(session.daemon.unique_name), receiver)
    push(on_system, '{"type":1201}')
    assert settled(session, mark) == []
    carries_out_policies(session)


@straight_or_not
@pytest.mark.parametrize(
    ("name", "bus_name", "arrived"),
    [("dock", dock.INTERFACE, "dock entry size: 0"), ("launcher", launcher.INTERFACE, "software inited")],
)
def test_forged_new_owner_is_no_arrival_of_an_awaited_service(
    terminal: Terminal, on_session: Stranger, straight: bool, name: str, bus_name: str, arrived: str
) -> None:
    fake: Fake = terminal.fakes[name]
    fake.leave()
    mark = start_agent(terminal)
    for receiver in receivers(terminal, terminal.session_bus, straight):
        forge_owner(on_session, bus_name, "", receiver)
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


# Every signal with arguments that the agent listens to: its sender, path, interface and signature.
# pushOnlineMsg has none.
SIGNALS = [
    ("daemon", daemon.PATH, daemon.INTERFACE, "pushPolicyMsg", "ss"),
    ("dock", dock.PATH, dock.INTERFACE, "EntryAdded", "oi"),
    ("dock", dock.PATH, dock.INTERFACE, "EntryRemoved", "s"),
    ("launcher", launcher.PATH, launcher.INTERFACE, "ItemChanged", "s(ssssxx)x"),
]
ARGUMENTS: list[tuple[str, tuple[Any, ...]]] = [
    ("", ()),
    ("s", ('{"type":1201}',)),
    ("is", (1, '{"type":1201}')),
    ("sss", ("box", '{"type":1201}', "x")),
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
    assert reported(terminal, mark) == []

    terminal.daemon.push_online()
    next_status(terminal, mark)
    carries_out_policies(terminal)
