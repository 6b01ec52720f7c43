"""A dock with very many entries and very many window changes."""

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
    """Measures the time from exec until all entries are read, and from a change to its report."""
    if not plan.quick:
        yield from _times(plan)
    programs = agent(), floor("dock")
    values, floors = plan.counts("instructions of a dock's entry", *programs, _instructions_of_entry)
    yield Figure("dock.entry.instructions", "one entry", "instructions", "thousand", values, floors)
    values, floors = plan.counts("instructions of a window's change", *programs, _instructions_of_change)
    yield Figure("dock.change.instructions", "one window change", "instructions", "thousand", values, floors)


def _times(plan: Plan) -> Iterator[Figure]:
    title = f"dock with {_ENTRIES:,} entries"
    reads, changes, floor_reads, floor_changes = plan.repeat(
        title, lambda: (*_seconds(agent()), *_seconds(floor("dock")))
    )
    yield Figure("dock.entries", title, "time", "s", reads, floor_reads, _GOAL)
    title = f"{_CHANGES:,} window changes"
    yield Figure("dock.changes", title, "time", "s", changes, floor_changes, _GOAL)


def _seconds(program: Program) -> tuple[float, float]:
    """Until all entries are read, and for the changes after that."""
    with Testbed(entries=_ENTRIES) as testbed, testbed.start(program) as process:
        (read,) = testbed.desktop.wait_for("entries", _SECONDS)
        begin, end, *_ = _change(testbed, process, _CHANGES)
    return (read - process.began) / 1e9, (end - begin) / 1e9


def _change(testbed: Testbed, process: Process, count: int) -> list[int]:
    """Change windows once the agent is calm; before, it may still read the entries."""
    process.await_calm()
    testbed.desktop.send(f"windows {count} {_WINDOW}")
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
