"""How thoroughly to measure."""

from __future__ import annotations

from dataclasses import dataclass
from typing import Callable

from bench.programs import Program


@dataclass(frozen=True)
class Plan:
    """The runs of each figure, whether only what CI judges is wanted, and the length of the inventory file;
    `tell` shows what is being measured."""

    runs: int
    quick: bool
    records: int
    tell: Callable[[str], None]

    def times(self) -> range:
        """The runs to make of a figure whose values differ from run to run."""
        return range(self.runs)

    def pairs(
        self, what: str, agent: Program, floor: Program, one: Callable[[Program], float]
    ) -> tuple[list[float], list[float]]:
        """Values of the agent and of the floor, measured in turn, so that both see the same machine."""
        values: list[float] = []
        floors: list[float] = []
        for run in self.times():
            self.tell(f"{what}, run {run + 1} of {self.runs}")
            values.append(one(agent))
            floors.append(one(floor))
        return values, floors
