"""The thoroughness of the measurements."""

from __future__ import annotations

from dataclasses import dataclass
from typing import Callable, Sequence

from bench.programs import Program
from bench.stability import MOST_RUNS, is_stable

# Counts of instructions are the same in each run, but for what the time of day changes.
_RUNS_OF_COUNTS = 2


@dataclass(frozen=True)
class Plan:
    """The minimum number of runs of each figure, whether only what CI judges is wanted, and the length of the
    inventory file; `show_step` shows what is being measured."""

    runs: int
    quick: bool
    records: int
    show_step: Callable[[str], None]

    def repeat(self, what: str, run: Callable[[], Sequence[float]]) -> list[list[float]]:
        """The values of each place of what `run` returns, run by run until all medians are stable, or have
        not become so in `MOST_RUNS` times as many runs."""
        rows: list[Sequence[float]] = []
        while len(rows) < self.runs or self._goes_on(rows):
            self.show_step(f"{what}, run {len(rows) + 1}")
            rows.append(run())
        return [list(column) for column in zip(*rows)]

    def _goes_on(self, rows: Sequence[Sequence[float]]) -> bool:
        if self.quick or len(rows) >= MOST_RUNS * self.runs:
            return False
        return not all(is_stable(column) for column in zip(*rows))

    def pairs(
        self, what: str, agent: Program, floor: Program, one: Callable[[Program], float]
    ) -> tuple[list[float], list[float]]:
        """Values of the agent and of the floor, measured in turn, so that both see the same machine."""
        values, floors = self.repeat(what, lambda: (one(agent), one(floor)))
        return values, floors

    def counts(
        self, what: str, agent: Program, floor: Program, one: Callable[[Program], float]
    ) -> tuple[list[float], list[float]]:
        """The same for counts of instructions."""
        values: list[float] = []
        floors: list[float] = []
        for run in range(min(self.runs, _RUNS_OF_COUNTS)):
            self.show_step(f"{what}, run {run + 1}")
            values.append(one(agent))
            floors.append(one(floor))
        return values, floors
