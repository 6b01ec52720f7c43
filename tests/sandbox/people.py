"""Runs the programs for people as they are run inside a box."""

from __future__ import annotations

import os
import subprocess
from pathlib import Path


def run_program(
    *arguments: str, script: str = "", agent: Path | None = None
) -> subprocess.CompletedProcess[str]:
    """Run `demo` or `box` to its end, with another agent if one is given."""
    env = {**os.environ, **({"VELK_AGENT": str(agent)} if agent else {})}
    command = ["/usr/bin/python3", "-P", "-m", "sandbox", *arguments]
    return subprocess.run(command, env=env, input=script, capture_output=True, text=True)


def idle_agent(folder: Path) -> Path:
    """An agent that does nothing."""
    program = folder / "idle"
    program.write_text("#!/bin/sh\nexec sleep infinity\n")
    program.chmod(0o755)
    return program
