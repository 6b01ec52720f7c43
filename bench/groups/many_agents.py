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
    alone: dict[str, list[float]] = {"Pss": [], "Private_Dirty": [], "time": []}
    each: dict[str, list[float]] = {"Pss": [], "Private_Dirty": [], "time": []}
    with Testbed() as testbed:
        for run in plan.times():
            plan.tell(f"{_AGENTS} agents at once, run {run + 1} of {plan.runs}")
            one, all_of_them = _start(testbed, 1), _start(testbed, _AGENTS)
            for name in ("Pss", "Private_Dirty"):
                alone[name].append(one[name])
                each[name].append((all_of_them[name] - one[name]) / (_AGENTS - 1))
            alone["time"].append(one["time"])
            each["time"].append(all_of_them["time"] / _AGENTS)
    goal = Goal("at most", 1)
    same = Goal("at most", _PAGE, "above floor")
    yield Figure(
        "many.Pss", "memory of a further agent (its share)", "memory", "KiB", each["Pss"], alone["Pss"], goal
    )
    dirty = "Private_Dirty"
    yield Figure(
        f"many.{dirty}", "private dirty of a further agent", "memory", "KiB", each[dirty], alone[dirty], same
    )
    yield Figure(
        "many.time", "start of each, to UpdateUserInfo", "time", "ms", each["time"], alone["time"], goal
    )


def _start(testbed: Testbed, count: int) -> dict[str, float]:
    """Memory of so many agents together in KiB, and the milliseconds until the last one is announced."""
    testbed.forget()
    with ExitStack() as stack:
        processes = [stack.enter_context(Process(agent().argv)) for _ in range(count)]
        for _ in processes:
            (told,) = testbed.desktop.wait_for("UpdateUserInfo")
        for process in processes:
            process.await_calm()
        memory = {
            name: sum(process.memory(name) for process in processes) for name in ("Pss", "Private_Dirty")
        }
    return {**memory, "time": (told - processes[0].began) / 1e6}
