"""What a process holds of the machine, and whether it grows."""

from __future__ import annotations

import os
import re
from dataclasses import dataclass
from pathlib import Path
from typing import Sequence


@dataclass(frozen=True)
class Usage:
    """Resident and private dirty memory in KiB, open descriptors, threads."""

    resident: int
    private_dirty: int
    descriptors: int
    threads: int


def usage(pid: int) -> Usage:
    """Those of a process now."""
    process = Path(f"/proc/{pid}")
    memory = (process / "smaps_rollup").read_text()
    return Usage(
        _kibibytes("Rss", memory),
        _kibibytes("Private_Dirty", memory),
        len(os.listdir(process / "fd")),
        len(os.listdir(process / "task")),
    )


def growth(samples: Sequence[Usage], allowance: int) -> list[str]:
    """In what a process has grown since the first sample, a line each: memory by more than `allowance` KiB at
    the end, descriptors and threads at any time."""
    first, last = samples[0], samples[-1]
    most_descriptors = max(sample.descriptors for sample in samples)
    most_threads = max(sample.threads for sample in samples)
    grown = []
    for what, before, after in (
        ("resident memory", first.resident, last.resident),
        ("private dirty memory", first.private_dirty, last.private_dirty),
    ):
        if after - before > allowance:
            grown.append(f"{what} grew from {before:,} to {after:,} KiB; {allowance:,} KiB are allowed")
    if most_descriptors > first.descriptors:
        grown.append(f"open descriptors grew from {first.descriptors} to {most_descriptors}")
    if most_threads > first.threads:
        grown.append(f"threads grew from {first.threads} to {most_threads}")
    return grown


def _kibibytes(name: str, memory: str) -> int:
    return int(re.findall(rf"^{name}:\s*(\d+) kB", memory, re.MULTILINE)[0])
