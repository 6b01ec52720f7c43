"""Forced log-outs and reboots as the login manager carries them out, or refuses them."""

from __future__ import annotations

from typing import Iterator

import pytest

from tests.booted.machine import USERS, Machine
from tests.booted.patience import wait_for

FASTER = 20
FAST_CLOCK = f"""[Service]
Environment=LD_PRELOAD=%s
Environment="FAKETIME=+0 x{FASTER}"
"""
DROP_IN = "/run/systemd/user/velks.service.d"


@pytest.fixture
def hasty(machine: Machine) -> Iterator[Machine]:
    """A machine whose agents live twenty times as fast, so that a countdown takes three seconds."""
    library = machine.said("sh", "-c", "echo /usr/lib/*/faketime/libfaketime.so.1")
    machine.write(f"{DROP_IN}/clock.conf", FAST_CLOCK % library)
    yield machine
    machine.end_sessions()
    machine.run("rm", "-rf", DROP_IN)


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
    wait_for("the log-out", lambda: session.name not in machine.session_names(), seconds=90)
    assert machine.uptime() - before >= 60
    warned(machine, "zhang@corp.example", mark)
    assert len(machine.session_names("zhang@corp.example")) == 1
    wait_for("the end of the agent", lambda: machine.agents() == [USERS["alice"]])


def test_policy_for_all_logs_each_user_out(hasty: Machine) -> None:
    hasty.log_in("alice")
    hasty.log_in("@li", "autostart")
    for user in ("alice", "@li"):
        hasty.wait_for_agent(user)
    hasty.push_policy({"type": 1201})
    wait_for("both log-outs", lambda: not hasty.session_names())


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
    assert pending(hasty, "alice") == ""
    assert again.name in hasty.session_names()


def pending(machine: Machine, user: str) -> str:
    """What the service manager shows of a countdown."""
    return machine.said("systemctl", "--user", "show", "velks", "--property=StatusText", "--value", user=user)


def test_reboot_is_real(hasty: Machine) -> None:
    hasty.log_in("alice")
    hasty.wait_for_agent("alice")
    hasty.push_policy({"type": 1200})
    hasty.wait_for_reboot()
    assert hasty.session_names() == []


def refusals(machine: Machine) -> list[str]:
    """The agents' lines of reboots that the login manager refused."""
    lines = machine.said("journalctl", "--boot", "--output=cat", "--grep=cannot call Reboot").splitlines()
    return [line for line in lines if line.startswith("cannot call Reboot")]


def test_reboot_is_refused_while_a_program_inhibits_it_and_all_else_of_the_exit_is_done(
    hasty: Machine,
) -> None:
    inhibitor = ["systemd-inhibit", "--what=shutdown", "--mode=block", "sleep", "infinity"]
    hasty.run("systemd-run", "--quiet", "--unit=inhibitor", *inhibitor)
    hasty.log_in("alice")
    hasty.wait_for_agent("alice")
    mark = hasty.mark()
    hasty.push_policy({"type": 1200})
    wait_for("the refusal", lambda: refusals(hasty))
    done = [event.member for event in hasty.events()[mark:] if event.member in {"onDomainConfig", "Set"}]
    assert done == ["onDomainConfig", "Set"]
    assert pending(hasty, "alice") == ""
    hasty.run("systemctl", "stop", "inhibitor")


def test_reboot_is_refused_to_a_session_without_a_seat_unless_a_rule_allows_it(hasty: Machine) -> None:
    hasty.log_in("alice", seat="")
    hasty.wait_for_agent("alice")
    before = len(refusals(hasty))
    hasty.push_policy({"type": 1200})
    wait_for("the refusal", lambda: len(refusals(hasty)) > before)
    hasty.run("groupadd", "managed-desktop")
    hasty.run("usermod", "--append", "--groups", "managed-desktop", "alice")
    hasty.run("cp", "/usr/share/doc/velk-session-agent/examples/60-velks.rules", "/etc/polkit-1/rules.d/")
    hasty.run("systemctl", "restart", "polkit")
    hasty.push_policy({"type": 1200})
    hasty.wait_for_reboot()
    hasty.run("rm", "/etc/polkit-1/rules.d/60-velks.rules")
