"""The host's side of a box: runs a command in it and reads the result that the command sends back."""

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


def positive(text: str) -> int:
    """Parse a command-line argument that is a whole number from 1 upwards."""
    if not text.isdecimal() or int(text) < 1:
        raise argparse.ArgumentTypeError(f"'{text}' is not a whole number of at least 1")
    return int(text)


def enter(
    user: User,
    arguments: Sequence[str],
    consumer: Consumer | None = None,
    shown: Mapping[Path, Path] | None = None,
) -> int:
    """Run this program with `arguments` in a box of `user`, with the host's files `shown` at the given
    places; returns its exit status.

    With a `consumer`, the program has a result stream (see `result_stream`), which the consumer reads to its
    end. Without one, the box replaces this process and the function does not return.
    """
    bubblewrap.require()
    # Ctrl+C is for the program in the box; it would kill bubblewrap and so the box.
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
    """In the box: the stream that the host's consumer reads; None without a consumer.

    A box inherits only the three standard streams. With a consumer, its standard output is the result stream
    and only its standard error reaches the user's terminal; this function makes both reach the terminal
    again.
    """
    if not os.environ.pop(_MARK, ""):
        return None
    stream = os.fdopen(os.dup(sys.stdout.fileno()), "wb", buffering=0)
    os.dup2(sys.stderr.fileno(), sys.stdout.fileno())
    return stream
