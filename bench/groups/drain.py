"""Rows of unread messages that the platform has for a domain user."""

from __future__ import annotations

from typing import Iterator

from bench import callgrind
from bench.testbed import ADDRESS, Testbed
from bench.figures import Figure, Goal
from bench.plan import Plan
from bench.programs import Process, Program, agent, floor
from sandbox.machine.clock import ManualClock
from sandbox.periods import SURELY_NEXT_POLL

_ROW = 3_000
_LENGTHS = (100, 10_000, 100_000)
_FEW, _MANY = 20, 220
_SECONDS_PER_MESSAGE = 0.05
_AFTER_BREAK = 50
_FLAT = Goal("at most", 1.05)


def measure(plan: Plan) -> Iterator[Figure]:
    """How fast, over how many connections, and with how much memory."""
    programs = agent(), floor("drain", ADDRESS)
    with Testbed(platform=True) as testbed:
        if not plan.quick:
            values, floors = plan.pairs(
                f"drain of {_ROW:,} messages", *programs, lambda program: _rate(testbed, program)
            )
            goal = Goal("at least", 0.9)
            yield Figure("drain.rate", "messages over TLS", "rate", "per s", values, floors, goal)
        values, floors = plan.pairs(
            "instructions of a message", *programs, lambda program: _instructions(testbed, program)
        )
        yield Figure("drain.instructions", "one message", "instructions", "thousand", values, floors)
        if not plan.quick:
            plan.tell("connections of a drain")
            yield from _connections(testbed)
            yield from _lengths(plan, testbed)


def _drain(testbed: Testbed, program: Program, messages: int) -> tuple[float, dict[str, float]]:
    """Seconds, and the memory at the end."""
    testbed.platform.tell(f"messages {messages}")
    with testbed.start(program) as process:
        begin, end = testbed.platform.wait_for("drained", 60 + messages * _SECONDS_PER_MESSAGE)
        memory = {"VmStk": process.status("VmStk"), "Rss": process.memory("Rss")}
    return (end - begin) / 1e9, memory


def _rate(testbed: Testbed, program: Program) -> float:
    seconds, _ = _drain(testbed, program, _ROW)
    return _ROW / seconds


def _instructions(testbed: Testbed, program: Program) -> float:
    def total(messages: int) -> float:
        def work(process: Process) -> None:
            testbed.platform.wait_for("drained")
            process.await_calm()

        testbed.forget()
        testbed.platform.tell(f"messages {messages}")
        return callgrind.of_work(program, work)

    return (total(_MANY) - total(_FEW)) / (_MANY - _FEW) / 1e3


def _connections(testbed: Testbed) -> Iterator[Figure]:
    """Handshakes of a row of 1,000, and of one after the server has closed the idle connection."""
    clock = ManualClock()
    testbed.platform.tell("messages 1000")
    before = _counts(testbed)
    with testbed.start(agent(), clock.environment()):
        testbed.platform.wait_for("drained")
        drained = _counts(testbed)
        testbed.platform.tell("close")
        testbed.platform.tell(f"messages {_AFTER_BREAK}")
        testbed.move_clock(clock, SURELY_NEXT_POLL)
        testbed.platform.wait_for("drained")
        reconnected = _counts(testbed)
    one = Goal("at most", 1, "value")
    yield _count("drain.handshakes", "handshakes for 1,000 messages", drained[0] - before[0], one)
    yield _count(
        "drain.reconnect.handshakes",
        "handshakes after the server closed the connection",
        reconnected[0] - drained[0],
        one,
    )
    lost = _AFTER_BREAK - (reconnected[2] - drained[2])
    yield _count("drain.reconnect.lost", "messages lost with it", lost, Goal("at most", 0, "value"))


def _count(name: str, title: str, value: int, goal: Goal) -> Figure:
    return Figure(name, title, "count", "", [value], (), goal)


def _counts(testbed: Testbed) -> list[int]:
    testbed.platform.tell("counts")
    return testbed.platform.wait_for("counts")


def _lengths(plan: Plan, testbed: Testbed) -> Iterator[Figure]:
    """The floor is the shortest row, which fills the same buffers."""
    at_first: dict[str, float] = {}
    for length in _LENGTHS:
        plan.tell(f"drain of {length:,} messages")
        _, memory = _drain(testbed, agent(), length)
        at_first = at_first or memory
        for line, title in {"VmStk": "stack", "Rss": "resident"}.items():
            yield Figure(
                f"drain.{line}.{length}",
                f"{title} after a drain of {length:,}",
                "memory",
                "KiB",
                [memory[line]],
                [at_first[line]],
                _FLAT,
                f"drain.{line}",
                length,
            )
