"""Fifty agents at once, as on a terminal server."""

from __future__ import annotations

from contextlib import ExitStack
from typing import Iterator

from bench.testbed import Testbed
from bench.figures import Figure, Goal
from bench.plan import Plan
from bench.programs import Process, agent

_AGENTS = 50
_PAGE = 4  # KiB: memory is counted in pages


def measure(plan: Plan) -> Iterator[Figure]:
    """The floor is one agent alone: its memory, and the time of its start."""
    if plan.quick:
        return
    with Testbed() as testbed:
        columns = plan.repeat(f"{_AGENTS} agents at once", lambda: [*_of_each(testbed), *_start(testbed, 1)])
    goal = Goal("at most", 1)
    same = Goal("at most", _PAGE, "above floor")
    (share, dirty, time), (one_share, one_dirty, one_time) = columns[:3], columns[3:]
    yield Figure("many.Pss", "memory of a further agent (its share)", "memory", "KiB", share, one_share, goal)
    yield Figure(
        "many.Private_Dirty", "private dirty of a further agent", "memory", "KiB", dirty, one_dirty, same
    )
    yield Figure("many.time", "start of each, to UpdateUserInfo", "time", "ms", time, one_time, goal)


def _of_each(testbed: Testbed) -> list[float]:
    """What each of many needs more, and the time of each where they start together."""
    one, many = _start(testbed, 1), _start(testbed, _AGENTS)
    further = [(all_of_them - alone) / (_AGENTS - 1) for all_of_them, alone in zip(many[:-1], one)]
    return [*further, many[-1] / _AGENTS]


def _start(testbed: Testbed, count: int) -> list[float]:
    """Shared and private dirty memory of so many agents together in KiB, and the milliseconds until the last
    one is announced."""
    testbed.forget()
    with ExitStack() as stack:
        processes = [stack.enter_context(Process(agent().argv)) for _ in range(count)]
        for _ in processes:
            (reported,) = testbed.desktop.wait_for("UpdateUserInfo")
        for process in processes:
            process.await_calm()
        memory = [sum(process.memory(name) for process in processes) for name in ("Pss", "Private_Dirty")]
    return [*memory, (reported - processes[0].began) / 1e6]
