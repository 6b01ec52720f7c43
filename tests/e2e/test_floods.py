"""Floods of messages, and huge ones: nothing is lost, no memory is kept, and later policies are obeyed.

How fast it goes, and the full numbers, are measured by `./dev bench forwarding dock`.
"""

from __future__ import annotations

import json
import os

import pytest

from gi.repository import GLib

from sandbox.bus.flooder import Flooder, signal
from sandbox.fakes import daemon, dock, launcher
from sandbox.fakes.fault import Fault
from sandbox.fakes.launcher import LauncherItem
from sandbox.policies import FORWARDED_CODES
from sandbox.terminal import Terminal
from tests.e2e.dockwatch import CLOSED, OPENED, reported, settle
from tests.e2e.strangers import receivers, straight_or_not
from tests.e2e.wire import carries_out_policies, log_lines, push, wait_on_notification

MIB = 1 << 20
# What a flood may leave behind: the memory of a program is not given back to its last page, and that of an
# instrumented one (./dev sanitize) is held back on purpose after it was freed.
SPARE = (64 if "ASAN_OPTIONS" in os.environ else 24) * MIB

GARBAGE = ("{", "[]", "5", "null", '{"a":1}', "\x01\x7f", "终端", '{"type":')
FORWARDED = (*FORWARDED_CODES, -1, 2147483647)


def policies_of_a_flood(number: int) -> list[str]:
    """Garbage and forwarded codes in turn, each text different."""
    forwarded = [json.dumps({"type": FORWARDED[i % len(FORWARDED)], "number": i}) for i in range(number // 2)]
    return [text for i, good in enumerate(forwarded) for text in (GARBAGE[i % len(GARBAGE)], good)]


def push_all(terminal: Terminal, texts: list[str]) -> None:
    """Push so many policies and return when the agent has handled the last one."""
    mark = terminal.events.mark()
    for text in texts:
        terminal.daemon.push_policy(text)
    terminal.events.wait_for(
        lambda event: event.args[0].startswith("onPolicyMsg"), kind="log", after=mark, count=len(texts)
    )
    terminal.sync()


def test_flood_of_policies_reaches_a_hung_policy_service_whole_and_in_order(terminal: Terminal) -> None:
    terminal.policy_service.fault = Fault("hang")
    terminal.start_agent()
    before = terminal.agent.resident_bytes()
    texts = policies_of_a_flood(4000)

    push_all(terminal, texts)

    terminal.receive_all()
    arrived = [event.args[0] for event in terminal.events.all(target="policy_service", member="onPolicyMsg")]
    assert arrived == texts[1::2]
    assert terminal.agent.resident_bytes() - before < SPARE
    carries_out_policies(terminal)


def test_flood_of_policies_for_an_absent_policy_service_is_lost_and_nothing_else(terminal: Terminal) -> None:
    terminal.policy_service.leave()
    terminal.start_agent()
    before = terminal.agent.resident_bytes()

    push_all(terminal, policies_of_a_flood(4000))

    assert terminal.agent.resident_bytes() - before < SPARE
    carries_out_policies(terminal)
    terminal.policy_service.appear()
    mark = terminal.events.mark()
    push_all(terminal, ['{"type":5,"text":"later"}'])
    terminal.events.wait_for(target="policy_service", member="onPolicyMsg", after=mark)


def test_flood_that_comes_while_a_notification_is_waited_for_is_handled_after_it(session: Terminal) -> None:
    wait_on_notification(session, Fault("hold"))
    texts = policies_of_a_flood(2000)
    for text in texts:
        session.daemon.push_policy(text)
    session.notifications.release()
    session.sync()
    session.receive_all()
    arrived = [event.args[0] for event in session.events.all(target="policy_service", member="onPolicyMsg")]
    assert arrived == texts[1::2]


def test_long_policies_to_a_hung_policy_service_are_not_kept(terminal: Terminal) -> None:
    terminal.policy_service.fault = Fault("hang")
    terminal.start_agent()
    long = [json.dumps({"type": 5, "number": i, "text": "x" * MIB}) for i in range(40)]
    push_all(terminal, long[:4])
    before = terminal.agent.resident_bytes()

    push_all(terminal, long[4:])

    terminal.receive_all()
    arrived = [event.args[0] for event in terminal.events.all(target="policy_service", member="onPolicyMsg")]
    assert arrived == long
    assert terminal.agent.resident_bytes() - before < SPARE


@pytest.mark.parametrize("app_id", ["box", "x" * 8 * MIB], ids=["box", "8 MiB"])
@pytest.mark.parametrize(
    "payload",
    [
        "x" * 8 * MIB,
        '{"type":5}' + " " * 8 * MIB,
        '{"type":5,"text":"' + "终" * 2 * MIB + '"}',
        "[" * 8 * MIB,
    ],
    ids=["no JSON", "blanks", "forwarded", "deep"],
)
def test_oversized_policy_is_taken_like_any_other(session: Terminal, app_id: str, payload: str) -> None:
    mark = push(session, payload, app_id)
    session.events.wait_for(lambda event: event.args[0].startswith("onPolicyMsg"), kind="log", after=mark)
    session.sync()
    arrived = [event.args[0] for event in session.events.all(target="policy_service", after=mark)]
    assert arrived == ([payload] if payload.startswith("{") else [])
    carries_out_policies(session)


def test_every_change_of_a_flood_of_windows_is_reported(terminal: Terminal) -> None:
    for number in range(100):
        terminal.dock.open_app(f"app{number}", f"App {number}", docked=True, windows=0)
    terminal.start_agent()
    settle(terminal)
    before = terminal.agent.resident_bytes()
    mark = terminal.events.mark()
    for windows in (1, 0) * 10:
        for number in range(100):
            terminal.dock.set_windows(f"app{number}", windows)
    settle(terminal)
    one_round = [[(kind, f"App {number}") for number in range(100)] for kind in (OPENED, CLOSED)]
    assert reported(terminal, mark) == (one_round[0] + one_round[1]) * 10
    assert terminal.agent.resident_bytes() - before < SPARE


def test_long_dock_is_read_and_reported_whole(terminal: Terminal) -> None:
    for number in range(500):
        terminal.dock.open_app(f"app{number}", f"App {number}")
    terminal.start_agent()
    settle(terminal)
    assert reported(terminal) == [(OPENED, f"App {number}") for number in range(500)]


def test_application_with_a_huge_name_and_countless_windows_is_reported(session: Terminal) -> None:
    settle(session)
    mark = session.events.mark()
    session.dock.open_app("long", "n" * 8 * MIB)
    session.dock.open_app("many", "Many", windows=50_000)
    settle(session)
    assert reported(session, mark) == [(OPENED, "n" * 8 * MIB), (OPENED, "Many")]
    carries_out_policies(session)


def test_launcher_item_with_endless_texts_is_reported(session: Terminal) -> None:
    mark = session.events.mark()
    session.launcher.announce("created", LauncherItem("/" + "p" * MIB, "n" * MIB, "d" * MIB, "e" * MIB))
    told_of = session.events.wait_for(target="daemon", member="onUploadFinished", after=mark)
    assert "n" * MIB in told_of.args[1]
    carries_out_policies(session)


def strangers_flood(kind: str, to: str | None) -> list[bytes]:
    """What a stranger sends in the name of the daemon, the dock and the launcher."""
    if kind == "system":
        policy = GLib.Variant("(ss)", ("box", '{"type":1201}'))
        return [
            signal(daemon.PATH, daemon.INTERFACE, "pushPolicyMsg", policy, to),
            signal(daemon.PATH, daemon.INTERFACE, "pushOnlineMsg", None, to),
        ]
    added = GLib.Variant("(oi)", (f"{dock.ENTRIES}/e1", 0))
    changed = GLib.Variant("(s(ssssxx)x)", ("created", ("/a", "A", "", "", 0, 0), 0))
    return [
        signal(dock.PATH, dock.INTERFACE, "EntryAdded", added, to),
        signal(dock.PATH, dock.INTERFACE, "EntryRemoved", GLib.Variant("(s)", ("mail",)), to),
        signal(launcher.PATH, launcher.INTERFACE, "ItemChanged", changed, to),
    ]


@pytest.mark.parametrize("kind", ["system", "session"])
@straight_or_not
def test_flood_of_a_stranger_costs_nothing(terminal: Terminal, kind: str, straight: bool) -> None:
    terminal.dock.open_app("mail", "Mail")
    terminal.start_agent()
    settle(terminal)
    before = terminal.agent.resident_bytes()
    mark = terminal.events.mark()
    bus = terminal.system_bus if kind == "system" else terminal.session_bus
    flooder = Flooder(bus)
    for receiver in receivers(terminal, bus, straight):
        flooder.send(strangers_flood(kind, receiver), 3000)
    flooder.close()
    settle(terminal)
    terminal.sync()
    assert [line for line in log_lines(terminal, mark) if "1201" in line or "onItemChanged" in line] == []
    assert reported(terminal, mark) == []
    assert terminal.agent.resident_bytes() - before < SPARE
    carries_out_policies(terminal)
