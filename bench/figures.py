"""The figures: the agent's values, those of a floor, and the goals."""

from __future__ import annotations

import json
from dataclasses import asdict, dataclass, field
from pathlib import Path
from statistics import median
from typing import Any, Literal, Sequence

from bench.stability import uncertainty

Kind = Literal["time", "rate", "instructions", "memory", "count"]


@dataclass(frozen=True)
class Goal:
    """The bound of a figure: a limit for its multiple of the floor, its value, or its difference from the
    floor. `otherwise` says why it may be missed and what would reach it."""

    bound: Literal["at most", "at least"]
    limit: float
    of: Literal["floor", "value", "above floor"] = "floor"
    otherwise: str = ""

    def is_met(self, figure: Figure) -> bool:
        """Whether the figure keeps to the bound."""
        reached = self._reached(figure)
        if reached is None:
            return False
        return reached <= self.limit if self.bound == "at most" else reached >= self.limit

    def text(self, unit: str) -> str:
        """The goal as text for a table."""
        sign = "≤" if self.bound == "at most" else "≥"
        if self.of == "floor":
            return f"{sign} {self.limit:.4g} ×"
        above = "+" if self.of == "above floor" else ""
        return f"{sign} {above}{number(self.limit)} {unit}".rstrip()

    def _reached(self, figure: Figure) -> float | None:
        if self.of == "floor":
            return figure.ratio
        if self.of == "value":
            return figure.middle
        return None if figure.floor_middle is None else figure.middle - figure.floor_middle


@dataclass(frozen=True)
class Figure:
    """One figure: the agent's values, one per run, and the floor's values of the same runs, if there is a
    floor.

    `name` is "group.figure" and stays the same from run to run. `series` and `x` place the figure in a plot:
    figures of one series differ in x alone.
    """

    name: str
    title: str
    kind: Kind
    unit: str
    values: Sequence[float]
    floor: Sequence[float] = ()
    goal: Goal | None = None
    series: str = ""
    x: float = 0

    @property
    def group(self) -> str:
        """The group's name."""
        return self.name.partition(".")[0]

    @property
    def middle(self) -> float:
        """The agent's median."""
        return median(self.values)

    @property
    def floor_middle(self) -> float | None:
        """The floor's median."""
        return median(self.floor) if self.floor else None

    @property
    def ratio(self) -> float | None:
        """The figure as a multiple of the floor; 1 if both are 0."""
        floor = self.floor_middle
        if floor is None:
            return None
        if floor == 0:
            return 1.0 if self.middle == 0 else float("inf")
        return self.middle / floor

    @property
    def uncertainty(self) -> float:
        """The uncertainty of the agent's or the floor's median, whichever is larger."""
        return max(uncertainty(values) for values in (self.values, self.floor) if values)

    @property
    def is_met(self) -> bool | None:
        """Whether the goal is reached; None without a goal."""
        return self.goal.is_met(self) if self.goal else None


@dataclass(frozen=True)
class Report:
    """The figures of a run of the bench, and the circumstances of each group."""

    circumstances: dict[str, Any]
    figures: list[Figure] = field(default_factory=list)

    def group(self, name: str) -> list[Figure]:
        """The figures of one group."""
        return [figure for figure in self.figures if figure.group == name]

    def save(self, path: Path) -> None:
        """Write the report as JSON."""
        path.parent.mkdir(parents=True, exist_ok=True)
        path.write_text(json.dumps(asdict(self), ensure_ascii=False, indent=1) + "\n")


def load(path: Path) -> Report:
    """Read what `save` wrote."""
    known = json.loads(path.read_text())
    if not all("others" in group for group in known["circumstances"].values()):
        raise ValueError("it is of an older form")
    return Report(known["circumstances"], [figure_of(figure) for figure in known["figures"]])


def figure_of(known: dict[str, Any]) -> Figure:
    """A figure from its JSON form."""
    goal = known.get("goal")
    fields: dict[str, Any] = {**known, "goal": Goal(**goal) if goal else None}
    return Figure(**fields)


def number(value: float) -> str:
    """A number with three significant digits and separated thousands."""
    if value == int(value) or abs(value) >= 100:
        return f"{value:,.0f}"
    return f"{value:.3g}"
