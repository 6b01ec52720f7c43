"""Sessions and machines that end while the agent waits for an answer: nobody waits with it."""

from __future__ import annotations

from typing import Callable, Iterator

import pytest

from tests.booted.conftest import DROP_IN
from tests.booted.machine import Machine
from tests.booted.patience import wait_for
from tests.booted.platform import Platform

Begin = Callable[[], None]

ENDS = "/var/tmp/ends-of-agents"
# What the service manager says of each end. The bus ends after the agent, which would end with its bus.
_TELL_END = f"""[Unit]
After=dbus.service
[Service]
ExecStopPost=/bin/sh -c 'echo $$SERVICE_RESULT $$EXIT_STATUS >>{ENDS}'
"""
_DEAF = """[Service]
ExecStart=
ExecStart=/bin/sh -c 'trap "" TERM; exec /usr/bin/velks'
"""
BY_ITSELF = ["success TERM"]
KILLED = ["timeout KILL"]  # after the unit's TimeoutStopSec


@pytest.fixture(autouse=True)
def told_ends(machine: Machine) -> Iterator[None]:
    """Each agent's end is written down, where it outlives the machine's run."""
    machine.write(f"{DROP_IN}/tell-end.conf", _TELL_END)
    yield
    machine.end_sessions()
    machine.run("rm", "-rf", DROP_IN, ENDS)


def ends(machine: Machine) -> list[str]:
    """How the agents have ended: the service manager's result, and the agent's signal."""
    return machine.said("cat", ENDS).splitlines()


def wait_in_dbus(machine: Machine) -> None:
    """Have an agent wait for the answer of the notifications."""
    machine.log_in("alice")
    machine.wait_for_agent("alice")
    mark = machine.mark()
    machine.command_desktop("alice", "Mute", "Notify")
    machine.push_policy({"type": 1300})
    machine.wait_for_event(lambda event: event.member == "Notify", mark)


def wait_in_https(platform: Platform, machine: Machine) -> None:
    """Have an agent wait for the platform's answer."""
    platform.start()
    platform.freeze()
    machine.log_in("zhang@corp.example")
    wait_for("a connection", platform.connections)


@pytest.fixture(params=["D-Bus", "HTTPS"])
def begin_to_wait(request: pytest.FixtureRequest, machine: Machine, platform: Platform) -> Begin:
    """Logs somebody in whose agent then waits."""
    return lambda: wait_in_dbus(machine) if request.param == "D-Bus" else wait_in_https(platform, machine)


def test_log_out_does_not_wait_with_the_agent(machine: Machine, begin_to_wait: Begin) -> None:
    begin_to_wait()
    machine.end_sessions()
    assert (ends(machine), machine.agents()) == (BY_ITSELF, [])


def test_power_off_does_not_wait_with_the_agent(machine: Machine, begin_to_wait: Begin) -> None:
    begin_to_wait()
    machine.run("systemctl", "poweroff")
    machine.wait_for_power_off()
    assert ends(machine) == BY_ITSELF


def test_agent_that_does_not_end_by_itself_is_killed(machine: Machine) -> None:
    machine.write(f"{DROP_IN}/deaf.conf", _DEAF)
    machine.log_in("alice")
    machine.wait_for_agent("alice")
    machine.end_sessions()
    assert (ends(machine), machine.agents()) == (KILLED, [])
