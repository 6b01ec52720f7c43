"""Command line of the tour."""

from __future__ import annotations

import argparse
from pathlib import Path
from typing import Sequence

from sandbox.box import outside
from sandbox.demo.picture import PictureFile
from sandbox.machine import layout
from sandbox.machine.users import DOMAIN_USER

_DEFAULT_SPEED = 30
_DEFAULT_PATIENCE = 20.0


def run(arguments: Sequence[str]) -> int:
    """Play the tour, in a box; the exit status is 0 only if everything came as expected."""
    options = _parser().parse_args(arguments)
    if layout.inside_box():
        from sandbox.demo import play  # needs D-Bus, which only the box must have

        return play.play(options)
    picture = PictureFile(options.svg) if options.svg else None
    status = outside.enter(DOMAIN_USER, ["demo", *arguments], picture.receive if picture else None)
    if picture and status == 0:
        picture.keep()
    return status


def _parser() -> argparse.ArgumentParser:
    parser = argparse.ArgumentParser(
        prog="./dev demo", description="A guided tour: the agent does its main job in a simulated terminal."
    )
    parser.add_argument(
        "--speed",
        type=outside.positive,
        default=_DEFAULT_SPEED,
        metavar="N",
        help=f"how many times as fast the agent's time runs (default: {_DEFAULT_SPEED})",
    )
    parser.add_argument(
        "--only", type=_numbers, metavar="N[,N...]", help="play the start and these scenes alone"
    )
    parser.add_argument("--log", action="store_true", help="show the agent's own log lines too")
    parser.add_argument(
        "--table", action="store_true", help="end with what was expected and seen, one by one"
    )
    parser.add_argument(
        "--svg", type=Path, metavar="FILE", help="draw the timeline of the chosen scenes into this file too"
    )
    parser.add_argument(
        "--patience",
        type=float,
        default=_DEFAULT_PATIENCE,
        metavar="SECONDS",
        help=f"how late, in real time, something may come (default: {_DEFAULT_PATIENCE:.0f})",
    )
    return parser


def _numbers(text: str) -> set[int]:
    return {outside.positive(number) for number in text.split(",")}
