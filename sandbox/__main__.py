"""The entry point: `run` enters a box, `init` is the box's first process; users start `demo`, `box` and
`soak`."""

from __future__ import annotations

import argparse
import os
import signal
import sys

from sandbox.box import bubblewrap
from sandbox.ending import CannotRun
from sandbox.machine.users import USERS

_NO_BOX = 125
_INTERRUPTED = 130


def _parser() -> argparse.ArgumentParser:
    parser = argparse.ArgumentParser(prog="in-box", description="Run a command in a simulated terminal.")
    parser.add_argument(
        "--user", choices=sorted(USERS), default="domain", help="kind of user (default: domain)"
    )
    parser.add_argument("--env", action="append", default=[], metavar="NAME", help="pass this variable on")
    parser.add_argument("command", nargs="+", metavar="COMMAND")
    return parser


def _enter(arguments: list[str]) -> None:
    options = _parser().parse_args(arguments)
    env = {name: os.environ[name] for name in options.env if name in os.environ}
    try:
        bubblewrap.require()
    except CannotRun as error:
        print(f"in-box: {error}", file=sys.stderr)
        sys.exit(_NO_BOX)
    argv = bubblewrap.command(USERS[options.user], options.command, env)
    os.execvp(argv[0], argv)


def _run_for_user(verb: str, arguments: list[str]) -> int:
    from sandbox.demo import main as demo
    from sandbox.prompt import main as prompt
    from sandbox.soak import main as soak

    # host.enter makes the box ignore Ctrl+C, and its programs inherit that.
    signal.signal(signal.SIGINT, signal.default_int_handler)
    try:
        return {"demo": demo.run, "box": prompt.run, "soak": soak.run}[verb](arguments)
    except CannotRun as error:
        print(f"{verb}: {error}", file=sys.stderr)
        return 1
    except KeyboardInterrupt:
        return _INTERRUPTED


def main() -> int:
    """Entry point."""
    verb, *arguments = sys.argv[1:] or ["run"]
    if verb == "init":
        from sandbox.box import init  # needs D-Bus, which the host may lack

        return init.run(arguments[1:])
    if verb in ("demo", "box", "soak"):
        return _run_for_user(verb, arguments)
    _enter(arguments)
    return 0


if __name__ == "__main__":
    sys.exit(main())
