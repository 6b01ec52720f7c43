"""Instruction counts, which do not depend on the machine's other load."""

from __future__ import annotations

import re
import tempfile
import time
from pathlib import Path
from typing import Callable, Mapping

from bench.programs import Process, Program

_SECONDS = 120.0
_TOTALS = re.compile(r"^totals: (\d+)", re.MULTILINE)


def of_start(program: Program) -> float:
    """A program's instructions from exec to the end of its start, in all threads but no child processes."""
    with tempfile.TemporaryDirectory() as folder:
        out = Path(folder, "out")
        with Process(_argv(out, program, program.start_ends)):
            return _total(out.with_name("out.1"))


def of_work(
    program: Program, work: Callable[[Process], object], env: Mapping[str, str] | None = None
) -> float:
    """A program's instructions from exec until `work` returns and the program ends."""
    with tempfile.TemporaryDirectory() as folder:
        out = Path(folder, "out")
        with Process(_argv(out, program), env) as process:
            work(process)
        return _total(out)


def _argv(out: Path, program: Program, *options: str) -> list[str]:
    return ["valgrind", "--tool=callgrind", f"--callgrind-out-file={out}", *options, *program.argv]


def _total(path: Path) -> float:
    end = time.monotonic() + _SECONDS
    while time.monotonic() < end:
        found = _TOTALS.search(path.read_text()) if path.exists() else None
        if found:
            return float(found[1])
        time.sleep(0.05)
    raise AssertionError("callgrind did not reach the end of the start")
