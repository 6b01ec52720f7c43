"""What was typed at the prompt is there in the next run."""

from __future__ import annotations

from pathlib import Path

import pytest
from prompt_toolkit.application import create_app_session
from prompt_toolkit.history import FileHistory
from prompt_toolkit.input import create_pipe_input
from prompt_toolkit.output import DummyOutput

from sandbox.box import bubblewrap
from sandbox.machine import layout
from sandbox.machine.users import DOMAIN_USER
from sandbox.prompt import main
from sandbox.prompt.loop import run_prompt
from sandbox.terminal import Terminal
from tests.sandbox.recorded_context import RecordedContext

_ENTER, _END = "\r", "\x04"


@pytest.fixture(autouse=True)
def folder(tmp_path: Path, monkeypatch: pytest.MonkeyPatch) -> None:
    """Where the history is kept: in a folder that is empty so far."""
    monkeypatch.setattr(layout, "HISTORY", tmp_path / "history")


def type_keys(terminal: Terminal, keys: str) -> None:
    """Run the prompt for a person who types this."""
    with create_pipe_input() as keyboard, create_app_session(input=keyboard, output=DummyOutput()):
        keyboard.send_text(keys)
        assert run_prompt(RecordedContext(terminal)) == 0


def test_what_was_typed_is_kept_from_run_to_run(terminal: Terminal) -> None:
    layout.HISTORY.touch()

    for command in ("hang logind", "well logind"):
        type_keys(terminal, f"{command}{_ENTER}{_END}")

    kept = FileHistory(str(layout.HISTORY)).load_history_strings()
    assert list(kept) == ["well logind", "hang logind"]


def test_nothing_is_kept_where_the_box_shows_no_file(terminal: Terminal, tmp_path: Path) -> None:
    type_keys(terminal, f"hang logind{_ENTER}{_END}")

    assert list(tmp_path.iterdir()) == []


def test_a_persons_file_is_made_and_shown_in_the_box(tmp_path: Path, monkeypatch: pytest.MonkeyPatch) -> None:
    monkeypatch.setenv("XDG_STATE_HOME", str(tmp_path))
    monkeypatch.setattr("sys.stdin.isatty", lambda: True)

    shown = main.history()

    kept = tmp_path / "velks" / "box-history"
    assert shown == {layout.HISTORY: kept} and kept.exists()
    argv = bubblewrap.command(DOMAIN_USER, ["true"], shown=shown)
    place = argv.index(str(kept))
    assert argv[place - 1 : place + 2] == ["--bind", str(kept), str(layout.HISTORY)]


@pytest.mark.parametrize("is_terminal", [True, False])
def test_a_script_and_a_person_without_a_folder_have_no_file(
    tmp_path: Path, monkeypatch: pytest.MonkeyPatch, is_terminal: bool
) -> None:
    monkeypatch.setenv("XDG_STATE_HOME", "/proc/nowhere" if is_terminal else str(tmp_path))
    monkeypatch.setattr("sys.stdin.isatty", lambda: is_terminal)

    assert main.history() == {}
