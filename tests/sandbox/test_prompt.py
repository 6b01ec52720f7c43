"""The terminal with a prompt, fed with lines."""

from __future__ import annotations

from pathlib import Path

import pytest

from sandbox.machine.users import current_user
from sandbox.policies import POLICIES
from tests.sandbox.programs import run_program


def test_piped_commands_are_carried_out_and_the_traffic_is_printed() -> None:
    ended = run_program("box", script="policy 1300\nwait Notify\n")

    assert (ended.returncode, ended.stderr) == (0, "")
    assert POLICIES[1300].notice in ended.stdout and POLICIES[1300].english_notice in ended.stdout


def test_the_agents_time_runs_as_fast_as_asked_for() -> None:
    ended = run_program("box", "--speed", "60", script="policy 1201\nwait Terminate\n")

    assert (ended.returncode, ended.stderr) == (0, "")
    assert "forced log-out" in ended.stdout


def test_the_agents_log_is_shown_from_the_start_on_request() -> None:
    ended = run_program("box", "--log")

    assert "---getusername:" in ended.stdout


def test_a_refused_line_does_not_keep_the_others_from_being_carried_out_but_shows_in_the_status() -> None:
    ended = run_program("box", script="sing\npolicy 1301\nwait Notify\n")

    assert ended.returncode == 1
    assert "there is no command 'sing'; see: help" in ended.stdout
    assert POLICIES[1301].notice in ended.stdout


def test_lines_after_quit_are_not_read() -> None:
    ended = run_program("box", script="quit\nsing\n")

    assert (ended.returncode, "sing" in ended.stdout) == (0, False)


@pytest.mark.local_user
def test_a_local_users_terminal_is_a_local_users() -> None:
    ended = run_program("box", "--local", script="state\n")

    assert f"the user is {current_user().name}, uid {current_user().uid}" in ended.stdout


def test_a_missing_agent_is_one_line_that_says_how_to_build_it(tmp_path: Path) -> None:
    ended = run_program("box", agent=tmp_path / "velks")

    assert ended.returncode == 1
    assert ended.stderr == f"box: there is no agent at {tmp_path}/velks; build it with: ./dev build\n"
