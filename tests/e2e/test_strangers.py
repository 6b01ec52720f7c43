"""Strangers that send a service's signals, with or without its name, queue for a name, or forge its owner."""

from __future__ import annotations

from typing import Any

import pytest

from sandbox.bus.stranger import Stranger
from sandbox.fakes import daemon, dock, launcher
from sandbox.fakes.exported import PROPERTIES
from sandbox.terminal import Terminal
from tests.e2e.dockwatch import CLOSED, closes, dock_warnings, follows, opens, settle, start_with
from tests.e2e.software import EDITOR, install
from tests.e2e.strangers import (
    BUS,
    BUS_PATH,
    Spoken,
    receivers,
    send,
    send_in_the_name_of,
    straight_or_not,
)
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
MAIL = f"{dock.ENTRIES}/e1"


def policy(payload: str) -> Spoken:
    """A policy as the daemon sends it."""
    return Spoken(daemon.PATH, daemon.INTERFACE, "pushPolicyMsg", "ss", ("box", payload))


def log_out_and_report(path: str = daemon.PATH, interface: str = daemon.INTERFACE) -> list[Spoken]:
    """The policy that logs the user out, and the demand for a report."""
    log_out = Spoken(path, interface, "pushPolicyMsg", "ss", ("box", '{"type":1201}'))
    return [log_out, Spoken(path, interface, "pushOnlineMsg")]


def new_owner(stranger: Stranger, name: str, old: str) -> Spoken:
    """What the bus sends when the stranger owns a name."""
    return Spoken(BUS_PATH, BUS, "NameOwnerChanged", "sss", (name, old, stranger.unique_name))


@straight_or_not
@pytest.mark.parametrize("daemon_is", ["there", "late", "gone"])
def test_stranger_is_ignored_whether_the_daemon_is_there_or_not(
    terminal: Terminal, on_system: Stranger, straight: bool, daemon_is: str
) -> None:
    if daemon_is == "late":
        terminal.daemon.leave()
    terminal.start_agent()
    if daemon_is == "gone":
        terminal.daemon.leave()
    mark = terminal.events.mark()
    send(on_system, log_out_and_report(), receivers(terminal, terminal.system_bus, straight))
    if daemon_is != "there":
        terminal.daemon.appear()
    assert settled(terminal, mark) == []


@straight_or_not
@pytest.mark.parametrize(
    ("path", "interface"),
    [
        ("/com/norix/velk/other", daemon.INTERFACE),
        (f"{daemon.PATH}/below", daemon.INTERFACE),
        ("/", daemon.INTERFACE),
        (daemon.PATH, "com.norix.velk.pryg"),
        (daemon.PATH, "com.norix.velk.velkg.other"),
    ],
)
def test_owner_of_the_name_is_ignored_on_another_path_or_interface(
    terminal: Terminal, on_system: Stranger, straight: bool, path: str, interface: str
) -> None:
    terminal.daemon.leave()
    assert on_system.own(daemon.INTERFACE) == 1
    terminal.start_agent()
    mark = terminal.events.mark()
    elsewhere = log_out_and_report(path, interface)
    send(on_system, elsewhere, receivers(terminal, terminal.system_bus, straight))
    on_system.close()
    terminal.daemon.appear()
    assert settled(terminal, mark) == []


def test_signals_that_the_agent_does_not_use_do_nothing(session: Terminal) -> None:
    mark = session.events.mark()
    session.daemon.emit(daemon.INTERFACE, "requestSendAppOpenState", 1, "editor")
    session.daemon.emit(daemon.INTERFACE, "requestSetStoragePerm", 1, 2)
    assert settled(session, mark) == []
    session.daemon.push_online()
    next_status(session, mark)


@straight_or_not
def test_stranger_in_the_queue_is_obeyed_while_it_owns_the_name_and_not_before_or_after(
    session: Terminal, on_system: Stranger, straight: bool
) -> None:
    agent = receivers(session, session.system_bus, straight)
    assert on_system.own(daemon.INTERFACE, queue=True) == 2
    mark = session.events.mark()
    send(on_system, [policy('{"type":1301}')], agent)
    assert settled(session, mark) == []

    session.daemon.leave()
    send(on_system, [policy('{"type":1300}')], agent)
    assert next_notification(session, mark).body == SHUTDOWN_NOTICE

    on_system.release(daemon.INTERFACE)
    mark = session.events.mark()
    send(on_system, [policy('{"type":1301}')], agent)
    session.daemon.appear()
    assert settled(session, mark) == []


@straight_or_not
def test_forged_new_owner_does_not_replace_the_daemon(
    session: Terminal, on_system: Stranger, straight: bool
) -> None:
    mark = session.events.mark()
    forged = new_owner(on_system, daemon.INTERFACE, str(session.system_bus.owner(daemon.INTERFACE)))
    send(on_system, [forged], receivers(session, session.system_bus, straight))
    send(on_system, [policy('{"type":1201}')])
    assert settled(session, mark) == []
    carries_out_policies(session)


@straight_or_not
@pytest.mark.parametrize(
    ("name", "arrived"), [("dock", "dock entry size: 0"), ("launcher", "software inited")]
)
def test_forged_new_owner_is_no_arrival_of_an_awaited_service(
    terminal: Terminal, on_session: Stranger, straight: bool, name: str, arrived: str
) -> None:
    fake = terminal.fakes[name]
    fake.leave()
    mark = start_agent(terminal)
    forged = new_owner(on_session, fake.bus_name, "")
    send(on_session, [forged], receivers(terminal, terminal.session_bus, straight))
    carries_out_policies(terminal)
    assert arrived not in log_lines(terminal, mark)

    fake.appear()
    terminal.events.wait_for(kind="log", args=(arrived,), after=mark)


@pytest.fixture
def desk(terminal: Terminal) -> Terminal:
    """A terminal with an application and a package that the agent knows."""
    install(terminal, EDITOR)
    start_with(terminal, opens("mail"), at_start=True)
    return terminal


LIES = {
    "dock": [
        Spoken(MAIL, dock.ENTRY, "NameChanged", "s", ("Spoof",)),
        Spoken(MAIL, dock.ENTRY, "WindowInfosChanged", "a{us}", ({},)),
        Spoken(MAIL, PROPERTIES, "PropertiesChanged", "sa{sv}as", (dock.ENTRY, {"Name": "Spoof"}, [])),
        Spoken(MAIL, PROPERTIES, "PropertiesChanged", "sa{sv}as", (dock.ENTRY, {}, ["WindowInfos"])),
        Spoken(dock.PATH, dock.INTERFACE, "EntryAdded", "oi", (MAIL, 0)),
        Spoken(dock.PATH, dock.INTERFACE, "EntryRemoved", "s", ("mail",)),
    ],
    "launcher": [
        Spoken(launcher.PATH, launcher.INTERFACE, "ItemChanged", "s(ssssxx)x", ("created", ITEM, 0))
    ],
}


@straight_or_not
@pytest.mark.parametrize("signals", LIES.values(), ids=LIES)
def test_stranger_that_speaks_like_a_service_is_ignored(
    desk: Terminal, on_session: Stranger, signals: list[Spoken], straight: bool
) -> None:
    mark = desk.events.mark()
    send(on_session, signals, receivers(desk, desk.session_bus, straight))
    settle(desk)

    assert (settled(desk, mark), dock_warnings(desk, mark)) == ([], [])
    assert follows(desk, closes("mail")) == [(CLOSED, "Mail")]


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
    ("as", (["mail"],)),
    ("a{sv}", ({"x": 1},)),
    ("si", (MAIL, 0)),
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
    desk: Terminal, name: str, path: str, interface: str, member: str, wanted: str
) -> None:
    mark = desk.events.mark()
    others = [Spoken(path, interface, member, *said) for said in ARGUMENTS if said[0] != wanted]
    send_in_the_name_of(desk.fakes[name], others)
    settle(desk)
    assert (settled(desk, mark), dock_warnings(desk, mark)) == ([], [])

    desk.daemon.push_online()
    next_status(desk, mark)
    carries_out_policies(desk)
