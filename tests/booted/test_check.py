"""What velks-check says on a machine that boots, where the bus, the login manager and systemd are real."""

from __future__ import annotations

from typing import Iterator

import pytest

from tests.booted.machine import Machine

POLICY = "/usr/share/dbus-1/system.d/com.norix.velk.conf"


@pytest.fixture
def session(machine: Machine) -> Iterator[Machine]:
    """The machine with alice's agent at work."""
    machine.log_in("alice")
    machine.wait_for_agent("alice")
    yield machine


def check(machine: Machine) -> str:
    """What alice is told by a program of her service manager: the policy kit knows no others' session."""
    asked = ["systemd-run", "--user", "--quiet", "--pipe", "--wait", "--collect", "velks-check"]
    return machine.said(*asked, user="alice")


def reload_bus(machine: Machine) -> None:
    """Have the system bus read its policies anew."""
    machine.run("busctl", "call", "org.freedesktop.DBus", "/", "org.freedesktop.DBus", "ReloadConfig")


def test_session_that_lacks_nothing_is_good(session: Machine) -> None:
    assert "[bad]" not in check(session)
    assert "[good]    reboot: is permitted to this user now" in check(session)


def test_bus_that_denies_every_call_is_bad(session: Machine) -> None:
    session.run("mv", POLICY, f"{POLICY}.away")
    session.write("/usr/share/dbus-1/system.d/booted-own.conf", OWN_ONLY)
    reload_bus(session)
    told = check(session)
    session.run("mv", f"{POLICY}.away", POLICY)
    session.run("rm", "/usr/share/dbus-1/system.d/booted-own.conf")
    reload_bus(session)
    assert "[bad]     service: com.norix.velk.velkg may not be called by this user" in told


OWN_ONLY = """<busconfig><policy user="root">
<allow own="com.norix.velk.velkg"/><allow own="com.norix.velk.iam"/>
</policy></busconfig>
"""


def test_daemon_that_hangs_is_bad(session: Machine) -> None:
    session.run("systemctl", "kill", "--signal=STOP", "booted-daemon")
    told = check(session)
    session.run("systemctl", "kill", "--signal=CONT", "booted-daemon")
    assert "[bad]     service: com.norix.velk.velkg does not answer" in told


def test_reboot_that_would_be_refused_is_a_warning(machine: Machine) -> None:
    machine.log_in("alice", seat="")
    machine.wait_for_agent("alice")
    assert "[warning] reboot: would be refused now (challenge)" in check(machine)


def test_unit_that_is_masked_or_was_stopped_is_named(session: Machine) -> None:
    session.run("systemctl", "--user", "stop", "velks", user="alice")
    assert "velks.service is inactive; start it with systemctl --user start velks" in check(session)
    session.run("systemctl", "--global", "mask", "velks.service")
    session.run("systemctl", "--user", "daemon-reload", user="alice")
    assert "velks.service is masked: somebody wants no agent here" in check(session)
    session.run("systemctl", "--global", "unmask", "velks.service")
    session.run("systemctl", "--global", "enable", "velks.service")
