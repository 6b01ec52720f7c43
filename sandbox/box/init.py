"""The first process inside a box: prepares network, files and buses, then runs the command."""

from __future__ import annotations

import signal
import subprocess
import sys
from types import FrameType
from typing import Sequence

from sandbox.bus.buses import Bus
from sandbox.machine import commands, network, packages
from sandbox.machine.files import FileView
from sandbox.machine.users import current_user

_NOT_RUNNABLE = 127


def run(argv: Sequence[str]) -> int:
    """Run `argv` with the terminal's files and two empty buses; returns its exit status, 128+n for signal
    n."""
    user = current_user()
    _set_up_network()
    FileView(user).reset()
    commands.install_defaults()
    packages.Packages()
    buses = (Bus("system", user), Bus("session", user))
    for bus in buses:
        bus.start()
    try:
        return _run_command(argv)
    finally:
        for bus in buses:
            bus.stop()


def _set_up_network() -> None:
    try:
        network.set_up()
    except network.NetworkUnavailable as error:
        print(f"in-box: this box has no network but the loopback: {error}", file=sys.stderr)


def _run_command(argv: Sequence[str]) -> int:
    try:
        child = subprocess.Popen(argv)
    except OSError as error:
        print(f"in-box: cannot run {argv[0]}: {error.strerror}", file=sys.stderr)
        return _NOT_RUNNABLE

    def pass_on(number: int, _frame: FrameType | None) -> None:
        child.send_signal(number)

    # Ctrl+C reaches the whole foreground group by itself, and this process must outlive its child.
    signal.signal(signal.SIGINT, lambda number, frame: None)
    signal.signal(signal.SIGTERM, pass_on)
    status = child.wait()
    return status if status >= 0 else 128 - status
