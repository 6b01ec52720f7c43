"""The way of a person's command into a box, and of what the box has for the person's own system out of it."""

from __future__ import annotations

import argparse
import os
import signal
import subprocess
import sys
from pathlib import Path
from typing import IO, Callable, Mapping, Sequence

from sandbox.box import bubblewrap
from sandbox.machine.users import User

_MARK = "VELK_BOX_RESULT"
_PYTHON = ("/usr/bin/python3", "-P", "-m", "sandbox")

Consumer = Callable[[IO[bytes]], object]


class Trouble(Exception):
    """What keeps a person's command from going on, in one line that says what to do."""


def positive(text: str) -> int:
    """A whole number from 1 upwards, for a command line."""
    number = int(text)
    if number < 1:
        raise argparse.ArgumentTypeError(f"{number} is not a number from 1 upwards")
    return number


def enter(
    user: User,
    arguments: Sequence[str],
    consumer: Consumer | None = None,
    shown: Mapping[Path, Path] | None = None,
) -> int:
    """Run this program with `arguments` in a box of `user`, which shows these files of the person's at places
    of its own; the result is its exit status.

    With a `consumer` the program has a result stream (see `result_stream`), which the consumer reads to its
    end; without one this process becomes the box and nothing is returned.
    """
    try:
        bubblewrap.require()
    except bubblewrap.BoxUnavailable as error:
        raise Trouble(str(error)) from error
    # Ctrl+C is for the program in the box: bubblewrap would die of it and take the box along.
    signal.signal(signal.SIGINT, signal.SIG_IGN)
    sys.stdout.flush()
    env: Mapping[str, str] = {_MARK: "1"} if consumer else {}
    argv = bubblewrap.command(user, [*_PYTHON, *arguments], env, shown or {})
    if consumer is None:
        os.execvp(argv[0], argv)
    # The box inherits the files that its command line refers to.
    with subprocess.Popen(
        argv, stdout=subprocess.PIPE, stderr=sys.stdout.fileno(), close_fds=False
    ) as process:
        assert process.stdout
        consumer(process.stdout)
    return process.returncode


def result_stream() -> IO[bytes] | None:
    """Inside: the stream that the consumer outside reads, None where there is no consumer.

    The box keeps no open file but the three standard ones. With a consumer the first of these two that are
    written to is the result and the other one the person's; from here on both lead to the person again.
    """
    if not os.environ.pop(_MARK, ""):
        return None
    stream = os.fdopen(os.dup(sys.stdout.fileno()), "wb", buffering=0)
    os.dup2(sys.stderr.fileno(), sys.stdout.fileno())
    return stream
