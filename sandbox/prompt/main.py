"""The command line of the terminal with a prompt."""

from __future__ import annotations

import argparse
import os
import sys
from pathlib import Path
from typing import Sequence

from sandbox.box import host
from sandbox.box.host import Consumer
from sandbox.ending import CannotRun
from sandbox.machine import layout
from sandbox.machine.users import DOMAIN_USER, LOCAL_USER


def run(arguments: Sequence[str]) -> int:
    """Open a terminal in a box and run commands; returns the exit status."""
    options = _parser().parse_args(arguments)
    if layout.inside_box():
        from sandbox.prompt import session  # needs D-Bus, which the host may lack

        return session.run(options)
    user = LOCAL_USER if options.local else DOMAIN_USER
    relay = desktop_relay() if options.mirror else None
    return host.enter(user, ["box", *arguments], relay, history())


def _parser() -> argparse.ArgumentParser:
    """The options that dev.d/help/box.txt explains."""
    parser = argparse.ArgumentParser(prog="./dev box")
    parser.add_argument("--local", action="store_true")
    parser.add_argument("--speed", type=host.positive, default=1)
    parser.add_argument("--log", action="store_true")
    parser.add_argument("--mirror", action="store_true")
    return parser


def history() -> dict[Path, Path]:
    """The user's history file and its place in the box; none if it cannot be written or the input is a
    script."""
    state = Path(os.environ.get("XDG_STATE_HOME") or Path.home() / ".local" / "state")
    kept = state / "velks" / "box-history"
    try:
        kept.parent.mkdir(parents=True, exist_ok=True)
        kept.touch()
    except OSError:
        return {}
    return {layout.HISTORY: kept} if sys.stdin.isatty() else {}


def desktop_relay() -> Consumer | None:
    """Shows notifications on the host's desktop; if that is impossible, prints the reason and returns
    None."""
    from sandbox.prompt.host_desktop import HostDesktop  # only this option needs D-Bus on the host

    try:
        return HostDesktop().relay
    except CannotRun as error:
        print(f"box: {error}; the box goes on without your desktop", file=sys.stderr)
        return None
