"""The terminal leaves the domain."""

from __future__ import annotations

from configparser import ConfigParser
from pathlib import Path

from sandbox.demo.scene import NO_LOGOUT, NOT_REALLY, REBOOT, Expectation, Scene, Step, from_agent, notice
from sandbox.policies import POLICIES
from sandbox.terminal import Terminal

_SWITCHES_FILE = Path(".config/norix/desktop-control.ini")
# Reads its standard input: if the agent left it open, the script would hang and delay the reboot.
_RESTORE_SCRIPT = """#!/bin/bash
read -r line && exec restore_config "read: $line"
exec restore_config "(standard input is at its end)"
"""


def _remove_from_domain(terminal: Terminal) -> None:
    terminal.files.write_restore_script(_RESTORE_SCRIPT)
    terminal.daemon.push_policy({"type": 1200})


def _look_at_switches(terminal: Terminal) -> None:
    """Record each restriction switch of the desktop in the user's file as an event of kind "file"."""
    parser = ConfigParser(interpolation=None)
    parser.optionxform = str  # type: ignore[assignment]  # keys are case-sensitive
    parser.read(Path(terminal.user.home, _SWITCHES_FILE), encoding="utf-8")
    for name, value in parser["restrictions"].items() if parser.has_section("restrictions") else ():
        terminal.events.record("velks", "switches", "file", name, (value,))


def _switch(name: str, value: str) -> Expectation:
    return from_agent(f"switch {name} is {value}", "switches", name, value)


_UNDONE = (
    notice(POLICIES[1200].notice, "_open", "重启"),
    from_agent(
        "the restore script runs, with nothing to read",
        "restore_config",
        "restore_config",
        "(standard input is at its end)",
    ),
    from_agent("the policy service is stopped", "systemctl", "systemctl", "--global", "stop", "prys"),
    from_agent("the report to the daemon", "daemon", "onDomainConfig", "remove"),
    from_agent("the identity service is off", "identity", "Set", ..., "Enable", False),
)

_SWITCHES = (
    _switch("ControlCenterList", "network, display, sound"),
    _switch("LauncherDisplayable", "true"),
    _switch("ShortcutKeyEnable", "true"),
    _switch("HotspotEnable", "1"),
)

DOMAIN_EXIT = Scene(
    "The terminal leaves the domain",
    "The agent warns, undoes everything that the domain had changed, and reboots after a minute.",
    # The reboot comes last: the timeline ends with it.
    (
        Step(_remove_from_domain, _UNDONE),
        Step(_look_at_switches, _SWITCHES),
        Step(None, (REBOOT, NO_LOGOUT)),
    ),
    f"The desktop's switches are in the user's file ~/{_SWITCHES_FILE}. {NOT_REALLY}",
)
