"""The exit from the domain with a restore script such as sites have: it can do what the session can."""

from __future__ import annotations

from typing import Iterator

import pytest

from tests.booted.conftest import DROP_IN
from tests.booted.machine import Machine
from tests.booted.patience import wait_for
from tests.booted.refusals import wait_for_refusal

SCRIPT = "/usr/share/velk/scripts/restore_config.bash"
GONE_SECONDS = 10.0  # what docs/service.md promises
# What a script may want of the system, as shell commands that succeed in a session.
PROBES = {
    "sudo": 'test "$(sudo -n id -u)" = 0',
    "setuid": 'test "$(passwd -S | wc -w)" -gt 2',
    "machine-code": "python3 -c 'import mmap; mmap.mmap(-1, 4096, prot=7)'",
    "namespaces": "unshare --user true",
    "bubblewrap": "bwrap --ro-bind / / true",
    "service-manager": "systemctl --user show-environment",
    "bus": "busctl --user list",
    "setgid-folder": "mkdir -p ~/probe && chmod g+s ~/probe",
    "readable-files": 'touch ~/made && test -n "$(find ~/made -perm -o=r)"',
    "personality": "setarch --addr-no-randomize true",
    "broken-pipe": 'yes | head -n 1; test "${PIPESTATUS[0]}" = 141',
    "open-files": 'test "$(ulimit -n)" -ge 1024',
}


@pytest.fixture
def exiting(machine: Machine, inhibited: None) -> Iterator[Machine]:
    """The machine with alice logged in, whose agent is ready, and a reboot that root does not permit."""
    machine.log_in("alice")
    machine.wait_for_agent("alice")
    yield machine
    machine.end_sessions()
    machine.run("rm", "-f", SCRIPT)


def leave_domain(machine: Machine, script: str) -> None:
    """Have the agent run this script at the exit from the domain."""
    machine.write(SCRIPT, f"#!/bin/bash\n{script}\n")
    machine.push_policy({"type": 1200})


def test_script_can_do_what_the_session_can(exiting: Machine) -> None:
    exiting.write("/etc/sudoers.d/booted", "alice ALL=(ALL) NOPASSWD: ALL\n")
    exiting.run("rm", "-rf", "/home/alice/said")
    lines = [f"({probe}) >>~/log 2>&1 && echo {name} >>~/said" for name, probe in PROBES.items()]
    leave_domain(exiting, "\n".join([*lines, "echo end >>~/said"]))
    wait_for("the script's end", lambda: "end" in said(exiting))
    assert said(exiting) == [*PROBES, "end"], exiting.said("cat", "/home/alice/log")


def test_exit_is_whole_under_the_example_of_a_drop_in(hasty: Machine, inhibited: None) -> None:
    example = "/usr/share/doc/velk-session-agent/examples/hardening.conf"
    hasty.run("cp", example, DROP_IN)
    hasty.run("rm", "-f", "/home/alice/said")
    hasty.log_in("alice")
    hasty.wait_for_agent("alice")
    mark = hasty.mark()
    hasty.write(SCRIPT, "grep NoNewPrivs /proc/self/status >~/said")
    wait_for_refusal(hasty)
    told = [event.member for event in hasty.events()[mark:] if event.member in {"onDomainConfig", "Set"}]
    assert (said(hasty), told) == (["NoNewPrivs:\t1"], ["onDomainConfig", "Set"])
    hasty.run("rm", SCRIPT)


def said(machine: Machine) -> list[str]:
    """What the script has written so far."""
    return machine.said("cat", "/home/alice/said").splitlines()


def test_what_the_script_leaves_running_survives_the_agent(exiting: Machine) -> None:
    mark = exiting.mark()
    leave_domain(exiting, "sleep 4711 & echo begun")
    exiting.wait_for_event(lambda event: event.member == "onDomainConfig", mark)
    exiting.run("systemctl", "--user", "restart", "velks", user="alice")
    exiting.run("systemctl", "--user", "stop", "velks", user="alice")
    assert exiting.said("pgrep", "--full", "sleep 4711") != ""


STUBBORN = "trap '' TERM HUP INT; touch ~/runs; sleep 4712 & while :; do wait; sleep 1; done"


def start_stubborn_script(machine: Machine) -> None:
    """Let the agent wait for a script that no polite signal ends."""
    machine.run("rm", "-f", "/home/alice/runs")
    leave_domain(machine, STUBBORN)
    wait_for("the script", lambda: machine.said("ls", "/home/alice/runs"))


def test_script_that_hangs_delays_neither_the_log_out_nor_the_next_agent(exiting: Machine) -> None:
    start_stubborn_script(exiting)
    before = exiting.uptime()
    exiting.end_sessions()
    assert exiting.uptime() - before < GONE_SECONDS
    assert exiting.said("pgrep", "--full", "sleep 4712") == ""
    exiting.log_in("alice")
    exiting.wait_for_agent("alice")


def test_script_that_hangs_does_not_keep_an_agent_from_being_started_anew(exiting: Machine) -> None:
    start_stubborn_script(exiting)
    agent = exiting.agent("alice")
    exiting.run("systemctl", "--user", "restart", "velks", user="alice")
    exiting.wait_for_agent("alice", other_than=agent)
    mark = exiting.mark()
    exiting.push_policy({"type": 1300})
    exiting.wait_for_event(lambda event: event.member == "Notify", mark)


def test_script_that_hangs_does_not_delay_the_end_of_the_machine(exiting: Machine) -> None:
    start_stubborn_script(exiting)
    exiting.run("systemctl", "stop", "inhibitor")
    before = exiting.uptime()
    exiting.run("systemctl", "reboot")
    exiting.wait_for_reboot()
    assert exiting.uptime() - before < 2 * GONE_SECONDS  # the next boot included
