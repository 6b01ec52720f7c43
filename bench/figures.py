"""What was measured: values of the agent beside those of a floor, and what they are to reach."""

from __future__ import annotations

import json
from dataclasses import asdict, dataclass, field
from pathlib import Path
from statistics import median
from typing import Any, Literal, Sequence

Kind = Literal["time", "rate", "instructions", "memory", "count"]


@dataclass(frozen=True)
class Goal:
    """What a figure is to reach: at most or at least so much, as a multiple of the floor, as a value, or as
    what it is above the floor."""

    bound: Literal["at most", "at least"]
    limit: float
    of: Literal["floor", "value", "above floor"] = "floor"

    def is_met(self, figure: Figure) -> bool:
        """Whether the figure keeps to the bound."""
        reached = self._reached(figure)
        if reached is None:
            return False
        return reached <= self.limit if self.bound == "at most" else reached >= self.limit

    def text(self, unit: str) -> str:
        """For a table."""
        sign = "≤" if self.bound == "at most" else "≥"
        if self.of == "floor":
            return f"{sign} {self.limit:g} ×"
        above = "floor + " if self.of == "above floor" else ""
        return f"{sign} {above}{number(self.limit)} {unit}".rstrip()

    def _reached(self, figure: Figure) -> float | None:
        if self.of == "floor":
            return figure.ratio
        if self.of == "value":
            return figure.middle
        return None if figure.floor_middle is None else figure.middle - figure.floor_middle


@dataclass(frozen=True)
class Figure:
    """One figure: the agent's values, one of each run, and the floor's of the same runs, which may be none.

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
    def middle(self) -> float:
        """The agent's median."""
        return median(self.values)

    @property
    def floor_middle(self) -> float | None:
        """The floor's median."""
        return median(self.floor) if self.floor else None

    @property
    def ratio(self) -> float | None:
        """How many times the floor; two nothings are equal."""
        floor = self.floor_middle
        if floor is None:
            return None
        if floor == 0:
            return 1.0 if self.middle == 0 else float("inf")
        return self.middle / floor

    @property
    def is_met(self) -> bool | None:
        """Whether the goal is reached; None where there is none."""
        return self.goal.is_met(self) if self.goal else None


@dataclass(frozen=True)
class Report:
    """The figures of one bench, and the circumstances."""

    circumstances: dict[str, Any]
    figures: list[Figure] = field(default_factory=list)

    def save(self, path: Path) -> None:
        """Write it as JSON."""
        path.parent.mkdir(parents=True, exist_ok=True)
        path.write_text(json.dumps(asdict(self), ensure_ascii=False, indent=1) + "\n")


def load(path: Path) -> Report:
    """Read what `save` wrote."""
    known = json.loads(path.read_text())
    return Report(known["circumstances"], [figure_of(figure) for figure in known["figures"]])


def figure_of(known: dict[str, Any]) -> Figure:
    """A figure from its JSON form."""
    goal = known.get("goal")
    fields: dict[str, Any] = {**known, "goal": Goal(**goal) if goal else None}
    return Figure(**fields)


def spread(values: Sequence[float]) -> float:
    """How far the values lie apart, relative to their median."""
    middle = median(values)
    return (max(values) - min(values)) / abs(middle) if middle else 0.0


def number(value: float) -> str:
    """A number as people read it: three digits that count, thousands apart."""
    if value == int(value) or abs(value) >= 100:
        return f"{value:,.0f}"
    return f"{value:.3g}"
