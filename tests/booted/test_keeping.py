"""The agent is back whatever ended it, as long as the session lasts, and stays away once it was stopped."""

from __future__ import annotations

from typing import Iterator

import pytest

from tests.booted.machine import USERS, Machine
from tests.booted.patience import wait_for

BACK_SECONDS = 60.0  # what docs/service.md promises


@pytest.mark.quick
@pytest.mark.parametrize("signal", ["KILL", "SEGV", "TERM"])
def test_agent_that_is_killed_comes_back(session: Machine, signal: str) -> None:
    agent = session.agent("alice")
    session.run("kill", f"-{signal}", str(agent), user="alice")
    session.wait_for_agent("alice", other_than=agent)


@pytest.mark.quick
def test_agent_that_was_stopped_stays_away(session: Machine) -> None:
    session.run("systemctl", "--user", "stop", "velks", user="alice")
    assert session.unit("ActiveState") == "inactive"
    assert session.agents() == []


def test_crash_loop_slows_down_and_is_never_given_up(machine: Machine) -> None:
    machine.write(
        "/run/systemd/user/velks.service.d/crash.conf", "[Service]\nExecStart=\nExecStart=/bin/false\n"
    )
    machine.log_in("alice")
    wait_for("the sixth restart", lambda: machine.unit("NRestarts") == "6", seconds=240)
    wait_for("its pause", lambda: machine.unit("SubState") == "start-pre")
    machine.run("rm", "-r", "/run/systemd/user/velks.service.d")
    machine.run("systemctl", "--user", "daemon-reload", user="alice")
    wait_for("an agent", lambda: machine.unit("SubState") == "running", seconds=BACK_SECONDS)
    assert machine.agents() == [USERS["alice"]]


@pytest.fixture
def whole_again(machine: Machine) -> Iterator[None]:
    """The login manager of systemd 257 stays without its name after the bus was away."""
    yield
    machine.run("systemctl", "restart", "systemd-logind")


@pytest.mark.usefixtures("whole_again")
def test_restart_of_the_system_bus_ends_no_session_and_brings_a_fresh_agent(machine: Machine) -> None:
    session = machine.log_in("alice")
    agent = machine.wait_for_agent("alice")
    mark = machine.mark()
    machine.run("systemctl", "restart", "dbus.service")
    told = machine.wait_for_event(lambda event: event.member == "UpdateUserInfo", mark)
    known = machine.has_service("org.freedesktop.login1")
    assert told.args == (["alice", USERS["alice"]] if known else ["", 0])
    assert machine.wait_for_agent("alice", other_than=agent)
    machine.run("systemctl", "restart", "systemd-logind")
    assert session.name in machine.session_names()


@pytest.mark.usefixtures("whole_again")
@pytest.mark.parametrize("seconds", [30, pytest.param(300, marks=pytest.mark.outlasting)])
def test_system_bus_that_is_away_for_long_brings_a_fresh_agent(session: Machine, seconds: int) -> None:
    old = session.agent("alice")
    before = session.uptime()
    session.run("systemctl", "stop", "dbus.socket", "dbus.service")
    wait_for("the time", lambda: session.uptime() - before > seconds, seconds=2 * seconds)
    assert "[bad]     system bus: cannot be reached" in session.check()
    session.run("systemctl", "start", "dbus.socket", "dbus.service")
    session.run("systemctl", "restart", "systemd-logind")
    fresh = session.wait_for_agent("alice", other_than=old)
    told = [
        event.args for event in session.events() if event.pid == fresh and event.member == "UpdateUserInfo"
    ]
    assert told == [["alice", USERS["alice"]]]


def test_restart_of_the_login_manager_is_not_noticed(session: Machine) -> None:
    agent = session.agent("alice")
    session.run("systemctl", "restart", "systemd-logind")
    mark = session.mark()
    session.command_daemon("Emit", "/com/norix/velk/velkg", "com.norix.velk.velkg", "pushOnlineMsg")
    call = session.wait_for_event(lambda event: event.member == "SendUserStatus", mark)
    assert call.args == [1, "alice"]
    assert session.agent("alice") == agent
