"""In which order the agent reaches its services when it starts, seen while one of them keeps it waiting."""

from __future__ import annotations

from sandbox.fakes import dock
from sandbox.fakes.fault import Fault
from sandbox.terminal import Terminal
from tests.e2e.dockwatch import CLOSED, OPENED, reported, settle
from tests.e2e.software import CHANGE, EDITOR, INVENTORY, next_inventory, uploads
from tests.e2e.wire import SHUTDOWN_NOTICE, log_lines, next_notification


def start_until(terminal: Terminal, target: str, member: str) -> int:
    """Start the agent, which now waits for a service's answer; the mark before it."""
    terminal.fakes[target].faults[member] = Fault("hold")
    mark = terminal.events.mark()
    terminal.start_agent(ready=lambda: terminal.events.wait_for(target=target, member=member, after=mark))
    return mark


def test_dock_is_not_asked_before_the_launcher_has_answered(stocked: Terminal) -> None:
    mark = start_until(stocked, "launcher", "GetAllItemInfos")
    assert stocked.events.all(target="dock", after=mark) == []

    stocked.launcher.release()

    stocked.events.wait_for(target="dock", member="Get", after=mark)


def test_session_is_announced_before_the_dock_has_answered(stocked: Terminal) -> None:
    stocked.dock.open_app("mail", "Mail")

    mark = start_until(stocked, "dock", "Get")

    stocked.events.wait_for(source="velks", target="daemon", member="SendUserStatus", after=mark)
    assert [url for url, _ in uploads(stocked, mark)] == [INVENTORY]
    stocked.dock.faults.clear()
    stocked.dock.release()
    settle(stocked)
    assert reported(stocked, mark) == [(OPENED, "Mail")]


def test_what_the_dock_says_while_it_is_read_is_heard(terminal: Terminal) -> None:
    mark = start_until(terminal, "dock", "Get")

    terminal.dock.emit(dock.INTERFACE, "EntryRemoved", "printer")
    terminal.dock.faults.clear()
    terminal.dock.release()
    settle(terminal)

    assert 'unknow entry removed, id: "printer"' in log_lines(terminal, mark)


def test_windows_that_change_while_a_slow_dock_is_read_are_known_afterwards(terminal: Terminal) -> None:
    terminal.dock.open_app("editor", "Editor", docked=True, windows=0)
    terminal.dock.open_app("mail", "Mail", docked=True, windows=0)
    terminal.dock.faults["Id"] = Fault("hold")
    mark = terminal.events.mark()
    terminal.start_agent(
        ready=lambda: terminal.events.wait_for(target="dock", member="Get", after=mark, count=2)
    )
    for number in (1, 2, 3):
        terminal.dock.set_windows("mail", number)
    terminal.dock.release()
    settle(terminal)
    # Qt holds signals back until the event loop runs: the changes until here may count or not.
    mark = terminal.events.mark()

    terminal.dock.set_windows("mail", 0)
    settle(terminal)

    assert reported(terminal, mark) == [(CLOSED, "Mail")]


def test_policy_that_comes_while_the_launcher_is_asked_is_carried_out(terminal: Terminal) -> None:
    mark = start_until(terminal, "launcher", "GetAllItemInfos")

    terminal.daemon.push_policy({"type": 1300})
    terminal.launcher.release()

    assert next_notification(terminal, mark).body == SHUTDOWN_NOTICE


def test_change_that_comes_while_the_first_inventory_is_made_is_reported_after_it(stocked: Terminal) -> None:
    mark = start_until(stocked, "launcher", "GetAllItemInfos")

    stocked.launcher.announce("created", EDITOR)
    stocked.launcher.faults.clear()
    stocked.launcher.release()
    next_inventory(stocked, mark, count=2)

    assert [url for url, _ in uploads(stocked, mark)] == [INVENTORY, CHANGE, INVENTORY]


def test_first_inventory_is_logged_like_a_report_without_an_action(session: Terminal) -> None:
    lines = [(line.member, line.args[0]) for line in session.events.all(kind="log")]
    first = lines.index(("debug", '"" ()'))
    asked = ("info", 'GetLauncerItems -------- QDBusError("", "")')
    assert (lines[first + 1], lines.count(asked)) == (asked, 1)
