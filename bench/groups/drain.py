"""Backlogs of unread messages for a domain user."""

from __future__ import annotations

from typing import Iterator

from bench import callgrind
from bench.testbed import ADDRESS, Testbed
from bench.figures import Figure, Goal
from bench.plan import Plan
from bench.programs import Process, Program, agent, floor
from sandbox.machine.clock import ManualClock
from sandbox.periods import SURELY_NEXT_POLL

_BACKLOG = 1_000  # as many as the agent reads at full speed
_LENGTHS = (100, 10_000, 100_000)
_FEW, _MANY = 20, 220
_SECONDS_PER_MESSAGE = 0.05
_COUNTED_SECONDS = 300.0
_AFTER_BREAK = 50
_FLAT = Goal("at most", 1.05)
_NO_LOG = {"QT_LOGGING_RULES": "*=false"}
_HANDLES = (
    "most of the difference is the fresh libcurl handle of each request; a reused one would reach it, but "
    "libcurl 7.88 reads freed memory then"
)


def measure(plan: Plan) -> Iterator[Figure]:
    """Measures rate, instructions, connections and memory."""
    programs = agent(), floor("drain", ADDRESS)
    with Testbed(platform=True) as testbed:
        if not plan.quick:
            values, floors = plan.pairs(
                f"drain of {_BACKLOG:,} messages", *programs, lambda program: _rate(testbed, program)
            )
            goal = Goal("at least", 0.9, otherwise=_HANDLES)
            yield Figure("drain.rate", "messages over TLS", "rate", "per s", values, floors, goal)
        yield from _all_instructions(plan, testbed, programs)
        if not plan.quick:
            plan.show_step("connections of a drain")
            yield from _connections(testbed)
            yield from _lengths(plan, testbed)


def _drain(testbed: Testbed, program: Program, messages: int) -> tuple[float, dict[str, float]]:
    """The duration in seconds, and the memory at the end."""
    testbed.platform.send(f"messages {messages}")
    with testbed.start(program) as process:
        begin, end = testbed.platform.wait_for("drained", 60 + messages * _SECONDS_PER_MESSAGE)
        memory = {"VmStk": process.status("VmStk"), "Rss": process.memory("Rss")}
    return (end - begin) / 1e9, memory


def _rate(testbed: Testbed, program: Program) -> float:
    seconds, _ = _drain(testbed, program, _BACKLOG)
    return _BACKLOG / seconds


def _all_instructions(plan: Plan, testbed: Testbed, programs: tuple[Program, Program]) -> Iterator[Figure]:
    goal = Goal("at most", 1 / 0.95, otherwise=_HANDLES)
    logs: dict[str, dict[str, str]] = {"one message": {}, "one message, nothing logged": _NO_LOG}
    for title, env in logs.items():
        if plan.quick and env:
            return
        values, floors = plan.counts(
            f"instructions of {title}", *programs, lambda program: _instructions(testbed, program, env)
        )
        name = "drain.instructions.silent" if env else "drain.instructions"
        judged = goal if env else None
        yield Figure(name, title, "instructions", "thousand", values, floors, judged)


def _instructions(testbed: Testbed, program: Program, env: dict[str, str]) -> float:
    def total(messages: int) -> float:
        def work(process: Process) -> None:
            testbed.platform.wait_for("drained", _COUNTED_SECONDS)
            process.await_calm()

        testbed.forget()
        testbed.platform.send(f"messages {messages}")
        return callgrind.of_work(program, work, env)

    return (total(_MANY) - total(_FEW)) / (_MANY - _FEW) / 1e3


def _connections(testbed: Testbed) -> Iterator[Figure]:
    """Handshakes for a backlog of 1,000, and for one after the server has closed the idle connection."""
    clock = ManualClock()
    testbed.platform.send("messages 1000")
    before = _counts(testbed)
    with testbed.start(agent(), clock.environment()):
        testbed.platform.wait_for("drained")
        drained = _counts(testbed)
        testbed.platform.send("close")
        testbed.platform.send(f"messages {_AFTER_BREAK}")
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
    testbed.platform.send("counts")
    return testbed.platform.wait_for("counts")


def _lengths(plan: Plan, testbed: Testbed) -> Iterator[Figure]:
    """Memory by the length of the backlog. The floor is the shortest backlog, which fills the same
    buffers."""
    at_first: dict[str, float] = {}
    for length in _LENGTHS:
        plan.show_step(f"drain of {length:,} messages")
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
