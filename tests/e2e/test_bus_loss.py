"""A bus that goes away: the agent says so and ends, so that its service manager starts a fresh one."""

from __future__ import annotations

import contextlib
import os
import signal
from typing import Callable

import pytest

from sandbox.bus import flooder
from sandbox.bus.buses import Bus
from sandbox.events import NotSeen, Predicate
from sandbox.fakes import dock
from sandbox.fakes.fault import Fault
from sandbox.machine.clock import ManualClock
from sandbox.periods import DBUS_LIMIT
from sandbox.terminal import Terminal
from tests.e2e.strangers import receivers, straight_or_not
from tests.e2e.wire import (
    FIVE_MINUTES,
    begin_countdown,
    carries_out_policies,
    forced_actions,
    next_status,
    push,
    push_online,
    wait_on_notification,
)

ADDRESSES = {"system": "DBUS_SYSTEM_BUS_ADDRESS", "session": "DBUS_SESSION_BUS_ADDRESS"}

both_buses = pytest.mark.parametrize("kind", ["system", "session"])


def bus_of(terminal: Terminal, kind: str) -> Bus:
    """The bus of this kind."""
    return {"system": terminal.system_bus, "session": terminal.session_bus}[kind]


def ends_for_want_of(terminal: Terminal, *kinds: str) -> bool:
    """Whether the agent ends with the status of a failure, after one line for each of these buses."""
    status = terminal.agent.wait()
    lines = [event.args[0] for event in terminal.events.all(kind="log", member="critical")]
    return (status, lines) == (1, [f"no connection to the {kind} bus, ending" for kind in kinds])


def wake(terminal: Terminal, kind: str, seconds: int) -> None:
    """Move the agent's clock and wake the agent up by a signal on one bus; the other one may be gone."""
    assert isinstance(terminal.clock, ManualClock)
    terminal.clock.jump(seconds)
    if kind == "system":
        terminal.daemon.push_policy("wake up")
    else:
        terminal.dock.emit(dock.INTERFACE, "EntryRemoved", "unknown")


def wait_by_limits(terminal: Terminal, awake: str, after: int, predicate: Predicate) -> None:
    """Let one limit after the other go by until the agent logs such a line. The bus that it waits for is
    stopped and cannot show when the wait begins; a signal on the other bus wakes the agent up."""
    for _ in range(20):
        wake(terminal, awake, DBUS_LIMIT)
        with contextlib.suppress(NotSeen):
            terminal.events.wait_for(predicate, kind="log", after=after, timeout=1)
            return
    raise AssertionError("the agent still waits")


def let_the_name_be_asked_for(terminal: Terminal) -> None:
    """The agent waits for a service on the system bus that never answers."""
    terminal.logind.fault = Fault("hang")
    mark = push_online(terminal)
    terminal.events.wait_for(target="logind", member="Get", after=mark)


def let_a_notice_be_shown(terminal: Terminal) -> None:
    """The agent waits for a service on the session bus that never answers."""
    wait_on_notification(terminal, Fault("hang"))


@both_buses
def test_the_loss_of_a_bus_is_one_line_and_the_end(session: Terminal, kind: str) -> None:
    bus_of(session, kind).stop()
    assert ends_for_want_of(session, kind)


@both_buses
def test_a_bus_that_was_restarted_is_not_connected_to_again_but_by_a_fresh_agent(
    session: Terminal, kind: str
) -> None:
    bus_of(session, kind).restart()
    assert ends_for_want_of(session, kind)

    for fake in session.fakes.values():
        if not fake.present:
            fake.appear()
    session.start_agent()
    carries_out_policies(session)


@both_buses
@pytest.mark.parametrize(
    ("waits_on", "wait"),
    [("system", let_the_name_be_asked_for), ("session", let_a_notice_be_shown)],
    ids=["waiting on the system bus", "waiting on the session bus"],
)
def test_a_bus_lost_while_an_answer_is_waited_for_is_noticed_after_the_limit(
    session: Terminal, kind: str, waits_on: str, wait: Callable[[Terminal], None]
) -> None:
    wait(session)
    bus_of(session, kind).stop()
    if kind != waits_on:
        wake(session, waits_on, DBUS_LIMIT)
    assert ends_for_want_of(session, kind)


@both_buses
def test_a_bus_lost_during_the_countdown_ends_the_countdown_too(session: Terminal, kind: str) -> None:
    mark = begin_countdown(session)
    bus_of(session, kind).stop()
    assert ends_for_want_of(session, kind)
    assert forced_actions(session, mark) == []


@both_buses
def test_a_bus_lost_while_the_restore_script_runs_lets_it_end_first(session: Terminal, kind: str) -> None:
    session.commands.hold("restore_config")
    session.daemon.push_policy({"type": 1200})
    session.events.wait_for(kind="command", target="restore_config")
    bus_of(session, kind).stop()
    assert session.agent.alive
    session.commands.release("restore_config")
    assert ends_for_want_of(session, kind)
    session.events.wait_for(kind="command", target="systemctl")


@pytest.mark.parametrize("kinds", [("system",), ("session",), ("system", "session")], ids=str)
def test_an_agent_without_a_bus_at_its_start_ends(terminal: Terminal, kinds: tuple[str, ...]) -> None:
    nowhere = {ADDRESSES[kind]: "unix:path=/nowhere" for kind in kinds}
    terminal.agent.start(terminal.clock, extra_env=nowhere)
    assert ends_for_want_of(terminal, *kinds)


def test_a_hung_session_bus_costs_the_limit_and_is_no_loss(session: Terminal) -> None:
    pid = session.session_bus.pid
    assert pid
    os.kill(pid, signal.SIGSTOP)
    mark = push(session, {"type": 1300})
    wait_by_limits(session, "system", mark, lambda event: event.args[0].startswith("--@@@@--"))
    os.kill(pid, signal.SIGCONT)
    carries_out_policies(session)


def test_a_hung_system_bus_costs_the_limit_and_is_no_loss(session: Terminal) -> None:
    session.sync()
    pid = session.system_bus.pid
    assert pid
    os.kill(pid, signal.SIGSTOP)
    mark = session.events.mark()
    wake(session, "session", FIVE_MINUTES)
    wait_by_limits(session, "session", mark, lambda event: event.args[0].startswith("get screenLocked"))
    os.kill(pid, signal.SIGCONT)
    assert next_status(session, mark) == (1, "")
    carries_out_policies(session)


def forge_the_loss(bus: Bus, destination: str | None) -> None:
    """Send the signal by which the D-Bus library reports a lost bus, and which no library sends. The bus
    expels its sender."""
    lie = flooder.signal(
        "/org/freedesktop/DBus/Lokal", "org.freedesktop.DBus.Lokal", "Disconnected", destination=destination
    )
    stranger = flooder.Flooder(bus)
    stranger.send([lie.replace(b"Lokal", b"Local")])
    assert stranger.is_expelled()
    stranger.close()


@both_buses
@straight_or_not
def test_forged_loss_of_a_bus_is_ignored(session: Terminal, kind: str, straight: bool) -> None:
    bus = bus_of(session, kind)
    for receiver in receivers(session, bus, straight):
        forge_the_loss(bus, receiver)
    carries_out_policies(session)
    assert session.agent.alive
