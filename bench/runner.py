"""Runs each group of figures in its own box."""

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
from bench.noise import Noise
from sandbox import REPOSITORY

_IN_BOX = REPOSITORY / "sandbox" / "in-box"

# The users in whose boxes each group is measured.
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
    "day": ("local", "domain"),
    "neighbours": ("local",),
}
# What is measured only if it is asked for: it needs packages that nothing else does.
ON_DEMAND = ("neighbours",)


class Failure(Exception):
    """A group could not be measured; the message names it."""


@dataclass(frozen=True)
class Options:
    """The groups to measure, and how often."""

    groups: Sequence[str]
    runs: int
    quick: bool
    records: int

    @property
    def boxes(self) -> list[tuple[str, str]]:
        """The groups, each with the user whose box it is measured in."""
        return [(group, user) for group in self.groups for user in GROUPS[group]]


def measure(
    options: Options, group: str, user: str, show_step: Callable[[str], None]
) -> tuple[list[Figure], Noise]:
    """The figures of a group; `show_step` is called with each step."""
    figures: list[Figure] = []
    noise = Noise()
    argv = [
        *(str(_IN_BOX), "--user", user, "--", "/usr/bin/python3", "-P", "-m", "bench.inside", group),
        *("--runs", str(options.runs), "--records", str(options.records)),
        *(["--quick"] if options.quick else []),
    ]
    with subprocess.Popen(argv, stdout=subprocess.PIPE, text=True) as box:
        assert box.stdout
        for known in _objects(box.stdout):
            if "step" in known:
                show_step(known["step"])
            elif "noise" in known:
                noise = Noise(**known["noise"])
            else:
                figures.append(figure_of(known["figure"]))
    if box.returncode:
        raise Failure(f"{group}, {user} user: exit status {box.returncode}")
    return figures, noise


def circumstances(noise: Noise) -> dict[str, Any]:
    """The state of the machine and its other load, for readers of the figures."""
    return {
        "date": datetime.now(timezone.utc).isoformat(timespec="minutes"),
        **noise.shares(),
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
