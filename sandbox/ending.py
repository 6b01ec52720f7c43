"""The end of command-line programs."""

from __future__ import annotations

import signal
import sys
from typing import Callable, NoReturn

_INTERRUPTED = 130


class CannotRun(Exception):
    """The program cannot run; the message is one line that says what to do."""


def exit_with(main: Callable[[], int]) -> NoReturn:
    """Exit with the status of `main`; Ctrl+C and SIGTERM end the program without a traceback."""
    signal.signal(signal.SIGTERM, signal.default_int_handler)
    try:
        sys.exit(main())
    except KeyboardInterrupt:
        sys.exit(_INTERRUPTED)
