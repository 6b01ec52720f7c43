"""The daemon is absent, comes, restarts, hangs: what the agent reports of the user, and when."""

from __future__ import annotations

from sandbox.events import Event
from sandbox.fakes.fault import Fault
from sandbox.terminal import Terminal
from tests.e2e.wire import (
    FIVE_MINUTES,
    SHUTDOWN_NOTICE,
    log_lines,
    next_notification,
    next_status,
    push_online,
    start_agent,
    warnings,
)


def announcements(terminal: Terminal, after: int) -> list[tuple[str, tuple[object, ...]]]:
    """The agent's calls at the daemon since a mark."""
    calls = terminal.events.all(source="velks", target="daemon", kind="call", after=after)
    return [(call.member, call.args) for call in calls]


def agent_listens(terminal: Terminal, after: int) -> Event:
    """Wait until an agent that finds no daemon has come up."""
    terminal.events.wait_for(
        lambda event: "---getusername:" in event.args[0], kind="log", count=2, after=after
    )
    return terminal.events.all(kind="log", after=after)[-1]


def test_daemon_that_comes_later_gets_a_report_when_it_announces_itself(terminal: Terminal) -> None:
    terminal.daemon.leave()
    mark = start_agent(terminal)
    agent_listens(terminal, mark)

    terminal.session_manager.set("Locked", True)
    terminal.daemon.appear(announce=True)
    assert next_status(terminal, mark) == (2, "zhang.wei")
    assert announcements(terminal, mark) == [
        ("UpdateUserInfo", ("zhang.wei", 20001)),
        ("SendUserStatus", (2, "zhang.wei")),
    ]


def test_daemon_that_appears_silently_hears_nothing_until_the_next_report(terminal: Terminal) -> None:
    terminal.daemon.leave()
    terminal.start_agent()
    mark = terminal.events.mark()
    terminal.daemon.appear()
    terminal.sync()
    assert announcements(terminal, mark) == []
    terminal.advance(FIVE_MINUTES)
    assert next_status(terminal, mark) == (1, "zhang.wei")


def test_every_online_signal_is_answered(session: Terminal) -> None:
    mark = push_online(session)
    session.daemon.push_online()
    next_status(session, mark, count=2)
    assert [member for member, _ in announcements(session, mark)] == ["UpdateUserInfo", "SendUserStatus"] * 2


def test_online_signal_is_logged_with_name_and_uid(session: Terminal) -> None:
    mark = push_online(session)
    next_status(session, mark)
    session.sync()
    assert 'velkg restart sendonline   "zhang.wei" 20001' in log_lines(session, mark)


def test_restarted_daemon_is_announced_to_and_obeyed(session: Terminal) -> None:
    session.session_manager.lock()
    mark = session.events.mark()
    session.daemon.leave()
    session.daemon.appear(announce=True)
    next_status(session, mark)
    assert announcements(session, mark) == [
        ("UpdateUserInfo", ("zhang.wei", 20001)),
        ("SendUserStatus", (2, "zhang.wei")),
    ]
    session.daemon.push_policy({"type": 1300})
    assert next_notification(session, mark).body == SHUTDOWN_NOTICE


def test_daemon_that_never_answers_still_gets_reports_and_is_obeyed(terminal: Terminal) -> None:
    terminal.daemon.fault = Fault.hang()
    mark = start_agent(terminal)
    terminal.daemon.push_policy({"type": 1300})
    next_notification(terminal, mark)
    terminal.advance(FIVE_MINUTES)
    next_status(terminal, mark, count=2)


def test_daemon_that_refuses_every_call_changes_nothing(terminal: Terminal) -> None:
    assert terminal.platform, "a missing one would be warned of"
    terminal.daemon.fault = Fault.fail()
    mark = start_agent(terminal)
    terminal.advance(FIVE_MINUTES)
    next_status(terminal, mark, count=2)
    assert warnings(terminal, mark) == []


def test_name_known_at_start_is_announced_even_if_it_changed_since(session: Terminal) -> None:
    session.logind.rename("@later")
    mark = push_online(session)
    assert next_status(session, mark) == (1, "later")
    assert announcements(session, mark)[0] == ("UpdateUserInfo", ("zhang.wei", 20001))


def test_signals_during_a_slow_start_are_handled_after_it_in_their_order(terminal: Terminal) -> None:
    terminal.logind.fault = Fault.hold()
    mark = terminal.events.mark()

    def signals_come_while_the_name_is_read() -> None:
        terminal.events.wait_for(target="logind", member="Get", count=2, after=mark)
        terminal.daemon.push_online()
        terminal.daemon.push_policy({"type": 1201})
        terminal.logind.release()

    terminal.start_agent(ready=signals_come_while_the_name_is_read)
    next_notification(terminal, mark)
    next_status(terminal, mark, count=2)
    assert announcements(terminal, mark) == [
        ("UpdateUserInfo", ("zhang.wei", 20001)),
        ("SendUserStatus", (1, "zhang.wei")),
        ("UpdateUserInfo", ("zhang.wei", 20001)),
        ("SendUserStatus", (1, "zhang.wei")),
    ]
    terminal.advance(60)
    terminal.events.wait_for(target="logind", member="Terminate", after=mark)
