"""The agent is back whatever ended it, as long as the session lasts, and stays away when it was told to."""

from __future__ import annotations

import pytest

from tests.booted.machine import USERS, Machine
from tests.booted.patience import wait_for

BACK_SECONDS = 60.0  # what docs/service.md promises


@pytest.mark.parametrize("signal", ["KILL", "SEGV", "TERM"])
def test_agent_that_is_killed_comes_back(machine: Machine, signal: str) -> None:
    machine.log_in("alice")
    agent = machine.wait_for_agent("alice")
    machine.run("kill", f"-{signal}", str(agent), user="alice")
    machine.wait_for_agent("alice", other_than=agent)


def test_agent_that_was_stopped_stays_away(machine: Machine) -> None:
    machine.log_in("alice")
    machine.wait_for_agent("alice")
    machine.run("systemctl", "--user", "stop", "velks", user="alice")
    assert state(machine, "ActiveState") == "inactive"
    assert machine.agents() == []


def state(machine: Machine, name: str) -> str:
    """A property of alice's unit."""
    return machine.said("systemctl", "--user", "show", "velks", f"--property={name}", "--value", user="alice")


def test_crash_loop_slows_down_and_is_never_given_up(machine: Machine) -> None:
    machine.write(
        "/run/systemd/user/velks.service.d/crash.conf", "[Service]\nExecStart=\nExecStart=/bin/false\n"
    )
    machine.log_in("alice")
    wait_for("the sixth restart", lambda: state(machine, "NRestarts") == "6", seconds=120)
    wait_for("its pause", lambda: state(machine, "SubState") == "start-pre")
    machine.run("rm", "-r", "/run/systemd/user/velks.service.d")
    machine.run("systemctl", "--user", "daemon-reload", user="alice")
    wait_for("an agent", lambda: state(machine, "SubState") == "running", seconds=BACK_SECONDS)
    assert machine.agents() == [USERS["alice"]]


def test_restart_of_the_system_bus_ends_no_session_and_brings_a_fresh_agent(machine: Machine) -> None:
    session = machine.log_in("alice")
    agent = machine.wait_for_agent("alice")
    mark = machine.mark()
    machine.run("systemctl", "restart", "dbus.service")
    told = machine.wait_for_event(lambda event: event.member == "UpdateUserInfo", mark)
    assert told.args == ["alice", USERS["alice"]]
    assert machine.wait_for_agent("alice", other_than=agent)
    assert session.name in machine.session_names()


def test_system_bus_that_is_away_for_long_brings_a_fresh_agent(machine: Machine) -> None:
    machine.log_in("alice")
    machine.wait_for_agent("alice")
    mark = machine.mark()
    machine.run("systemctl", "stop", "dbus.socket", "dbus.service")
    wait_for(
        "more failures than a limit would allow", lambda: int(state(machine, "NRestarts")) > 5, seconds=90
    )
    machine.run("systemctl", "start", "dbus.socket", "dbus.service")
    machine.run("systemctl", "restart", "systemd-logind")
    machine.wait_for_event(lambda event: event.member == "UpdateUserInfo", mark)


def test_restart_of_the_login_manager_is_not_noticed(machine: Machine) -> None:
    machine.log_in("alice")
    agent = machine.wait_for_agent("alice")
    machine.run("systemctl", "restart", "systemd-logind")
    mark = machine.mark()
    machine.command_daemon("Emit", "/com/norix/velk/velkg", "com.norix.velk.velkg", "pushOnlineMsg")
    told = machine.wait_for_event(lambda event: event.member == "SendUserStatus", mark)
    assert told.args == [1, "alice"]
    assert machine.agent("alice") == agent
