"""A program for people ends with its status, also when it is interrupted."""

from __future__ import annotations

from pathlib import Path
from typing import Callable

import pytest

from sandbox.ending import exit_with
from tests.sandbox.programs import run_program


def _interrupted() -> int:
    raise KeyboardInterrupt


@pytest.mark.parametrize(("main", "status"), [(lambda: 0, 0), (lambda: 3, 3), (_interrupted, 130)])
def test_the_status_is_the_programs_or_says_that_it_was_interrupted(
    main: Callable[[], int], status: int
) -> None:
    with pytest.raises(SystemExit) as ended:
        exit_with(main)

    assert ended.value.code == status


@pytest.mark.parametrize("program", ["box", "demo"])
def test_a_missing_agent_is_one_line_that_says_how_to_build_it(tmp_path: Path, program: str) -> None:
    ended = run_program(program, agent=tmp_path / "velks")

    assert (ended.returncode, ended.stdout) == (1, "")
    assert ended.stderr == f"{program}: there is no agent at {tmp_path}/velks; build it with: ./dev build\n"
