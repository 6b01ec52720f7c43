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
    """The options that dev.d/help/soak.txt explains."""
    parser = argparse.ArgumentParser(prog="./dev soak")
    parser.add_argument("--hours", type=host.positive, default=_HOURS)
    parser.add_argument("--seed", type=int, default=1)
    parser.add_argument("--local", action="store_true")
    parser.add_argument("--replay")
    parser.add_argument("--allowance", type=int, default=_ALLOWANCE)
    return parser
