"""Any history of the dock reaches the daemon change by change, whatever the agent is busy with meanwhile."""

from __future__ import annotations

from typing import Literal

from hypothesis import HealthCheck, given, settings
from hypothesis.strategies import lists, sampled_from, tuples

from sandbox.fakes.dock import Announcement
from sandbox.fakes.fault import Fault
from sandbox.fakes.launcher import LauncherItem
from sandbox.platform.server import HttpFault
from sandbox.terminal import Terminal
from tests.e2e.dockmodel import Act, DockModel, acts
from tests.e2e.dockwatch import reported, settle, start

Pace = Literal["one by one", "at once", "during a notification", "during an inventory"]
PACES: tuple[Pace, ...] = ("one by one", "at once", "during a notification", "during an inventory")
WAYS: tuple[tuple[Announcement, ...], ...] = (("values",), ("signal",), ("values", "signal"))

# One terminal serves all histories; how long one takes depends on how busy the machine is.
any_history = settings(
    deadline=None,
    derandomize=True,
    database=None,
    suppress_health_check=[HealthCheck.function_scoped_fixture, HealthCheck.too_slow],
)


def block(terminal: Terminal, pace: Pace) -> None:
    """Keep the agent waiting until `unblock`, in the manner of a pace."""
    mark = terminal.events.mark()
    if pace == "during a notification":
        terminal.notifications.fault = Fault("hold")
        terminal.daemon.push_policy({"type": 1300})
        terminal.events.wait_for(target="notifications", member="Notify", after=mark)
    elif pace == "during an inventory":
        terminal.launcher.fault = Fault("hold")
        terminal.launcher.announce("other", LauncherItem("/none.desktop", "None"))
        terminal.events.wait_for(target="launcher", member="GetAllItemInfos", after=mark)


def unblock(terminal: Terminal) -> None:
    """Let the agent go on."""
    terminal.notifications.release()
    terminal.launcher.release()


def carry_out(terminal: Terminal, model: DockModel, pace: Pace, stretch: list[Act]) -> list[tuple[int, str]]:
    """Let a part of a history happen at a pace; return the events that must follow."""
    expected = []
    block(terminal, pace)
    for act in stretch:
        # While the agent reads a new entry, it is open which changes are news.
        if pace == "at once" and act.app in model.added:
            continue
        model.do(act)
        if pace == "one by one":
            settle(terminal)
            expected += model.end_stretch()
    unblock(terminal)
    settle(terminal)
    return expected + model.end_stretch()


def clear(terminal: Terminal) -> None:
    """Remove what an earlier history has left on the dock."""
    for app in terminal.dock.apps:
        terminal.dock.close_app(app)
    settle(terminal)


def test_any_history_is_reported_change_by_change(terminal: Terminal) -> None:
    start(terminal)

    @settings(any_history, max_examples=40)
    @given(sampled_from(WAYS), lists(tuples(sampled_from(PACES), lists(acts(), max_size=12)), max_size=5))
    def each_change_is_one_event(
        ways: tuple[Announcement, ...], history: list[tuple[Pace, list[Act]]]
    ) -> None:
        clear(terminal)
        terminal.dock.announces = ways
        model = DockModel(terminal.dock)
        mark = terminal.events.mark()
        expected = []
        for pace, stretch in history:
            expected += carry_out(terminal, model, pace, stretch)
        assert reported(terminal, mark) == expected

    each_change_is_one_event()


def test_any_history_during_a_slow_log_in_is_reported_change_by_change(terminal: Terminal) -> None:
    assert terminal.platform

    @settings(any_history, max_examples=20)
    @given(sampled_from(WAYS), lists(acts(), max_size=6), lists(acts(), max_size=12))
    def each_change_is_one_event(
        ways: tuple[Announcement, ...], before: list[Act], meanwhile: list[Act]
    ) -> None:
        terminal.agent.stop()
        for app in terminal.dock.apps:
            terminal.dock.close_app(app)
        terminal.dock.announces = ways
        model = DockModel(terminal.dock)
        for act in before:
            model.do(act)
        mark = terminal.events.mark()
        terminal.platform.faults["tips"] = HttpFault("hang")
        terminal.start_agent(ready=lambda: terminal.events.wait_for(kind="http", member="tips", after=mark))
        expected = model.start()
        for act in meanwhile:
            model.do(act)
        terminal.platform.release()
        settle(terminal)
        assert reported(terminal, mark) == expected + model.end_stretch()

    each_change_is_one_event()
