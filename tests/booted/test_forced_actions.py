"""Forced log-outs and reboots as the login manager carries them out, or refuses them."""

from __future__ import annotations

import pytest

from tests.booted.machine import USERS, Machine
from tests.booted.patience import wait_for
from tests.booted.refusals import wait_for_refusal


def warned(machine: Machine, user: str, mark: int) -> None:
    """Wait for the warning that a countdown begins with."""
    machine.wait_for_event(lambda event: event.member == "Notify" and event.uid == USERS[user], mark)


def test_log_out_comes_a_minute_after_the_policy_and_ends_the_graphical_session_alone(
    machine: Machine,
) -> None:
    machine.log_in("zhang@corp.example", kind="tty", seat="")
    session = machine.log_in("zhang@corp.example")
    machine.log_in("alice")
    for user in ("zhang@corp.example", "alice"):
        machine.wait_for_agent(user)
    mark = machine.mark()
    before = machine.uptime()
    machine.push_policy({"type": 1202, "payload": {"uid": USERS["zhang@corp.example"]}})
    wait_for("the log-out", lambda: session.name not in machine.session_names())
    assert machine.uptime() - before >= 60
    warned(machine, "zhang@corp.example", mark)
    assert len(machine.session_names("zhang@corp.example")) == 1
    wait_for("the end of the agent", lambda: machine.agents() == [USERS["alice"]])


@pytest.mark.quick
def test_policy_for_all_logs_each_user_out(hasty: Machine) -> None:
    hasty.log_in("alice")
    hasty.log_in("@li", "autostart")
    for user in ("alice", "@li"):
        hasty.wait_for_agent(user)
    hasty.push_policy({"type": 1201})
    wait_for("both log-outs", lambda: not hasty.session_names())


@pytest.mark.quick
def test_log_out_during_the_countdown_ends_it(hasty: Machine) -> None:
    session = hasty.log_in("alice")
    hasty.wait_for_agent("alice")
    mark = hasty.mark()
    hasty.push_policy({"type": 1201})
    warned(hasty, "alice", mark)
    hasty.log_out(session)
    mark = hasty.mark()
    again = hasty.log_in("alice")
    hasty.wait_for_event(lambda event: event.member == "SendUserStatus", mark)
    assert hasty.unit("StatusText") == ""
    assert again.name in hasty.session_names()


@pytest.mark.quick
def test_reboot_is_real(hasty: Machine) -> None:
    hasty.log_in("alice")
    hasty.wait_for_agent("alice")
    hasty.push_policy({"type": 1200})
    hasty.wait_for_reboot()
    assert hasty.session_names() == []


@pytest.mark.usefixtures("inhibited")
def test_reboot_is_refused_while_a_program_inhibits_it_and_all_else_of_the_exit_is_done(
    hasty: Machine,
) -> None:
    hasty.log_in("alice")
    hasty.wait_for_agent("alice")
    mark = hasty.mark()
    wait_for_refusal(hasty)
    done = [event.member for event in hasty.events()[mark:] if event.member in {"onDomainConfig", "Set"}]
    assert done == ["onDomainConfig", "Set"]
    assert hasty.unit("StatusText") == ""


def test_reboot_is_refused_with_a_greeter_in_front(hasty: Machine) -> None:
    session = hasty.log_in("alice")
    hasty.wait_for_agent("alice")
    hasty.log_in("greeter", "none", session_class="greeter")
    assert hasty.said("loginctl", "show-session", session.name, "--property=Active", "--value") == "no"
    assert "Interactive authentication required" in wait_for_refusal(hasty)


@pytest.mark.usefixtures("no_policy_kit")
def test_reboot_is_refused_without_the_policy_kit(hasty: Machine) -> None:
    hasty.log_in("alice")
    hasty.wait_for_agent("alice")
    assert "ermission denied" in wait_for_refusal(hasty)


def test_reboot_is_refused_to_a_session_without_a_seat_unless_a_rule_allows_it(hasty: Machine) -> None:
    hasty.log_in("alice", seat="")
    hasty.wait_for_agent("alice")
    wait_for_refusal(hasty)
    hasty.run("groupadd", "managed-desktop")
    hasty.run("usermod", "--append", "--groups", "managed-desktop", "alice")
    hasty.run("cp", "/usr/share/doc/velk-session-agent/examples/60-velks.rules", "/etc/polkit-1/rules.d/")
    hasty.run("systemctl", "restart", "polkit")
    hasty.end_sessions()  # the policy kit of Debian 13 knows the groups that the agent was started with
    hasty.log_in("alice", seat="")
    hasty.wait_for_agent("alice")
    hasty.push_policy({"type": 1200})
    hasty.wait_for_reboot()
    hasty.run("rm", "/etc/polkit-1/rules.d/60-velks.rules")
