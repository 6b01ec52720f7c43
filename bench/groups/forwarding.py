"""Policies that the agent forwards to the session policy service."""

from __future__ import annotations

from statistics import median
from typing import Iterator

from bench import callgrind
from bench.testbed import Testbed
from bench.figures import Figure, Goal
from bench.plan import Plan
from bench.programs import Process, Program, agent, bench_program, floor

# By the size in bytes: its name, how many for the rate, how many for the latency.
_SIZES = {200: ("200 B", 20_000, 1_000), 65_536: ("64 KiB", 1_000, 200), 1 << 20: ("1 MiB", 60, 30)}
_WINDOW = 64
_SMALL, _LARGE = 200, 1 << 20
# By the size: the numbers of policies in two runs; the instructions of a policy come from their difference.
_COUNTED = {_SMALL: (100, 1_100), _LARGE: (4, 24)}
_QUOTING_SECONDS = 60.0
_PAGES = (
    "the agent gives large blocks back to the kernel at once, and their fresh pages cost more than the work; "
    "keeping them would reach it, for some MiB more of resting memory"
)
_UNITS = {_SMALL: ("thousand", 1e3), _LARGE: ("million", 1e6)}


def measure(plan: Plan) -> Iterator[Figure]:
    """Measures rates, latencies and instructions for small and large policies."""
    with Testbed() as testbed:
        if not plan.quick:
            yield from _times(plan, testbed)
        for size in _COUNTED:
            yield _instructions(plan, testbed, size)
        if not plan.quick:
            yield _quoting(plan, testbed)


def _floor(size: int) -> Program:
    """Parsing and logging are a small part of what a small policy takes, and most of a large one."""
    return floor("forwarding") if size == _SMALL else floor("forwarding", "read")


def _times(plan: Plan, testbed: Testbed) -> Iterator[Figure]:
    for size, (title, for_rate, for_latency) in _SIZES.items():
        programs = agent(), _floor(size)

        def rate(program: Program) -> float:
            with testbed.start_and_wait(program):
                begin, end, *_ = testbed.policies(for_rate, size, _WINDOW)
            return for_rate * 1e9 / (end - begin)

        def latency(program: Program) -> float:
            with testbed.start_and_wait(program):
                _, _, *latencies = testbed.policies(for_latency, size)
            return median(latencies) / 1e3

        values, floors = plan.pairs(f"rate of policies, {title}", *programs, rate)
        goal = Goal("at least", 0.85, otherwise=_PAGES)
        yield Figure(f"forwarding.rate.{size}", f"policies of {title}", "rate", "per s", values, floors, goal)

        values, floors = plan.pairs(f"latency of policies, {title}", *programs, latency)
        goal = Goal("at most", 1.2, otherwise=_PAGES)
        yield Figure(
            f"forwarding.latency.{size}",
            f"latency of a policy of {title}",
            "time",
            "µs",
            values,
            floors,
            goal,
            "forwarding.latency",
            size,
        )


def _instructions(plan: Plan, testbed: Testbed, size: int) -> Figure:
    unit, per_unit = _UNITS[size]
    title = f"forwarding a policy of {_SIZES[size][0]}"
    values, floors = plan.counts(
        title, agent(), _floor(size), lambda program: _of_one(testbed, program, size) / per_unit
    )
    return Figure(f"forwarding.instructions.{size}", title, "instructions", unit, values, floors)


def _of_one(testbed: Testbed, program: Program, size: int) -> float:
    few, many = _COUNTED[size]

    def total(count: int) -> float:
        def work(_process: Process) -> None:
            testbed.desktop.wait_for("UpdateUserInfo")
            testbed.policies(count, size, _WINDOW)

        testbed.forget()
        return callgrind.of_work(program, work)

    return (total(many) - total(few)) / (many - few)


def _quoting(plan: Plan, testbed: Testbed) -> Figure:
    """What the log adds to a large policy, against a floor that forwards it without looking into it."""
    title, (unit, per_unit) = "of it, the log's quotes", _UNITS[_LARGE]

    def quoting(count: int) -> float:
        argv = [bench_program("quoting"), str(_LARGE), str(count)]
        return callgrind.of_work(Program("quoting", argv), lambda process: process.wait(_QUOTING_SECONDS))

    plan.show_step(title)
    values = [(quoting(2) - quoting(1)) / per_unit]
    floors = [_of_one(testbed, floor("forwarding"), _LARGE) / per_unit]
    goal = Goal("at most", 0.25)
    return Figure("forwarding.quoting", title, "instructions", unit, values, floors, goal)
