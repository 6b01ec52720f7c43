"""One agent for each user with a graphical session, however the desktop starts it; none for other users."""

from __future__ import annotations

import pytest

from tests.booted.machine import USERS, Machine
from tests.booted.patience import wait_for

pytestmark = pytest.mark.quick


@pytest.mark.parametrize("way", ["target", "autostart", "generator"])
def test_agent_comes_and_goes_with_the_session(machine: Machine, way: str) -> None:
    session = machine.log_in("alice", way)
    machine.wait_for_agent("alice")
    assert machine.agents() == [USERS["alice"]]
    machine.log_out(session)
    wait_for("the agent's end", lambda: not machine.agents())


@pytest.mark.parametrize("way", ["target", "autostart"])
def test_agent_goes_with_the_graphical_session_while_a_text_session_stays(machine: Machine, way: str) -> None:
    machine.log_in("alice", kind="tty", seat="")
    session = machine.log_in("alice", way)
    machine.wait_for_agent("alice")
    machine.log_out(session)
    wait_for("the agent's end", lambda: not machine.agents())
    assert len(machine.session_names("alice")) == 1


def test_second_autostarted_session_keeps_its_agent(machine: Machine) -> None:
    first = machine.log_in("alice", "autostart")
    machine.wait_for_agent("alice")
    second = machine.log_in("alice", "none", seat="")
    machine.run(
        *["systemctl", "--user", "start", f"velks-session@{second.name}.path", "velks.service"], user="alice"
    )
    agent = machine.agent("alice")
    machine.log_out(first)
    wait_for("the watch's end", lambda: first.name not in watched(machine))
    assert machine.agent("alice") == agent
    machine.log_out(second)
    wait_for("the agent's end", lambda: not machine.agents())


def watched(machine: Machine) -> str:
    """The sessions that alice's service manager watches."""
    return machine.said("systemctl", "--user", "list-units", "velks-session@*.path", "--plain", user="alice")


def test_all_ways_at_once_make_one_agent(machine: Machine) -> None:
    machine.log_in("alice", "generator")
    machine.run("/usr/libexec/velk-session-agent/autostart", user="alice")
    machine.run("systemctl", "--user", "start", "velks.service", user="alice")
    machine.wait_for_agent("alice")
    assert machine.agents() == [USERS["alice"]]


def test_each_of_several_users_has_one_and_is_named_as_the_login_manager_says(machine: Machine) -> None:
    mark = machine.mark()
    names = {"alice": "alice", "zhang@corp.example": "zhangcorp.example", "@li": "li", "root": "root"}
    for user in names:
        machine.log_in(user)
    wait_for("four agents", lambda: len(machine.agents()) == len(names))
    wait_for("four names", lambda: len(reported_names(machine, mark)) == len(names))
    assert reported_names(machine, mark) == {USERS[user]: [name, USERS[user]] for user, name in names.items()}


def reported_names(machine: Machine, mark: int) -> dict[int | None, list[object]]:
    """The users reported to the daemon, by the uid that the bus knows."""
    return {event.uid: event.args for event in machine.events()[mark:] if event.member == "UpdateUserInfo"}


@pytest.mark.parametrize("user", ["greeter", "made-up-greeter"])
@pytest.mark.parametrize("way", ["target", "autostart"])
def test_greeter_has_none(machine: Machine, user: str, way: str) -> None:
    before = machine.starts_skipped()
    machine.log_in(user, way, session_class="greeter")
    wait_for("a start that is skipped", lambda: machine.starts_skipped() > before)
    assert machine.agents() == []


def test_user_without_a_graphical_session_has_none(machine: Machine) -> None:
    machine.log_in("alice", kind="tty", seat="")
    machine.wait_for_manager("alice")
    assert machine.agents() == []


def test_lingering_user_has_none(lingering: Machine) -> None:
    assert lingering.agents() == []


def test_agent_does_not_run_where_an_administrator_has_disabled_it(machine: Machine) -> None:
    machine.run("systemctl", "--global", "disable", "velks.service")
    for way in ("target", "autostart"):
        session = machine.log_in("alice", way)
        machine.wait_for_manager("alice")
        assert machine.agents() == []
        machine.log_out(session)
    machine.run("systemctl", "--global", "enable", "velks.service")
