"""Policies that are handed on to the session policy service."""

from __future__ import annotations

from statistics import median
from typing import Iterator

from bench import callgrind
from bench.testbed import Testbed
from bench.figures import Figure, Goal
from bench.plan import Plan
from bench.programs import Process, Program, agent, floor

# By the size in bytes: its name, how many for the rate, how many for the latency.
_SIZES = {200: ("200 B", 20_000, 1_000), 65_536: ("64 KiB", 1_000, 200), 1 << 20: ("1 MiB", 60, 30)}
_WINDOW = 64
_FEW, _MANY = 100, 1_100
_COUNTED_SIZE = 200


def measure(plan: Plan) -> Iterator[Figure]:
    """Rates and latencies for small and large policies, and the instructions of a small one."""
    programs = agent(), floor("forwarding")
    with Testbed() as testbed:
        if not plan.quick:
            yield from _times(plan, testbed, programs)
        values, floors = plan.pairs(
            "instructions of a policy", *programs, lambda program: _instructions(testbed, program)
        )
        yield Figure(
            "forwarding.instructions",
            "forwarding a policy of 200 B",
            "instructions",
            "thousand",
            values,
            floors,
        )


def _times(plan: Plan, testbed: Testbed, programs: tuple[Program, Program]) -> Iterator[Figure]:
    for size, (title, for_rate, for_latency) in _SIZES.items():

        def rate(program: Program) -> float:
            with testbed.start_and_wait(program):
                begin, end, *_ = testbed.policies(for_rate, size, _WINDOW)
            return for_rate * 1e9 / (end - begin)

        def latency(program: Program) -> float:
            with testbed.start_and_wait(program):
                _, _, *latencies = testbed.policies(for_latency, size)
            return median(latencies) / 1e3

        values, floors = plan.pairs(f"rate of policies, {title}", *programs, rate)
        goal = Goal("at least", 0.85)
        yield Figure(f"forwarding.rate.{size}", f"policies of {title}", "rate", "per s", values, floors, goal)

        values, floors = plan.pairs(f"latency of policies, {title}", *programs, latency)
        goal = Goal("at most", 1.2)
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


def _instructions(testbed: Testbed, program: Program) -> float:
    def total(count: int) -> float:
        def work(_process: Process) -> None:
            testbed.desktop.wait_for("UpdateUserInfo")
            testbed.policies(count, _COUNTED_SIZE, _WINDOW)

        testbed.forget()
        return callgrind.of_work(program, work)

    return (total(_MANY) - total(_FEW)) / (_MANY - _FEW) / 1e3
