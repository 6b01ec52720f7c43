"""What velks-check says on a machine that boots, where the bus, the login manager and systemd are real."""

from __future__ import annotations

from typing import Iterator

import pytest

from tests.booted.conftest import DROP_IN
from tests.booted.machine import DAEMON, Machine
from tests.booted.patience import wait_for

pytestmark = pytest.mark.quick

POLICY = "/usr/share/dbus-1/system.d/com.norix.velk.conf"


def test_session_that_lacks_nothing_is_good(session: Machine) -> None:
    assert "[bad]" not in session.check()
    assert "[good]    reboot: is permitted to this user now" in session.check()


@pytest.fixture
def deaf_bus(session: Machine) -> Iterator[Machine]:
    """The daemon's policy permits its name, and no calls."""
    own = "/usr/share/dbus-1/system.d/booted-own.conf"
    session.run("mv", POLICY, f"{POLICY}.away")
    session.write(own, OWN_ONLY)
    session.reload_bus()
    yield session
    session.run("mv", f"{POLICY}.away", POLICY)
    session.run("rm", own)
    session.reload_bus()


OWN_ONLY = """<busconfig><policy user="root">
<allow own="com.norix.velk.velkg"/><allow own="com.norix.velk.iam"/>
</policy></busconfig>
"""


def test_bus_that_denies_every_call_is_bad(deaf_bus: Machine) -> None:
    assert "[bad]     service: com.norix.velk.velkg may not be called by this user" in deaf_bus.check()


@pytest.fixture
def daemon_state(machine: Machine) -> Iterator[Machine]:
    """The machine, whose daemon works again once the test is over."""
    yield machine
    machine.run("systemctl", "kill", "--signal=CONT", "booted-daemon", check=False)
    machine.run("systemctl", "restart", "booted-daemon")
    wait_for("the daemon", lambda: machine.has_service(DAEMON[0]))


@pytest.mark.parametrize(
    ("command", "text"),
    [
        (["kill", "--signal=STOP"], "does not answer"),
        (["stop"], "is not there"),
    ],
)
def test_daemon_that_hangs_or_is_gone_is_bad(
    session: Machine, daemon_state: Machine, command: list[str], text: str
) -> None:
    daemon_state.run("systemctl", *command, "booted-daemon")
    assert f"[bad]     service: com.norix.velk.velkg {text}" in session.check()


def test_session_in_the_background_is_told(session: Machine) -> None:
    assert "[good]    session: is graphical (wayland)\n" in session.check()
    session.log_in("bob")
    assert "[good]    session: is graphical (wayland), in the background\n" in session.check()


def test_agent_without_a_graphical_session_is_bad(machine: Machine) -> None:
    machine.log_in("alice", kind="tty", seat="")
    start = ["systemctl", "--user", "start", "velks"]
    wait_for("alice's manager", lambda: machine.run(*start, user="alice", check=False).returncode == 0)
    machine.wait_for_agent("alice")
    assert_agent_lacks_a_graphical_session(machine)


def test_agent_without_any_session_is_bad(lingering: Machine) -> None:
    lingering.run("systemctl", "--user", "start", "velks", user="alice")
    lingering.wait_for_agent("alice")
    assert_agent_lacks_a_graphical_session(lingering)


def assert_agent_lacks_a_graphical_session(machine: Machine) -> None:
    """velks-check tells an agent that runs from a session that a user sees."""
    said = machine.check()
    assert "[good]    agent: runs" in said
    assert "[bad]     session: this user has no graphical one" in said


def test_agent_that_is_frozen_is_bad(session: Machine) -> None:
    session.run("systemctl", "--user", "kill", "--signal=STOP", "velks", user="alice")
    assert "[bad]     agent: is stopped by a signal" in session.check()


def test_second_agent_is_bad(session: Machine) -> None:
    session.run("systemd-run", "--user", "--quiet", "--collect", "velks", user="alice")
    wait_for("two agents", lambda: len(session.agents()) == 2)
    assert "[bad]     agent: runs 2 times; there must be one" in session.check()


def test_reboot_that_would_be_refused_for_want_of_a_seat_is_a_warning(machine: Machine) -> None:
    machine.log_in("alice", seat="")
    assert "[warning] reboot: would be refused now (challenge)" in machine.check()


def test_reboot_that_would_be_refused_behind_a_greeter_is_a_warning(machine: Machine) -> None:
    machine.log_in("alice")
    machine.log_in("greeter", "none", session_class="greeter")
    assert "[warning] reboot: would be refused now (challenge)" in machine.check()


@pytest.mark.usefixtures("inhibited")
def test_reboot_that_would_be_refused_by_an_inhibitor_is_a_warning(session: Machine) -> None:
    assert "[warning] reboot: would be refused now (" in session.check()


@pytest.mark.usefixtures("no_policy_kit")
def test_reboot_that_would_be_refused_without_the_policy_kit_is_a_warning(session: Machine) -> None:
    assert "[warning] reboot: would be refused now (" in session.check()


@pytest.mark.parametrize(
    ("path", "line"),
    [
        ("/usr/share/velk/scripts/restore_config.bash", "[warning] restore: {} cannot be read"),
        ("/etc/velk/config.ini", "[warning] restore: {} cannot be read"),
        ("/usr/share/velk/machine.txt", "[bad]     machine identifier: {} cannot be read"),
    ],
)
def test_file_that_is_missing_is_named(session: Machine, path: str, line: str) -> None:
    before = session.said("cat", path)
    session.write(path, "x")
    assert line.format(path) not in session.check()
    session.run("rm", path)
    told = session.check()
    if before:
        session.write(path, before)
    assert line.format(path) in told


@pytest.fixture
def unmasked_again(machine: Machine) -> Iterator[None]:
    """The unit is masked no more once the test is over."""
    yield
    machine.run("systemctl", "--global", "unmask", "velks.service")
    machine.run("systemctl", "--global", "enable", "velks.service")


@pytest.mark.usefixtures("unmasked_again")
def test_unit_that_is_masked_or_was_stopped_is_named(session: Machine) -> None:
    session.run("systemctl", "--user", "stop", "velks", user="alice")
    assert "velks.service is inactive; start it with systemctl --user start velks" in session.check()
    session.run("systemctl", "--global", "mask", "velks.service")
    session.run("systemctl", "--user", "daemon-reload", user="alice")
    assert "velks.service is masked: an administrator or the user has disabled the agent" in session.check()


def test_unit_that_waits_to_be_started_again_is_named(machine: Machine) -> None:
    machine.write(f"{DROP_IN}/slow.conf", "[Service]\nRestartSec=1h\n")
    machine.log_in("alice")
    machine.run("kill", "-KILL", str(machine.wait_for_agent("alice")))
    wait_for("its end", lambda: not machine.agents())
    told = machine.check()
    machine.run("rm", "-r", DROP_IN)
    assert "velks.service is about to start again after a failure" in told


@pytest.mark.parametrize("greeter", ["greeter", "made-up-greeter"])
def test_unit_of_a_greeter_is_told_as_such(machine: Machine, greeter: str) -> None:
    before = machine.starts_skipped()
    machine.log_in(greeter, session_class="greeter")
    wait_for("a start that is skipped", lambda: machine.starts_skipped() > before)
    assert "velks.service is not meant to run for this user" in machine.check(greeter)


def test_program_that_is_not_told_of_the_session_says_what_to_set(session: Machine) -> None:
    as_alice = ["setpriv", "--reuid=1000", "--regid=1000", "--clear-groups"]
    told = session.said("env", "--ignore-environment", *as_alice, "/usr/bin/velks-check")
    assert "under su or sudo set XDG_RUNTIME_DIR=/run/user/UID" in told
    helped = session.said("env", "-i", "XDG_RUNTIME_DIR=/run/user/1000", *as_alice, "/usr/bin/velks-check")
    assert "[good]    unit: velks.service is active" in helped
