"""Reboots at the exit from the domain that the login manager refuses."""

from __future__ import annotations

from tests.booted.machine import Machine
from tests.booted.patience import wait_for


def refusals(machine: Machine) -> list[str]:
    """The agents' lines of reboots that the login manager refused."""
    lines = machine.said("journalctl", "--boot", "--output=cat", "--grep=cannot call Reboot").splitlines()
    return [line for line in lines if line.startswith("cannot call Reboot")]


def wait_for_refusal(machine: Machine) -> str:
    """Push the exit from the domain and return what the login manager says to the reboot."""
    before = len(refusals(machine))
    machine.push_policy({"type": 1200})
    return wait_for("the refusal", lambda: refusals(machine)[before:])[0]
