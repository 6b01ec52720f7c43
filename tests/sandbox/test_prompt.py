"""The terminal with a prompt, fed with lines."""

from __future__ import annotations

import pytest

from sandbox.machine.users import current_user
from sandbox.policies import POLICIES
from tests.sandbox.programs import run_program


@pytest.mark.parametrize(
    ("options", "script", "printed"),
    [
        ("", "policy 1300\nwait Notify\n", [POLICIES[1300].notice, POLICIES[1300].english_notice]),
        ("--speed 60", "policy 1201\nwait Terminate\n", ["forced log-out"]),
        ("--log", "", ["---getusername:"]),
        pytest.param(
            "--local",
            "state\n",
            [f"the user is {current_user().name}, uid {current_user().uid}"],
            marks=pytest.mark.local_user,
        ),
    ],
    ids=["traffic", "time as fast as asked for", "agent's log from the start", "local user's terminal"],
)
def test_piped_commands_are_carried_out_and_what_was_asked_for_is_printed(
    options: str, script: str, printed: list[str]
) -> None:
    ended = run_program("box", *options.split(), script=script)

    assert (ended.returncode, ended.stderr) == (0, "")
    assert [text for text in printed if text not in ended.stdout] == []


def test_a_refused_line_does_not_keep_the_others_from_being_carried_out_but_shows_in_the_status() -> None:
    ended = run_program("box", script="sing\npolicy 1301\nwait Notify\n")

    assert ended.returncode == 1
    assert "there is no command 'sing'; see: help" in ended.stdout
    assert POLICIES[1301].notice in ended.stdout


def test_lines_after_quit_are_not_read() -> None:
    ended = run_program("box", script="quit\nsing\n")

    assert (ended.returncode, "sing" in ended.stdout) == (0, False)
