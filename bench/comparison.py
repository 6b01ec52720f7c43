"""The changes between two runs of the bench."""

from __future__ import annotations

from dataclasses import dataclass
from typing import Iterable

from bench.figures import Figure, Kind

# Figures of these kinds do not depend on the machine's load: CI judges only them.
STEADY_KINDS: tuple[Kind, ...] = ("instructions", "memory")
TOLERATED_RISE = 0.10


@dataclass(frozen=True)
class Change:
    """A figure before and now; `before` is None for a new one."""

    figure: Figure
    before: Figure | None

    @property
    def factor(self) -> float | None:
        """The figure as a multiple of the earlier one."""
        if self.before is None or self.before.middle == 0:
            return None
        return self.figure.middle / self.before.middle

    @property
    def is_judged(self) -> bool:
        """Whether CI judges the figure."""
        return self.figure.kind in STEADY_KINDS

    @property
    def is_rise(self) -> bool:
        """Whether CI judges the figure and it exceeds the tolerated rise. On a machine with
        other libraries the floor costs more, too: then the ratio says that the agent is not the cause."""
        if self.before is None or not self.is_judged:
            return False
        before, now = self.before, self.figure
        return _has_risen(before.middle, now.middle) and (
            not before.ratio or not now.ratio or _has_risen(before.ratio, now.ratio)
        )


def _has_risen(before: float, now: float) -> bool:
    return now > before * (1 + TOLERATED_RISE)


def changes(now: Iterable[Figure], before: Iterable[Figure]) -> list[Change]:
    """The current figures, each with the earlier figure of the same name."""
    known = {figure.name: figure for figure in before}
    return [Change(figure, known.get(figure.name)) for figure in now]


def missing(now: Iterable[Figure], before: Iterable[Figure]) -> list[str]:
    """The names of the earlier figures that are not among the current ones."""
    measured = {figure.name for figure in now}
    return [figure.name for figure in before if figure.name not in measured]
