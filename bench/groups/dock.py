"""A dock with very many entries, and very many changes of their windows."""

from __future__ import annotations

from typing import Iterator

from bench import callgrind
from bench.testbed import Testbed
from bench.figures import Figure, Goal
from bench.plan import Plan
from bench.programs import Process, Program, agent, floor

_ENTRIES = 10_000
_CHANGES = 100_000
_WINDOW = 64
_SECONDS = 120.0
_FEW, _MANY = 50, 350
_GOAL = Goal("at most", 1.2)


def measure(plan: Plan) -> Iterator[Figure]:
    """From exec until all entries are read; a change until the daemon is told of it."""
    if not plan.quick:
        yield from _times(plan)
    programs = agent(), floor("dock")
    values, floors = plan.pairs("instructions of a dock's entry", *programs, _instructions_of_entry)
    yield Figure("dock.entry.instructions", "one entry", "instructions", "thousand", values, floors)
    values, floors = plan.pairs("instructions of a window's change", *programs, _instructions_of_change)
    yield Figure("dock.change.instructions", "one window change", "instructions", "thousand", values, floors)


def _times(plan: Plan) -> Iterator[Figure]:
    programs = agent(), floor("dock")
    reads: dict[str, list[float]] = {"agent": [], "floor": []}
    changes: dict[str, list[float]] = {"agent": [], "floor": []}
    for run in plan.times():
        plan.tell(f"dock with {_ENTRIES:,} entries, run {run + 1} of {plan.runs}")
        for program in programs:
            with Testbed(entries=_ENTRIES) as testbed, testbed.start(program) as process:
                (read,) = testbed.desktop.wait_for("entries", _SECONDS)
                reads[program.name].append((read - process.began) / 1e9)
                begin, end, *_ = _change(testbed, process, _CHANGES)
                changes[program.name].append((end - begin) / 1e9)
    title = f"dock with {_ENTRIES:,} entries"
    yield Figure("dock.entries", title, "time", "s", reads["agent"], reads["floor"], _GOAL)
    title = f"{_CHANGES:,} window changes"
    yield Figure("dock.changes", title, "time", "s", changes["agent"], changes["floor"], _GOAL)


def _change(testbed: Testbed, process: Process, count: int) -> list[int]:
    """Until it is calm, the agent may read again what changes."""
    process.await_calm()
    testbed.desktop.tell(f"windows {count} {_WINDOW}")
    return testbed.desktop.wait_for("done", _SECONDS)


def _instructions_of_entry(program: Program) -> float:
    return (_total(program, _MANY, _FEW) - _total(program, _FEW, _FEW)) / (_MANY - _FEW) / 1e3


def _instructions_of_change(program: Program) -> float:
    return (_total(program, _FEW, _MANY) - _total(program, _FEW, _FEW)) / (_MANY - _FEW) / 1e3


def _total(program: Program, entries: int, changes: int) -> float:
    with Testbed(entries=entries) as testbed:

        def work(process: Process) -> None:
            testbed.desktop.wait_for("entries", _SECONDS)
            _change(testbed, process, changes)

        return callgrind.of_work(program, work)
