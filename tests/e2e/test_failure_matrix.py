"""Whatever happens to one service: policies and reports go on, and no call is waited for past its limit."""

from __future__ import annotations

from typing import Callable

import pytest

from sandbox.events import Event
from sandbox.fakes.base import Fake
from sandbox.fakes.exported import Reply
from sandbox.fakes.fault import Fault
from sandbox.fakes.launcher import LauncherItem
from sandbox.periods import DBUS_LIMIT, SURELY_NEXT_POLL, TRANSFER_LIMIT
from sandbox.platform.server import HttpFault
from sandbox.terminal import FAKES, Terminal
from tests.e2e.wire import FIVE_MINUTES, SHUTDOWN_NOTICE, next_notification, next_status, push, push_online

NONSENSE = Reply("(isa{sv})", ((1, "x", {}),))


def busy_desktop(terminal: Terminal) -> None:
    """Let every service have something to be asked for."""
    terminal.dock.open_app("mail", "Mail")
    terminal.launcher.items = [LauncherItem("/usr/share/applications/none.desktop", "None")]


def changes_come(terminal: Terminal) -> None:
    """The dock and the launcher announce changes, if they are there."""
    if terminal.dock.present:
        terminal.dock.open_app("editor", "Editor")
    terminal.launcher.announce("created", terminal.launcher.items[0])


def lie(fake: Fake) -> None:
    """Answer every call with values of another type than the contract's."""
    methods = [method.name for known in fake.objects.values() for method in known.contract.methods]
    fake.answers = {name: NONSENSE for name in [*methods, "Get", "Set"]}


def let_limits_pass(terminal: Terminal, limit: int, kind: str, name: str) -> None:
    """With each request that comes to a service, the time that the agent waits for its answer passes."""

    def on_event(event: Event) -> None:
        if (event.source, event.kind, event.target) == ("velks", kind, name):
            terminal.jump(limit)

    terminal.events.subscribe(on_event)


def hang(terminal: Terminal, fake: Fake) -> None:
    """Take every call from now on and answer none."""
    fake.fault = Fault("hang")
    let_limits_pass(terminal, DBUS_LIMIT, "call", fake.name)


def policies_go_on(terminal: Terminal, faulty: str) -> None:
    """A notice is shown and a policy forwarded, unless it is their service that is faulty."""
    mark = push(terminal, {"type": 1300})
    terminal.daemon.push_policy({"type": 5})
    if faulty != "notifications":
        assert next_notification(terminal, mark).body == SHUTDOWN_NOTICE
    if faulty != "policy_service":
        terminal.events.wait_for(target="policy_service", member="onPolicyMsg", after=mark)
    terminal.sync()


def reports_go_on(terminal: Terminal) -> None:
    """The agent reports the user when the daemon asks, and the state after five minutes."""
    mark = push_online(terminal)
    next_status(terminal, mark)
    terminal.sync()
    mark = terminal.events.mark()
    terminal.advance(FIVE_MINUTES)
    next_status(terminal, mark)


def all_goes_on(terminal: Terminal, faulty: str = "") -> None:
    """Nothing but what the faulty service itself does is missing."""
    changes_come(terminal)
    policies_go_on(terminal, faulty)
    reports_go_on(terminal)


def absent(terminal: Terminal, fake: Fake) -> None:
    """Not there at the start, and never after."""
    fake.leave()
    terminal.start_agent()
    all_goes_on(terminal, fake.name)


def late(terminal: Terminal, fake: Fake) -> None:
    """Not there at the start, but later, from when on it is served."""
    fake.leave()
    terminal.start_agent()
    fake.appear()
    all_goes_on(terminal)


def restarting(terminal: Terminal, fake: Fake) -> None:
    """Another process takes its place, which is served as well."""
    terminal.start_agent()
    fake.restart()
    all_goes_on(terminal)


def gone(terminal: Terminal, fake: Fake) -> None:
    """There at the start and then no more."""
    terminal.start_agent()
    fake.leave()
    all_goes_on(terminal, fake.name)


def hung_at_the_start(terminal: Terminal, fake: Fake) -> None:
    """Takes every call from the start on and answers none."""
    hang(terminal, fake)
    terminal.start_agent()
    all_goes_on(terminal)


def hung_later(terminal: Terminal, fake: Fake) -> None:
    """Takes every call and, from some time on, answers none."""
    terminal.start_agent()
    hang(terminal, fake)
    all_goes_on(terminal)


def lying(terminal: Terminal, fake: Fake) -> None:
    """Answers with values of another type."""
    lie(fake)
    terminal.start_agent()
    all_goes_on(terminal)


@pytest.mark.parametrize("state", [absent, late, restarting, gone, hung_at_the_start, hung_later, lying])
@pytest.mark.parametrize("name", sorted(FAKES.keys() - {"daemon"}))
def test_policies_and_reports_go_on_while_a_service_is(
    terminal: Terminal, name: str, state: Callable[[Terminal, Fake], None]
) -> None:
    busy_desktop(terminal)
    state(terminal, terminal.fakes[name])
    assert terminal.agent.alive


@pytest.mark.parametrize("state", [late, restarting, hung_at_the_start, hung_later, lying])
def test_policies_and_reports_go_on_while_the_daemon_is(
    terminal: Terminal, state: Callable[[Terminal, Fake], None]
) -> None:
    busy_desktop(terminal)
    state(terminal, terminal.daemon)
    assert terminal.agent.alive


def test_applications_and_software_are_watched_without_a_daemon(terminal: Terminal) -> None:
    """And reported to the one that comes."""
    busy_desktop(terminal)
    terminal.daemon.leave()
    terminal.start_agent()
    changes_come(terminal)
    terminal.events.wait_for(lambda event: "onItemChanged" in event.args[0], kind="log")
    terminal.daemon.appear()
    terminal.dock.close_app("mail")
    closed = terminal.events.wait_for(target="daemon", member="sendAppOpenState")
    assert closed.args == (2, "Mail")
    all_goes_on(terminal)


def platform_hangs(terminal: Terminal) -> None:
    """The platform takes every request from now on and answers none."""
    terminal.platform.fault = HttpFault("hang")
    let_limits_pass(terminal, TRANSFER_LIMIT, "http", "platform")


def platform_lies(terminal: Terminal) -> None:
    """The platform answers every request with what is no list."""
    terminal.platform.fault = HttpFault("reply", 200, b'\xff{"data": [', {"X-Total-Count": "many"})


def platform_leaves(terminal: Terminal) -> None:
    """The platform accepts no connection any more."""
    terminal.platform.leave()


def platform_appears(terminal: Terminal) -> None:
    """The platform accepts connections again."""
    terminal.platform.appear()


def platform_restarts(terminal: Terminal) -> None:
    """The platform loses every connection and accepts new ones."""
    terminal.platform.leave()
    terminal.platform.appear()


def platform_is_well(terminal: Terminal) -> None:
    """The platform does what it should."""
    assert terminal.platform


@pytest.mark.parametrize(
    ("before", "after", "serves"),
    [
        pytest.param(platform_leaves, platform_leaves, False, id="absent"),
        pytest.param(platform_leaves, platform_appears, True, id="late"),
        pytest.param(platform_is_well, platform_restarts, True, id="restarting"),
        pytest.param(platform_is_well, platform_leaves, False, id="gone"),
        pytest.param(platform_hangs, platform_is_well, False, id="hung_at_the_start"),
        pytest.param(platform_is_well, platform_hangs, False, id="hung_later"),
        pytest.param(platform_lies, platform_is_well, False, id="lying"),
    ],
)
def test_policies_and_reports_go_on_while_the_platform_is(
    terminal: Terminal, before: Callable[[Terminal], None], after: Callable[[Terminal], None], serves: bool
) -> None:
    busy_desktop(terminal)
    before(terminal)
    terminal.start_agent()
    after(terminal)
    terminal.platform.post_message(terminal.user.plain_name, "message", "text")
    mark = terminal.events.mark()
    terminal.advance(SURELY_NEXT_POLL)
    shown = terminal.events.all(lambda event: event.args[3] == "message", member="Notify", after=mark)
    assert len(shown) == serves
    all_goes_on(terminal, "platform")
    assert terminal.agent.alive
