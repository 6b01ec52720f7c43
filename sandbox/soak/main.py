"""Command line of the soak."""

from __future__ import annotations

import argparse
from typing import Sequence

from sandbox.box import host
from sandbox.machine import layout
from sandbox.machine.users import DOMAIN_USER, LOCAL_USER

_HOURS = 24
_ALLOWANCE = 512


def run(arguments: Sequence[str]) -> int:
    """Live through a day in a box, or replay a history; the exit status is 0 if nothing was lost or grew."""
    options = _parser().parse_args(arguments)
    if layout.inside_box():
        from sandbox.soak import soak  # needs D-Bus, which only the box must have

        return soak.soak(options)
    return host.enter(LOCAL_USER if options.local else DOMAIN_USER, ["soak", *arguments])


def _parser() -> argparse.ArgumentParser:
    parser = argparse.ArgumentParser(
        prog="./dev soak",
        description="A day of a terminal, sped up: what was sent is counted against what arrived, and the "
        "agent's memory, descriptors and threads are looked at each hour. If something is lost, the shortest "
        "history that fails is looked for, and the command printed that replays it.",
    )
    parser.add_argument(
        "--hours",
        type=host.positive,
        default=_HOURS,
        metavar="N",
        help=f"hours of agent time after one of warming up (default: {_HOURS})",
    )
    parser.add_argument(
        "--seed", type=int, default=1, metavar="N", help="another day, the same each time (default: 1)"
    )
    parser.add_argument(
        "--local", action="store_true", help="the day of a local user, whom the platform does not know"
    )
    parser.add_argument(
        "--replay",
        metavar="HISTORY",
        help="instead of a day the history that a failed one was shortened to",
    )
    parser.add_argument(
        "--allowance",
        type=int,
        default=_ALLOWANCE,
        metavar="KIB",
        help=f"memory that the agent may gain after warming up (default: {_ALLOWANCE})",
    )
    return parser
