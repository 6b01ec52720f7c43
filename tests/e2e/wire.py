"""What the agent did, as those on the other side of a wire saw it."""

from __future__ import annotations

from dataclasses import dataclass
from typing import Any, Callable, Mapping
from uuid import uuid4

from sandbox.events import Event
from sandbox.fakes.fault import Fault
from sandbox.periods import STATE_REPORT
from sandbox.policies import POLICIES
from sandbox.terminal import Terminal

FORWARDED_CODE = 5
SHUTDOWN_NOTICE = POLICIES[1300].notice
# The agent's five-minute timer is coarse: half a second more or less.
FIVE_MINUTES = STATE_REPORT + 1


@dataclass(frozen=True)
class Notification:
    """The arguments of one notification call."""

    application: str
    replaces: int
    icon: str
    summary: str
    body: str
    actions: list[str]
    hints: dict[str, Any]
    timeout: int


def start_agent(terminal: Terminal) -> int:
    """Start the agent; the mark before it."""
    mark = terminal.events.mark()
    terminal.start_agent()
    return mark


def push(terminal: Terminal, policy: str | Mapping[str, Any], app_id: str = "box") -> int:
    """Let the daemon push a policy; the mark before it."""
    mark = terminal.events.mark()
    terminal.daemon.push_policy(policy, app_id)
    return mark


def push_online(terminal: Terminal) -> int:
    """Let the daemon announce itself; the mark before it."""
    mark = terminal.events.mark()
    terminal.daemon.push_online()
    return mark


def next_notification(terminal: Terminal, after: int, count: int = 1) -> Notification:
    """The `count`th notification since a mark; waits for it."""
    event = terminal.events.wait_for(target="notifications", member="Notify", after=after, count=count)
    assert event.detail["signature"] == "susssasa{sv}i"
    return Notification(*event.args)


def begin_countdown(terminal: Terminal, code: int = 1201) -> int:
    """Push a policy that ends the session in a minute and wait for its warning; the mark before it."""
    mark = push(terminal, {"type": code})
    next_notification(terminal, mark)
    terminal.sync()
    return mark


def wait_on_notification(terminal: Terminal, fault: Fault, code: int = 1300) -> int:
    """Let the agent wait for the reply to a notification of a policy; the mark before it."""
    terminal.notifications.fault = fault
    mark = push(terminal, {"type": code})
    terminal.events.wait_for(target="notifications", member="Notify", after=mark)
    return mark


def carries_out_policies(terminal: Terminal) -> None:
    """Assert that a policy reaches the user."""
    mark = terminal.events.mark()
    terminal.daemon.push_policy({"type": 1300})
    assert next_notification(terminal, mark).body == SHUTDOWN_NOTICE


def next_status(terminal: Terminal, after: int, count: int = 1) -> tuple[Any, ...]:
    """Arguments of the `count`th status report at the daemon since a mark; waits for it."""
    return terminal.events.wait_for(
        source="velks", target="daemon", member="SendUserStatus", after=after, count=count
    ).args


def forced_actions(terminal: Terminal, after: int) -> list[str]:
    """Which forced actions the login manager was asked for since a mark."""
    events = terminal.events.all(source="velks", target="logind", kind="call", after=after)
    return [event.member for event in events if event.member in ("Reboot", "Terminate")]


def comes_in_a_minute(terminal: Terminal, action: str, after: int) -> None:
    """Assert that a forced action comes after a minute, not before, and nothing else since a mark."""
    terminal.advance(59)
    assert forced_actions(terminal, after) == []
    terminal.advance(1)
    assert forced_actions(terminal, after) == [action]


def settled(terminal: Terminal, after: int) -> list[Event]:
    """All calls and commands of the agent since a mark, once it has handled all that it was sent.

    A last policy is forwarded to the session policy service: when it arrives there, nothing that the agent
    did before can still be on its way to a service of the session. That policy itself is left out. The log
    is complete up to there, too.
    """
    marker = str(uuid4())
    terminal.daemon.push_policy({"type": FORWARDED_CODE, "marker": marker})
    terminal.events.wait_for(
        lambda event: marker in event.args[0], target="policy_service", member="onPolicyMsg", after=after
    )
    terminal.sync()
    actions = [event for event in terminal.events.all(source="velks", after=after) if event.kind != "log"]
    return [event for event in actions if marker not in str(event.args)]


def asked_of_the_session_bus(terminal: Terminal, change: Callable[[], object]) -> list[tuple[str, ...]]:
    """What the agent asks the session bus itself, or services that are absent, while this happens."""
    terminal.receive_all()
    before = len(terminal.session_monitor.calls)
    change()
    terminal.receive_all()
    present = [fake.bus_name for fake in terminal.fakes.values() if fake.present]
    calls = terminal.session_monitor.calls[before:]
    return [(call.member, *call.args) for call in calls if call.destination not in present]


def warnings(terminal: Terminal, after: int) -> list[str]:
    """What the agent has warned of since a mark."""
    return [event.args[0] for event in terminal.events.all(kind="log", member="warning", after=after)]


def log_lines(terminal: Terminal, after: int) -> list[str]:
    """What the agent has logged since a mark, the texts alone."""
    return [event.args[0] for event in terminal.events.all(kind="log", after=after)]
