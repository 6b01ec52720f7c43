"""Runs the programs for people as they are run inside a box."""

from __future__ import annotations

import os
import shlex
import subprocess
from pathlib import Path
from subprocess import PIPE, CompletedProcess
from tempfile import TemporaryFile

from sandbox.agent import default_binary
from sandbox.peers.daemon import INTERFACE as VELKG


def run_program(*arguments: str, script: str = "", agent: Path | None = None) -> CompletedProcess[str]:
    """Run `demo` or `box` to its end, with another agent if one is given."""
    env = {**os.environ, **({"VELK_AGENT": str(agent)} if agent else {})}
    command = ["/usr/bin/python3", "-P", "-m", "sandbox", *arguments]
    # A file and no pipe: the terminal's buses outlive the program and keep its standard error open.
    with TemporaryFile("w+") as errors:
        ended = subprocess.run(command, env=env, input=script, stdout=PIPE, stderr=errors, text=True)
        errors.seek(0)
        ended.stderr = errors.read()
    return ended


def idle_agent(folder: Path) -> Path:
    """An agent that does nothing."""
    return _program(folder, "exec sleep infinity")


def rude_agent(folder: Path) -> Path:
    """The real agent, after a call that the daemon does not know."""
    call = f'dbus.SystemBus().call_blocking("{VELKG}", "/com/norix/velk/velkg", "{VELKG}", "greet", "", ())'
    real = shlex.quote(str(default_binary()))
    return _program(folder, f"/usr/bin/python3 -c 'import dbus; {call}' 2>/dev/null", f"exec {real}")


def _program(folder: Path, *lines: str) -> Path:
    program = folder / "agent"
    program.write_text("\n".join(("#!/bin/sh", *lines, "")))
    program.chmod(0o755)
    return program
