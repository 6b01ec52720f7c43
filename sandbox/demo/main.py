"""Command line of the tour."""

from __future__ import annotations

import argparse
from pathlib import Path
from typing import Sequence

from sandbox.box import host
from sandbox.machine import layout
from sandbox.machine.users import DOMAIN_USER

_DEFAULT_SPEED = 30
_DEFAULT_PATIENCE = 20.0


def run(arguments: Sequence[str]) -> int:
    """Play the tour in a box; the exit status is 0 only if everything was as expected."""
    options = _parser().parse_args(arguments)
    if layout.inside_box():
        from sandbox.demo import play  # needs D-Bus, which the host may lack

        return play.play(options)
    drawn: list[bytes] = []
    receive = (lambda stream: drawn.append(stream.read())) if options.svg else None
    status = host.enter(DOMAIN_USER, ["demo", *arguments], receive)
    if status == 0 and any(drawn):
        options.svg.write_bytes(*drawn)
    return status


def _parser() -> argparse.ArgumentParser:
    """The options that dev.d/help/demo.txt explains."""
    parser = argparse.ArgumentParser(prog="./dev demo")
    parser.add_argument("--speed", type=host.positive, default=_DEFAULT_SPEED)
    parser.add_argument("--only", type=_numbers)
    parser.add_argument("--log", action="store_true")
    parser.add_argument("--table", action="store_true")
    parser.add_argument("--svg", type=Path)
    parser.add_argument("--patience", type=float, default=_DEFAULT_PATIENCE)
    return parser


def _numbers(text: str) -> set[int]:
    return {host.positive(number) for number in text.split(",")}
