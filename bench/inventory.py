"""What an inventory costs when the daemon's file holds many records of which the launcher lists a few.

Runs inside the simulated terminal, with the real package tools: ./dev bench inventory. Each record costs one
run of dpkg-query, whether an item matches it or not; the time is set against as many bare runs of it.
"""

from __future__ import annotations

import argparse
import re
import subprocess
import sys
import time
from dataclasses import dataclass
from pathlib import Path

from rich.console import Console

from sandbox import layout
from sandbox.clock import RealTime
from sandbox.packages import desktop_file
from sandbox.peers.launcher import LauncherItem
from sandbox.terminal import Terminal

_ITEMS = 5
_FLOOR_RUNS = 300
_SECONDS_PER_RECORD = 0.5
_MOST_TIMES_THE_FLOOR = 3.0


@dataclass(frozen=True)
class Figures:
    """One inventory: its records, how long the agent was busy with it, its memory in KiB after it."""

    records: int
    seconds: float
    resident: int

    @property
    def milliseconds_each(self) -> float:
        """Time per record, that of the launcher's items included."""
        return self.seconds * 1000 / self.records


def bare_run() -> float:
    """Milliseconds of one run of dpkg-query, started in the cheapest way, on the same database."""
    argv = ["/usr/bin/dpkg-query", "-W", "-f='${Version}'", name(0)]
    start = time.monotonic()
    for _ in range(_FLOOR_RUNS):
        subprocess.run(argv, stdin=subprocess.DEVNULL, capture_output=True, check=True)
    return (time.monotonic() - start) * 1000 / _FLOOR_RUNS


def name(number: int) -> str:
    """Name of an installed package."""
    return f"package-{number}"


def measure(terminal: Terminal, records: int) -> Figures:
    """Let the agent report an inventory with so many records in the daemon's file."""
    known = [
        {"package_name": name(number), "name": "n", "id": number, "architecture": "a", "installed_type": 1}
        for number in range(records)
    ]
    terminal.files.write_software_list(layout.SOFTWARE_LIST, known)
    mark = terminal.events.mark()
    start = time.monotonic()
    terminal.launcher.announce("deleted", terminal.launcher.items[0])
    terminal.events.wait_for(
        member="onUploadFinished", after=mark, timeout=60 + records * _SECONDS_PER_RECORD
    )
    seconds = time.monotonic() - start
    terminal.sync()
    return Figures(records, seconds, _resident(terminal))


def _resident(terminal: Terminal) -> int:
    status = Path(f"/proc/{terminal.agent.pid}/status").read_text()
    return int(re.findall(r"VmRSS:\s*(\d+) kB", status)[0])


def main() -> int:
    """Entry point; the status is 0 if no record cost much more than a bare run of the tool."""
    parser = argparse.ArgumentParser(prog="./dev bench inventory", description=__doc__)
    parser.add_argument("--records", type=int, default=100_000, help="length of the longest file")
    longest = parser.parse_args().records

    console = Console()
    with Terminal(clock=RealTime()) as terminal:
        for number in range(_ITEMS):
            terminal.packages.install(name(number), "1")
            terminal.launcher.items.append(LauncherItem(desktop_file(name(number)), name(number)))
        terminal.start_agent()
        floor = bare_run()
        console.print(f"a bare run of dpkg-query: {floor:.2f} ms")
        for records in _lengths(longest):
            done = measure(terminal, records)
            ratio = done.milliseconds_each / floor
            console.print(
                f"{done.records:,} records: {done.seconds:.1f} s, {done.milliseconds_each:.2f} ms each, "
                f"{ratio:.1f} times a bare run; {done.resident:,} KiB resident",
                highlight=False,
            )
    cheap = ratio <= _MOST_TIMES_THE_FLOOR
    console.print("as cheap as its lookups" if cheap else "more than three bare runs for each record")
    return 0 if cheap else 1


def _lengths(longest: int) -> list[int]:
    return [length for length in (100, 1_000, 10_000) if length < longest] + [longest]


if __name__ == "__main__":
    sys.exit(main())
