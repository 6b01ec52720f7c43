"""The steps of a terminal that leaves the domain, as seen from outside."""

from __future__ import annotations

import configparser
from pathlib import Path

from sandbox.terminal import Terminal
from tests.e2e.wire import push, settled

EXIT = {"type": 1200}
ON_SYSTEM_BUS = ("daemon", "identity", "logind")
EXIT_STEPS = [
    ("notifications", "Notify"),
    ("restore_config", "restore_config"),
    ("systemctl", "systemctl"),
    ("daemon", "onDomainConfig"),
    ("identity", "Set"),
]


def leave_domain(session: Terminal) -> int:
    """Push the policy, wait for the sequence's last step; the result is the mark before it."""
    mark = push(session, EXIT)
    session.events.wait_for(target="identity", member="Set", after=mark)
    return mark


def steps_seen(session: Terminal, mark: int) -> list[tuple[str, str]]:
    """The steps of the exit that were seen from outside, in their order.

    The agent waits for each step but the calls on the system bus, which come last; their serial numbers
    show in which order they were sent to different receivers.
    """
    steps = settled(session, mark)
    sent = sorted(
        (step for step in steps if step.target in ON_SYSTEM_BUS), key=lambda step: step.detail["serial"]
    )
    waited_for = [step for step in steps if step not in sent]
    return [(step.target, step.member) for step in waited_for + sent]


def restrictions() -> dict[str, str]:
    """The user's restriction switches in the file."""
    file = configparser.RawConfigParser()
    file.optionxform = str  # type: ignore[assignment]
    file.read(Path.home() / ".config" / "norix" / "desktop-control.ini")
    return dict(file["restrictions"])
