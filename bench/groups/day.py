"""What a day costs: that of the soak, for this box's user, on the large package database."""

from __future__ import annotations

import json
import sys
from collections import Counter
from dataclasses import dataclass
from pathlib import Path
from typing import Any, Iterator

from bench import packages
from bench.figures import Figure, Kind
from bench.plan import Plan
from bench.processes import Running
from sandbox.events import SYNC, WAKE_UP, Event
from sandbox.machine.packages import Packages
from sandbox.soak.day import live
from sandbox.soak.session import Session

_HOURS = 23  # after the one of warming up
_SEED = 1
_QUESTIONS = 200  # rows of them, as each minute has one, by which the cost of one is measured
_SWITCH_SECONDS = 0.0001  # the services' threads share one interpreter and hand over often
_NET = Path("/proc/net/dev")
_SENT = 8  # place of the sent bytes in a line of that file


@dataclass(frozen=True)
class _Spent:
    """What the agent has used so far."""

    nanoseconds: float
    wakeups: float

    def __sub__(self, other: _Spent) -> _Spent:
        return _Spent(self.nanoseconds - other.nanoseconds, self.wakeups - other.wakeups)

    def __mul__(self, times: float) -> _Spent:
        return _Spent(self.nanoseconds * times, self.wakeups * times)


class _Listener:
    """Counts what only the simulation asks, the children, and the platform's requests with their bytes."""

    def __init__(self) -> None:
        self.questions = 0
        self.children = 0
        self.requests: Counter[str] = Counter()
        self.bytes: Counter[str] = Counter()
        self._sent = _sent_bytes()
        self._reply = 0

    def look_at(self, event: Event) -> None:
        """Called with each event, on the thread where it happens."""
        if event.kind == "log" and "onPolicyMsg" in event.args[0]:
            self.questions += any(question in event.args[0] for question in (SYNC, WAKE_UP))
        elif event.kind == "reply":
            self._count_request(event)
        elif event.kind == "call" and event.member == "onUploadFinished":
            self._count_report(event.args[1])

    def _count_request(self, event: Event) -> None:
        """A reply is announced before it is sent: its bytes come to those of the next request."""
        route, _status, body = event.args
        sent, reply = _sent_bytes(), len(body.encode())
        self.requests[route] += 1
        self.bytes[route] += sent - self._sent + reply - self._reply
        self._sent, self._reply = sent, reply

    def _count_report(self, text: str) -> None:
        """The daemon sends the agent's reports on; of their bytes the text alone is known."""
        self.children += _children(json.loads(text)["payload"])
        self.requests["report"] += 1
        self.bytes["report"] += len(text.encode())


def _children(report: dict[str, Any]) -> int:
    """Those of a report: one asks for the architecture, two look up each item, and that of a change."""
    return 1 + 2 * len(report["list"]) if "list" in report else 2


def _sent_bytes() -> int:
    """What has gone over the loopback, where the platform is, in both directions and with all headers."""
    line = next(line for line in _NET.read_text().splitlines() if line.strip().startswith("lo:"))
    return int(line.partition(":")[2].split()[_SENT])


def measure(plan: Plan) -> Iterator[Figure]:
    """The figures of this box's user."""
    if plan.quick:
        return
    sys.setswitchinterval(_SWITCH_SECONDS)
    session = Session()
    try:
        yield from _day(plan, session)
    finally:
        session.terminal.shut_down()


def _day(plan: Plan, session: Session) -> Iterator[Figure]:
    session.terminal.packages = Packages(packages.database())
    listener = _Listener()
    session.terminal.events.subscribe(listener.look_at)
    for hour, _ in enumerate(live(session, _HOURS, _SEED)):
        plan.show_step(f"a day, hour {hour} of {_HOURS}")
    process = Running(session.terminal.agent.pid)
    spent = _spent(process)
    memory = {"resting": process.memory("Rss"), "peak": process.status("VmHWM")}
    questions = listener.questions
    plan.show_step("what the simulation itself asks")
    for _ in range(_QUESTIONS):
        session.terminal.advance(0)
    own = spent - (_spent(process) - spent) * (questions / (listener.questions - questions))
    who = "domain" if session.terminal.user.is_domain_user else "local"

    def figure(name: str, title: str, unit: str, value: float, kind: Kind = "count") -> Figure:
        return Figure(f"day.{who}.{name}", f"{title}, {who} user", kind, unit, [value])

    yield figure("cpu", "processor time of the agent", "s", own.nanoseconds / 1e9)
    yield figure("tools", "processor time of its children", "s", process.children_seconds())
    yield figure("children", "children started", "", listener.children)
    yield figure("wakeups", "wake-ups", "", own.wakeups)
    for name, value in memory.items():
        yield figure(name, f"{name} memory", "KiB", value, "memory")
    for kind, count in sorted(listener.requests.items()):
        yield figure(f"requests.{kind}", f"requests, {kind}", "", count)
        yield figure(f"bytes.{kind}", f"on the network, {kind}", "kB", listener.bytes[kind] / 1e3)


def _spent(process: Running) -> _Spent:
    return _Spent(process.cpu_nanoseconds(), process.voluntary_switches())
