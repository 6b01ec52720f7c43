"""What the kernel knows of a running process."""

from __future__ import annotations

import os
from pathlib import Path

_TICKS = os.sysconf("SC_CLK_TCK")
# Places in a process's stat after its name: the time of its ended children, in user mode and in the kernel.
_CHILDREN = slice(13, 15)


class Running:
    """A process by its id."""

    def __init__(self, pid: int) -> None:
        self.pid = pid

    def memory(self, name: str) -> float:
        """A line of the kernel's sum over all of the process's memory, in KiB: "Rss", "Private_Dirty"..."""
        return float(_field(self._file("smaps_rollup"), name))

    def status(self, name: str) -> float:
        """A line of the process's status in KiB: "VmStk", "VmHWM"..."""
        return float(_field(self._file("status"), name))

    def voluntary_switches(self) -> int:
        """How often its threads have gone to sleep so far."""
        return sum(_field(task / "status", "voluntary_ctxt_switches") for task in self._tasks())

    def cpu_nanoseconds(self) -> int:
        """How long its threads have run so far."""
        return sum(int((task / "schedstat").read_text().split()[0]) for task in self._tasks())

    def children_seconds(self) -> float:
        """How long its children have run that have ended."""
        after_name = self._file("stat").read_text().rpartition(")")[2].split()
        return sum(int(word) for word in after_name[_CHILDREN]) / _TICKS

    def threads(self) -> int:
        """How many threads it has now."""
        return len(self._tasks())

    def _tasks(self) -> list[Path]:
        return list(self._file("task").iterdir())

    def _file(self, name: str) -> Path:
        return Path(f"/proc/{self.pid}", name)


def _field(path: Path, name: str) -> int:
    for line in path.read_text().splitlines():
        if line.startswith(f"{name}:"):
            return int(line.split()[1])
    raise AssertionError(f"no {name} in {path}")
