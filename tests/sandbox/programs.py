"""Runs the programs for people as they are run inside a box."""

from __future__ import annotations

import os
import shlex
import subprocess
from pathlib import Path
from subprocess import PIPE, CompletedProcess
from tempfile import TemporaryFile

import pytest

from sandbox.agent import default_binary
from sandbox.fakes.daemon import INTERFACE as VELKG
from sandbox.fakes.policy_service import PolicyService
from sandbox.machine import layout
from sandbox.terminal import Terminal

PRYS = PolicyService.bus_name

_TALK = f"""
import dbus, ssl
from http.client import HTTPSConnection

def call_daemon(member, *args):
    call = dbus.SystemBus().call_blocking
    call("{VELKG}", "/com/norix/velk/velkg", "{VELKG}", member, "s" * len(args), args)

def call_policy_service(text):
    call = dbus.SessionBus().call_blocking
    call("{PRYS}", "/com/norix/velk/prys", "{PRYS}", "onPolicyMsg", "s", (text,))

def ask(bus, name, member):
    try:
        bus = dbus.SystemBus() if bus == "system" else dbus.SessionBus()
        bus.call_blocking(name, "/", name, member, "", ())
    except dbus.DBusException:
        pass

def ask_platform(method, path, body):
    trust = ssl.create_default_context(cafile="{layout.SERVER_CERTIFICATE}")
    trust.load_cert_chain("{layout.CLIENT_CERTIFICATE}", "{layout.CLIENT_KEY}")
    connection = HTTPSConnection("{layout.PLATFORM_HOST}", {layout.PLATFORM_PORT}, context=trust)
    connection.request(method, path, body.encode() or None)
    connection.getresponse().read()

"""


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


def talking_agent(folder: Path, actions: str) -> Path:
    """An agent that does what is written in Python, with the calls below, and ends."""
    script = folder / "actions.py"
    script.write_text(_TALK + actions + "\n")
    return _program(folder, f"exec /usr/bin/python3 {script}")


def play(terminal: Terminal, folder: Path, actions: str) -> None:
    """Let an agent do this to its end."""
    terminal.agent.binary = talking_agent(folder, actions)
    terminal.start_agent(ready=terminal.agent.wait)
    if terminal.agent.exit_status != 0:
        pytest.fail(terminal.report())


def _program(folder: Path, *lines: str) -> Path:
    program = folder / "agent"
    program.write_text("\n".join(("#!/bin/sh", *lines, "")))
    program.chmod(0o755)
    return program
