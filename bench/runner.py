"""Runs the groups of figures, each in a box of its own."""

from __future__ import annotations

import json
import os
import platform
import subprocess
from dataclasses import dataclass
from datetime import datetime, timezone
from pathlib import Path
from typing import Any, Callable, Iterator, Sequence

from bench.figures import Figure, figure_of
from sandbox import REPOSITORY

_IN_BOX = REPOSITORY / "sandbox" / "in-box"

# In which users' boxes each group is measured.
GROUPS: dict[str, tuple[str, ...]] = {
    "start": ("local", "domain"),
    "memory": ("local", "domain"),
    "idle": ("local", "domain"),
    "forwarding": ("domain",),
    "drain": ("domain",),
    "inventory": ("local",),
    "dock": ("local",),
    "many_agents": ("local",),
    "wire": ("domain",),
}


class Failure(Exception):
    """A group could not be measured; the text says which."""


@dataclass(frozen=True)
class Options:
    """What is measured how often."""

    groups: Sequence[str]
    runs: int
    quick: bool
    records: int

    @property
    def boxes(self) -> list[tuple[str, str]]:
        """Groups with the user whose box they are measured in."""
        return [(group, user) for group in self.groups for user in GROUPS[group]]


def measure(options: Options, group: str, user: str, tell: Callable[[str], None]) -> list[Figure]:
    """The figures of a group; `tell` is called with each step."""
    figures: list[Figure] = []
    argv = [
        *(str(_IN_BOX), "--user", user, "--", "/usr/bin/python3", "-P", "-m", "bench.inside", group),
        *("--runs", str(options.runs), "--records", str(options.records)),
        *(["--quick"] if options.quick else []),
    ]
    with subprocess.Popen(argv, stdout=subprocess.PIPE, text=True) as box:
        assert box.stdout
        for known in _objects(box.stdout):
            if "step" in known:
                tell(known["step"])
            else:
                figures.append(figure_of(known["figure"]))
    if box.returncode:
        raise Failure(f"{group}, {user} user: exit status {box.returncode}")
    return figures


def circumstances(options: Options) -> dict[str, Any]:
    """What a reader of the figures should know of the machine, as it is now."""
    return {
        "date": datetime.now(timezone.utc).isoformat(timespec="minutes"),
        "runs": options.runs,
        "load": os.getloadavg()[0],
        "processors": os.cpu_count(),
        "processor": _processor(),
        "kernel": platform.release(),
    }


def _objects(lines: Iterator[str]) -> Iterator[dict[str, Any]]:
    for line in lines:
        yield json.loads(line)


def _processor() -> str:
    for line in Path("/proc/cpuinfo").read_text().splitlines():
        if line.startswith("model name"):
            return line.split(":", 1)[1].strip()
    return platform.machine()
