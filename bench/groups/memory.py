"""Memory after the start, and its growth with polls and policies."""

from __future__ import annotations

from typing import Callable, Iterator

from bench.testbed import ADDRESS, Testbed
from bench.figures import Figure, Goal
from bench.plan import Plan
from bench.programs import Process, Program, agent, floor
from sandbox.machine.clock import ManualClock
from sandbox.machine.users import current_user
from sandbox.periods import SURELY_NEXT_POLL

_MOST_DIRTY = 4096  # KiB
_PAGES = 64  # KiB by which two runs of one program differ
_WARM_POLLS, _POLLS = 500, 1_500
_BETWEEN_POLLS = 0.01  # seconds without work; a clock moved in the middle of a poll would end its request
_PATIENCE = 0.5
_WARM_POLICIES, _POLICIES = 10_000, 100_000
_WINDOW = 64
_LINES = {"Rss": "resident", "Private_Dirty": "private dirty"}


def measure(plan: Plan) -> Iterator[Figure]:
    """Measures the figures of this box's user."""
    yield from _after_start(plan)
    if current_user().is_domain_user and not plan.quick:
        yield from _after_polls(plan)
        yield from _after_policies(plan)


def _after_start(plan: Plan) -> Iterator[Figure]:
    is_domain = current_user().is_domain_user
    who = "domain" if is_domain else "local"
    programs = agent(), floor("drain", ADDRESS) if is_domain else floor("start")
    with Testbed(platform=is_domain) as testbed:
        columns = plan.repeat(
            f"memory of a {who} user's agent",
            lambda: [known for program in programs for known in _memory_after_start(testbed, program)],
        )
    values, floors = columns[: len(_LINES)], columns[len(_LINES) :]
    goals = {"Rss": Goal("at most", 1.25), "Private_Dirty": Goal("at most", _MOST_DIRTY, "value")}
    for (line, title), value, bare in zip(_LINES.items(), values, floors):
        name = f"memory.{who}.{line}"
        yield Figure(name, f"{title} after start, {who} user", "memory", "KiB", value, bare, goals[line])


def _memory_after_start(testbed: Testbed, program: Program) -> list[float]:
    with testbed.start_and_wait(program) as process:
        return [process.memory(line) for line in _LINES]


def _after_polls(plan: Plan) -> Iterator[Figure]:
    with Testbed(platform=True) as testbed:
        clock = ManualClock()

        def poll(process: Process, times: int) -> None:
            for _ in range(times):
                process.await_calm(_BETWEEN_POLLS)
                testbed.move_clock(clock, SURELY_NEXT_POLL)
                # A program that was not calm yet has armed its timer only after the move.
                while testbed.platform.await_line("listed", _PATIENCE) is None:
                    testbed.move_clock(clock, SURELY_NEXT_POLL)

        plan.show_step(f"memory after {_POLLS:,} polls")
        yield from _growth(
            testbed, floor("drain", ADDRESS), "polls", poll, (_WARM_POLLS, _POLLS), clock.environment()
        )


def _after_policies(plan: Plan) -> Iterator[Figure]:
    with Testbed() as testbed:

        def push(_process: Process, times: int) -> None:
            testbed.policies(times, window=_WINDOW)

        plan.show_step(f"memory after {_POLICIES:,} policies")
        yield from _growth(testbed, floor("forwarding"), "policies", push, (_WARM_POLICIES, _POLICIES), {})


def _growth(
    testbed: Testbed,
    bare: Program,
    what: str,
    work: Callable[[Process, int], None],
    counts: tuple[int, int],
    env: dict[str, str],
) -> Iterator[Figure]:
    """The growth of memory from the end of the warm-up to the end of the work."""
    warm, whole = counts
    grown: dict[str, dict[str, float]] = {line: {} for line in _LINES}
    for program in (agent(), bare):
        with testbed.start_and_wait(program, env) as process:
            work(process, warm)
            before = {line: process.memory(line) for line in _LINES}
            work(process, whole - warm)
            for line in _LINES:
                grown[line][program.name] = process.memory(line) - before[line]
    for line, title in _LINES.items():
        yield Figure(
            f"memory.growth.{what}.{line}",
            f"{title}, growth from {warm:,} to {whole:,} {what}",
            "memory",
            "KiB",
            [grown[line]["agent"]],
            [grown[line]["floor"]],
            Goal("at most", _PAGES, "above floor"),
        )
