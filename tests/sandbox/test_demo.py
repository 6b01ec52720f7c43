"""The tour shows what it saw; its status says whether that was as expected."""

from __future__ import annotations

import io
import re
from pathlib import Path
from typing import Any, Callable

import pytest
from rich.console import Console

from sandbox.demo.scene import NOTHING_ASKED, NOTHING_SHOWN, Scene, Step, from_agent, never
from sandbox.demo.scenes import SCENES
from sandbox.demo.tour import Tour
from sandbox.events import Event
from sandbox.policies import POLICIES
from sandbox.terminal import Terminal
from sandbox.timeline.agent_time import AgentTime
from sandbox.timeline.timeline import Timeline
from tests.sandbox.programs import idle_agent, rude_agent, run_program

# The transfer's time limits run faster, too: on a busy machine a platform must not seem to hang.
UNHURRIED = ("--speed", "15")

_PATIENCE = 20.0
_NO_PATIENCE = 0.01


def _play(terminal: Terminal, patience: float, *steps: Step) -> list[str]:
    """What the tour says of each expectation in a scene of these steps."""
    return _play_scenes(terminal, patience, Scene("Title", "Sentence.", steps))


def _play_scenes(terminal: Terminal, patience: float, *scenes: Scene) -> list[str]:
    timeline = Timeline(terminal.events, AgentTime(1), [Console(file=io.StringIO())])
    tour = Tour(terminal, timeline, patience)
    return [outcome.verdict for outcome in tour.play(dict(enumerate(scenes, 1)), drawn=())]


def _says(*members: str) -> Callable[[Terminal], None]:
    def cue(terminal: Terminal) -> None:
        for member in members:
            terminal.events.record("velks", "fake", "call", member)

    return cue


def test_the_whole_tour_goes_as_expected() -> None:
    ended = run_program("demo", *UNHURRIED)

    assert (ended.returncode, ended.stderr) == (0, ""), ended.stdout
    assert all(f"{number}. {scene.title}" in ended.stdout for number, scene in enumerate(SCENES, 1))
    assert "forced log-out" in ended.stdout and "forced reboot" in ended.stdout


def test_an_agent_that_does_nothing_fails_the_tour(tmp_path: Path) -> None:
    ended = run_program("demo", "--patience", "0.01", "--only", "1", agent=idle_agent(tmp_path))

    assert ended.returncode == 1
    assert "missing" in ended.stdout and "0 of 3 expectations" in ended.stdout
    assert "Expected and seen" in ended.stdout and "Try it yourself" not in ended.stdout


def test_an_agent_that_breaks_a_contract_fails_the_tour_even_if_all_else_is_well(tmp_path: Path) -> None:
    ended = run_program("demo", "--only", "1", agent=rude_agent(tmp_path))

    assert ended.returncode == 1
    assert (
        "3 of 3 expectations" in ended.stdout and "has no method com.norix.velk.velkg.greet" in ended.stdout
    )


def test_chosen_scenes_are_played_after_the_first_one() -> None:
    ended = run_program("demo", *UNHURRIED, "--only", "5", "--log")

    assert ended.returncode == 0, ended.stdout
    assert [line[:2] for line in ended.stdout.splitlines() if line.endswith("─") and line[1] == "."] == [
        "1.",
        "5.",
    ]
    assert "---getusername:" in ended.stdout


def test_waiting_messages_and_the_password_warning_are_shown_with_their_meaning() -> None:
    ended = run_program("demo", *UNHURRIED, "--only", "2,3")

    assert ended.returncode == 0, ended.stdout
    lines = [line.split(maxsplit=1)[1] for line in ended.stdout.splitlines() if line[2:3] == ":"]
    counts = [line.split()[-2:] for line in lines if line.startswith("platform → agent") and "unread" in line]
    assert counts == [["3", "unread"], ["2", "unread"], ["1", "unread"]]
    assert any("your password will expire in 3 days" in line for line in lines)
    assert any("are there unread messages?" in line for line in lines)


def test_the_end_lists_the_outcome_of_each_scene_and_what_to_try_next() -> None:
    ended = run_program("demo", *UNHURRIED, "--only", "8")

    assert f"8. {SCENES[7].title}  2 of 2 ──" in ended.stdout
    *_, first, eighth, summary, next_steps = ended.stdout.splitlines()
    assert first.split() == ["good", "1.", *SCENES[0].title.split(), "3", "of", "3"]
    assert eighth.startswith(f"good  8. {SCENES[7].title}")
    assert summary.endswith("expectations met.")
    assert next_steps.startswith("Try it yourself: ./dev box.")
    assert "Expected and seen" not in ended.stdout


def test_what_was_expected_and_seen_is_shown_on_request() -> None:
    assert "Expected and seen" in run_program("demo", "--only", "1", "--table").stdout


def test_nothing_is_shown_after_the_reboot() -> None:
    ended = run_program("demo", *UNHURRIED, "--only", "14")

    lines = [line for line in ended.stdout.splitlines() if line[2:3] == ":"]
    assert "forced reboot" in lines[-1] and any("HotspotEnable" in line for line in lines)


def test_lines_in_a_file_do_not_end_with_blanks() -> None:
    assert not [line for line in run_program("demo", "--only", "1").stdout.splitlines() if line.endswith(" ")]


def test_the_same_code_gives_the_same_picture(tmp_path: Path) -> None:
    pictures = [tmp_path / name for name in ("one.svg", "two.svg")]
    for picture in pictures:
        assert run_program("demo", "--only", "10", "--svg", str(picture)).returncode == 0

    assert pictures[0].read_text() == pictures[1].read_text()


def test_a_scene_that_does_not_exist_is_one_line() -> None:
    ended = run_program("demo", "--only", "1,99")

    assert (ended.returncode, ended.stdout) == (1, "")
    assert ended.stderr == f"demo: there is no scene 99; there are {len(SCENES)}\n"


def test_the_picture_shows_the_chosen_scenes_and_nothing_of_the_machine(tmp_path: Path) -> None:
    picture = tmp_path / "demo.svg"

    ended = run_program("demo", "--only", "8", "--svg", str(picture))

    drawn = picture.read_text()
    assert ended.returncode == 0, ended.stdout
    assert "SendUserStatus" in ended.stdout and "SendUserStatus" not in drawn
    assert POLICIES[1300].notice in drawn
    assert not re.search(r'@font-face|url\("?http', drawn)
    assert str(Path.cwd()) not in drawn and str(tmp_path) not in drawn


def test_forbidden_event_is_named_when_it_comes(terminal: Terminal) -> None:
    announcement = never("no name", "daemon", "UpdateUserInfo")
    start = Step(lambda terminal: terminal.start_agent(), (announcement, NOTHING_SHOWN))

    assert _play(terminal, _PATIENCE, start) == ["forbidden", "as expected"]


def test_after_a_failure_nothing_more_is_played(terminal: Terminal) -> None:
    notice = from_agent("a notice", "notifications", "Notify")
    played: list[str] = []

    verdicts = _play(
        terminal,
        _NO_PATIENCE,
        Step(lambda terminal: None, (notice,)),
        Step(lambda terminal: played.append("second step"), (notice, NOTHING_SHOWN)),
    )

    assert (verdicts, played) == (["missing", "not played", "not played"], [])


@pytest.mark.parametrize(
    ("expected", "said", "in_order", "second"),
    [
        (["list", "read"], ["list", "read"], True, "as expected"),
        (["list", "read"], ["read", "list"], True, "missing"),
        (["list", "read"], ["read", "list"], False, "as expected"),
        (["list", "list"], ["list"], True, "missing"),
        (["list", "list"], ["list", "list"], True, "as expected"),
    ],
)
def test_the_order_counts_where_it_matters_and_what_is_expected_twice_must_come_twice(
    terminal: Terminal, expected: list[str], said: list[str], in_order: bool, second: str
) -> None:
    terminal.start_agent()
    then = tuple(from_agent("a request", "fake", member) for member in expected)

    assert _play(terminal, _NO_PATIENCE, Step(_says(*said), then, in_order)) == ["as expected", second]


def test_a_step_without_a_cue_looks_at_what_followed_the_last_one(terminal: Terminal) -> None:
    terminal.start_agent()
    _says("too early")(terminal)

    verdicts = _play(
        terminal,
        _NO_PATIENCE,
        Step(_says("list", "read"), (from_agent("a list", "fake", "list"),)),
        Step(None, (from_agent("a receipt", "fake", "read"), never("nothing old", "fake", "too early"))),
    )

    assert verdicts == ["as expected"] * 3


def test_what_a_scene_needs_beforehand_is_done_before_the_first_one(terminal: Terminal) -> None:
    terminal.start_agent()
    done: list[str] = []
    first = Scene("First", "Sentence.", (Step(lambda terminal: done.append("cue"), ()),))
    second = Scene("Second", "Sentence.", (), beforehand=lambda terminal: done.append("beforehand"))

    _play_scenes(terminal, _PATIENCE, first, second)

    assert done == ["beforehand", "cue"]


@pytest.mark.parametrize("member", ["list", "read", "tips", "other"])
def test_no_request_of_any_kind_counts_as_nothing_asked(member: str) -> None:
    assert NOTHING_ASKED.matches(Event(0.0, "velks", "platform", "http", member))


@pytest.mark.parametrize(
    ("args", "fits"),
    [
        ((), True),
        (("zhang.wei",), True),
        ((..., 20001), True),
        (("@zhang.wei",), False),
        (("zhang.wei", 20002), False),
        (("zhang.wei", 20001, 1), False),
    ],
)
def test_an_event_fits_if_its_first_arguments_are_the_expected_ones(
    args: tuple[Any, ...], fits: bool
) -> None:
    event = Event(0.0, "velks", "daemon", "call", "UpdateUserInfo", ("zhang.wei", 20001))

    assert from_agent("a name", "daemon", "UpdateUserInfo", *args).matches(event) == fits
