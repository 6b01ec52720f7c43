"""What ./dev prints: for a person at a terminal, into a file, and while nothing happens."""

from __future__ import annotations

import os
import pty
import subprocess
from fcntl import ioctl
from struct import pack
from termios import TIOCSWINSZ

import pytest

from tests.dev.devtree import Tree

_STEPS = "\n".join(f"echo '[{step}/3] Building {step * 'a long path/' * 10}'" for step in (1, 2, 3))
_CLEAR = b"\r\x1b[K"


@pytest.fixture(autouse=True)
def steps(tree: Tree) -> None:
    """A build has steps with long names, and says a word between them."""
    tree.stand_in("cmake", f"[[ $1 != --build ]] || {{ {_STEPS}\necho warning; {_STEPS}\n}}")


def on_terminal(tree: Tree, *arguments: str, term: str = "xterm") -> bytes:
    """What a command prints on a terminal of 80 columns."""
    ours, its = pty.openpty()
    ioctl(its, TIOCSWINSZ, pack("HHHH", 24, 80, 0, 0))
    tree.extra = {"TERM": term}
    with subprocess.Popen(
        tree.command(*arguments), cwd=tree.root, env=tree.environment, stdin=its, stdout=its, stderr=its
    ) as running:
        os.close(its)
        shown = b""
        try:
            while more := os.read(ours, 1000):
                shown += more
        except OSError:  # the other end is closed
            os.close(ours)
    assert running.returncode == 0, shown
    return shown


def test_steps_take_turns_in_one_line_of_a_terminal(tree: Tree) -> None:
    shown = on_terminal(tree, "build")

    assert b"[3/3]" in shown
    assert all(len(piece) < 80 for line in shown.split(b"\r\n") for piece in line.split(_CLEAR))


def test_words_between_the_steps_stay(tree: Tree) -> None:
    assert _CLEAR + b"warning\r\n" in on_terminal(tree, "build")


@pytest.mark.parametrize("command", ["build", "demo", "test", "lint", "diagrams", "format"])
def test_a_file_has_no_signs_for_a_terminal(tree: Tree, command: str) -> None:
    ended = tree.dev(command)

    printed = ended.stdout + ended.stderr
    assert "[1/3]" in printed or command in ("diagrams", "format")
    assert "\x1b" not in printed and "\r" not in printed


def test_a_terminal_that_cannot_clear_a_line_is_like_a_file(tree: Tree) -> None:
    shown = on_terminal(tree, "build", term="dumb")

    assert b"[1/3]" in shown and b"\x1b" not in shown


@pytest.mark.parametrize("language", ["C", "POSIX", "de_DE.ISO-8859-1"])
def test_any_language_of_the_person_will_do(tree: Tree, language: str) -> None:
    tree.extra = {"LANG": language, "LC_ALL": language}
    tree.stand_in("cmake", "[[ $1 != --build ]] || echo 'grün 提醒'")

    assert "grün 提醒\n" in tree.dev("build").stdout
