"""What ./dev says of its arguments, before it does anything else."""

from __future__ import annotations

import re
import subprocess
import sys
from pathlib import Path

import pytest

from tests.dev.devtree import REPOSITORY, Tree, commands, refused


@pytest.mark.parametrize(
    ("arguments", "line"),
    [
        ("tset", "there is no command 'tset'; see ./dev help"),
        ("--speed", "there is no command '--speed'; see ./dev help"),
        ("demo --spede 3", "demo: there is no option --spede; see ./dev demo --help"),
        ("demo --speed", "demo: --speed needs a value: N; see ./dev demo --help"),
        ("demo --speed fast", "demo: 'fast' is no whole number from 1 upwards; see ./dev demo --help"),
        ("demo --speed=0", "demo: '0' is no whole number from 1 upwards; see ./dev demo --help"),
        ("demo --log=yes", "demo: --log takes no value; see ./dev demo --help"),
        ("demo --only x", "demo: 'x' is no list of numbers, such as 4,10; see ./dev demo --help"),
        ("demo scene", "demo: there is no 'scene' here; see ./dev demo --help"),
        ("test nonsense", "test: there is no 'nonsense' here; see ./dev test --help"),
        ("sanitize everything", "sanitize: there is no 'everything' here; see ./dev sanitize --help"),
        ("fuzz --seconds x", "fuzz: 'x' is no whole number from 1 upwards; see ./dev fuzz --help"),
        ("fuzz nonsense", "fuzz: there is no 'nonsense' here; see ./dev fuzz --help"),
        ("bench nonsense", "bench: there is no 'nonsense' here; see ./dev bench --help"),
        ("setup nonsense", "setup: there is no 'nonsense' here; see ./dev setup --help"),
        ("format all", "format: there is no 'all' here; see ./dev format --help"),
        (
            "elsewhere",
            "elsewhere: it needs the name of a release, such as bookworm or trixie; "
            "see ./dev elsewhere --help",
        ),
    ],
)
def test_wrong_arguments_are_one_line_and_nothing_is_done(tree: Tree, arguments: str, line: str) -> None:
    assert refused(tree.dev(*arguments.split())) == line
    assert not tree.calls()


def test_a_picture_that_cannot_be_written_is_told_at_once(tree: Tree) -> None:
    line = refused(tree.dev("demo", "--svg", "/nowhere/x.svg"))

    assert line == (
        "demo: nothing can be written to /nowhere/x.svg: there is no such folder that you may write to"
    )
    assert not tree.calls()


def test_a_report_that_is_not_there_is_told_at_once(tree: Tree) -> None:
    assert (
        refused(tree.dev("bench", "--compare", "no.json")) == f"bench: there is no file {tree.root}/no.json"
    )
    assert not tree.calls()


def test_a_files_name_counts_from_where_one_stands(tree: Tree, tmp_path: Path) -> None:
    ended = tree.dev("demo", "--svg", "here.svg", folder=tmp_path)

    assert ended.returncode == 0, ended
    assert tree.calls("sandbox") == [f"sandbox demo --svg {tmp_path}/here.svg"]


@pytest.mark.parametrize("command", commands())
def test_each_command_tells_of_itself_and_does_nothing_else(tree: Tree, command: str) -> None:
    ended = tree.dev(command, "--help")

    assert (ended.returncode, ended.stderr) == (0, "")
    assert ended.stdout.startswith(f"usage: ./dev {command}")
    assert not tree.calls()


def test_the_help_lists_each_command(tree: Tree) -> None:
    listed = re.findall(r"^  ([a-z]+) ", tree.dev("help").stdout, re.MULTILINE)

    assert sorted(listed) == commands()


@pytest.mark.parametrize(
    "path", sorted((REPOSITORY / "dev.d" / "help").iterdir()), ids=lambda path: path.name
)
def test_a_help_fits_80_columns(path: Path) -> None:
    assert max(len(line) for line in path.read_text().splitlines()) <= 80


@pytest.mark.parametrize(
    ("command", "module"),
    [
        ("demo", ["sandbox", "demo"]),
        ("box", ["sandbox", "box"]),
        ("soak", ["sandbox", "soak"]),
        ("bench", ["bench"]),
        ("fuzz", ["tests.fuzz.run"]),
    ],
)
def test_the_help_names_the_options_that_the_program_takes(command: str, module: list[str]) -> None:
    told = (REPOSITORY / "dev.d" / "help" / f"{command}.txt").read_text()
    shown = subprocess.run(
        [sys.executable, "-m", *module, "--help"], cwd=REPOSITORY, capture_output=True, text=True, check=True
    ).stdout

    assert set(re.findall(r"^  (--[a-z-]+)", told, re.MULTILINE)) == set(
        re.findall(r"^  (?:-h, )?(--[a-z-]+)", shown, re.MULTILINE)
    ) - {"--help"}
