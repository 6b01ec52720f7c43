"""The uncertainty of a median, and when it is measured often enough."""

from __future__ import annotations

from math import sqrt
from statistics import median, quantiles
from typing import Sequence

# A median with an uncertainty up to the first share of itself is stable; one with more than the second share
# is not written to the docs.
STABLE, WORST_WRITTEN = 0.05, 0.10
# The maximum number of runs of a figure, as a multiple of the minimum.
MOST_RUNS = 3
# The half width of a box plot's notch, which holds the median of all possible runs in 95 of 100 cases.
_NOTCH = 1.57


def uncertainty(values: Sequence[float]) -> float:
    """How far the true median may lie from that of the values, relative to it; 0 for a single value.

    It is 1.57 times the interquartile range, divided by the square root of the number of values (McGill,
    Tukey, Larsen 1978).
    """
    middle = median(values)
    if len(values) < 2 or middle == 0:
        return 0.0
    lower, _, upper = quantiles(values, n=4, method="inclusive")
    return _NOTCH * (upper - lower) / sqrt(len(values)) / abs(middle)


def is_stable(values: Sequence[float]) -> bool:
    """Whether enough runs are made."""
    return uncertainty(values) <= STABLE
