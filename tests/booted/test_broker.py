"""A machine whose system and user buses are dbus-broker's."""

from __future__ import annotations

from typing import Iterator

import pytest

from tests.booted.conftest import boot
from tests.booted.machine import USERS, Machine
from tests.booted.patience import wait_for


@pytest.fixture(scope="module")
def brokered(tmp_path_factory: pytest.TempPathFactory) -> Iterator[Machine]:
    """A machine of its own, which was told to use dbus-broker and then rebooted."""
    machine = boot(tmp_path_factory.mktemp("brokered"))
    machine.overlay.bring_programs("dbus-broker")
    machine.run("systemctl", "daemon-reload")
    for scope in ("--system", "--global"):
        machine.run("systemctl", scope, "enable", "dbus-broker.service")
    machine.run("systemctl", "reboot")
    machine.wait_for_reboot()
    yield machine
    machine.close()


@pytest.fixture
def session(brokered: Machine) -> Iterator[Machine]:
    """The machine with alice's agent at work."""
    assert (
        brokered.said("systemctl", "show", "dbus.service", "--property=Id", "--value")
        == "dbus-broker.service"
    )
    brokered.log_in("alice")
    brokered.wait_for_agent("alice")
    assert "dbus-broker" in brokered.said("ps", "-u", "alice", "-o", "comm=")
    yield brokered
    brokered.end_sessions()


def test_agent_reports_and_obeys(session: Machine) -> None:
    told = [event.args for event in session.events() if event.member == "UpdateUserInfo"]
    assert told[-1] == ["alice", USERS["alice"]]
    mark = session.mark()
    session.push_policy({"type": 5})
    session.push_policy({"type": 1300})
    session.wait_for_event(lambda event: event.member == "onPolicyMsg", mark)
    session.wait_for_event(lambda event: event.member == "Notify", mark)
    assert "[bad]" not in session.check()


def test_restart_of_the_bus_brings_a_fresh_agent(session: Machine) -> None:
    agent = session.agent("alice")
    session.run("systemctl", "restart", "dbus.service")
    session.run("systemctl", "restart", "systemd-logind")
    session.wait_for_agent("alice", other_than=agent)


def test_agent_goes_with_the_session(session: Machine) -> None:
    session.end_sessions()
    wait_for("the agent's end", lambda: not session.agents())
