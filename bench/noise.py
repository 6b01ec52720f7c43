"""How much of the machine other programs had while a box measured; for the inside of the box."""

from __future__ import annotations

import os
from dataclasses import dataclass
from pathlib import Path

_TICKS = os.sysconf("SC_CLK_TCK")
# Places in the first line of /proc/stat.
_IDLE, _WAITING, _STOLEN, _ALL = 3, 4, 7, 8
# Places in a process's stat after its name: its own time and that of its ended children.
_OWN = slice(11, 15)


@dataclass(frozen=True)
class Processors:
    """Seconds of all processors together: in total, taken by the host, used by all programs, and used by the
    box."""

    total: float
    stolen: float
    used: float
    own: float

    def noise_since(self, before: Processors) -> Noise:
        """The noise between two moments."""
        others = self.used - before.used - (self.own - before.own)
        return Noise(self.total - before.total, max(0.0, others), self.stolen - before.stolen)


@dataclass(frozen=True)
class Noise:
    """Seconds of all processors together, and of them those that other programs used and that the host took
    away."""

    total: float = 0.0
    others: float = 0.0
    stolen: float = 0.0

    def __add__(self, more: Noise) -> Noise:
        return Noise(self.total + more.total, self.others + more.others, self.stolen + more.stolen)

    def shares(self) -> dict[str, float]:
        """Those by other programs and by the host, of all."""
        total = self.total or 1.0
        return {"others": self.others / total, "stolen": self.stolen / total}


def processors(proc: Path = Path("/proc")) -> Processors:
    """The current counts. The box sees its own processes alone, but the processors of the whole machine."""
    line = (proc / "stat").read_text().split("\n", 1)[0]
    spent = [int(word) / _TICKS for word in line.split()[1 : 1 + _ALL]]
    unused = spent[_IDLE] + spent[_WAITING] + spent[_STOLEN]
    own = sum(_seconds(process) for process in proc.glob("[0-9]*"))
    return Processors(sum(spent), spent[_STOLEN], sum(spent) - unused, own)


def _seconds(process: Path) -> float:
    try:
        after_name = (process / "stat").read_text().rpartition(")")[2].split()
    except (FileNotFoundError, ProcessLookupError):  # it has ended meanwhile
        return 0.0
    return sum(int(word) for word in after_name[_OWN]) / _TICKS
