"""Command line of the terminal with a prompt."""

from __future__ import annotations

import argparse
import os
import sys
from pathlib import Path
from typing import Sequence

from sandbox.box import outside
from sandbox.box.outside import Consumer, Trouble
from sandbox.machine import layout
from sandbox.machine.users import DOMAIN_USER, LOCAL_USER


def run(arguments: Sequence[str]) -> int:
    """Open a terminal, in a box, and take commands for it; the result is the exit status."""
    options = _parser().parse_args(arguments)
    if layout.inside_box():
        from sandbox.prompt import session  # needs D-Bus, which only the box must have

        return session.run(options)
    user = LOCAL_USER if options.local else DOMAIN_USER
    relay = desktop_relay() if options.mirror else None
    return outside.enter(user, ["box", *arguments], relay, _history())


def _parser() -> argparse.ArgumentParser:
    parser = argparse.ArgumentParser(
        prog="./dev box", description="The simulated terminal with a prompt; commands may also be piped in."
    )
    parser.add_argument("--local", action="store_true", help="a local user instead of a domain user")
    parser.add_argument(
        "--speed", type=outside.positive, default=1, metavar="N", help="the agent's time runs N times as fast"
    )
    parser.add_argument("--log", action="store_true", help="show the agent's own log lines from the start")
    parser.add_argument(
        "--mirror", action="store_true", help="show each notification on your own desktop as well"
    )
    return parser


def _history() -> dict[Path, Path]:
    """Where the box shows the file that keeps what was typed; nowhere if there is none or nobody types."""
    state = Path(os.environ.get("XDG_STATE_HOME") or Path.home() / ".local" / "state")
    kept = state / "velks" / "box-history"
    try:
        kept.parent.mkdir(parents=True, exist_ok=True)
        kept.touch()
    except OSError:
        return {}
    return {layout.HISTORY: kept} if sys.stdin.isatty() else {}


def desktop_relay() -> Consumer | None:
    """What shows notifications on the desktop outside; None, after a line on why, where nothing can."""
    from sandbox.prompt.desktop import Desktop  # needs D-Bus, which only this option must have

    try:
        return Desktop().relay
    except Trouble as trouble:
        print(f"box: {trouble}; the box goes on without your desktop", file=sys.stderr)
        return None
