"""What changed between two runs of the bench."""

from __future__ import annotations

from dataclasses import dataclass
from typing import Iterable

from bench.figures import Figure, Kind

# What does not depend on how busy the machine is: CI judges these and no others.
STEADY_KINDS: tuple[Kind, ...] = ("instructions", "memory")
TOLERATED_RISE = 0.10


@dataclass(frozen=True)
class Change:
    """A figure before and now; `before` is None for a new one."""

    figure: Figure
    before: Figure | None

    @property
    def factor(self) -> float | None:
        """How many times as much as before."""
        if self.before is None or self.before.middle == 0:
            return None
        return self.figure.middle / self.before.middle

    @property
    def is_judged(self) -> bool:
        """Whether it is a figure that can be judged."""
        return self.figure.kind in STEADY_KINDS

    @property
    def is_rise(self) -> bool:
        """Whether the agent costs more than is tolerated, in a figure that can be judged."""
        if self.before is None or not self.is_judged:
            return False
        return self.figure.middle > self.before.middle * (1 + TOLERATED_RISE)


def changes(now: Iterable[Figure], before: Iterable[Figure]) -> list[Change]:
    """The figures of now, each beside the earlier one of its name."""
    known = {figure.name: figure for figure in before}
    return [Change(figure, known.get(figure.name)) for figure in now]


def missing(now: Iterable[Figure], before: Iterable[Figure]) -> list[str]:
    """Names of earlier figures that are not among those of now."""
    measured = {figure.name for figure in now}
    return [figure.name for figure in before if figure.name not in measured]
