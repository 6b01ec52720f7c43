"""How programs for people end."""

from __future__ import annotations

import sys
from typing import Callable, NoReturn

_INTERRUPTED = 130


def exit_with(main: Callable[[], int]) -> NoReturn:
    """End with the status of `main`; Ctrl+C is a person's wish and no error that one would want to trace."""
    try:
        sys.exit(main())
    except KeyboardInterrupt:
        sys.exit(_INTERRUPTED)
