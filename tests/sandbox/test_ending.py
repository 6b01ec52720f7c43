"""A program for people ends with its status, also when it is interrupted."""

from __future__ import annotations

from typing import Callable

import pytest

from sandbox.ending import exit_with


def _interrupted() -> int:
    raise KeyboardInterrupt


@pytest.mark.parametrize(("main", "status"), [(lambda: 0, 0), (lambda: 3, 3), (_interrupted, 130)])
def test_the_status_is_the_programs_or_says_that_it_was_interrupted(
    main: Callable[[], int], status: int
) -> None:
    with pytest.raises(SystemExit) as ended:
        exit_with(main)

    assert ended.value.code == status
