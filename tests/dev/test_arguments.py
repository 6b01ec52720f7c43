"""What ./dev says of its arguments, before it does anything else."""

from __future__ import annotations

import re
from pathlib import Path

import pytest

from sandbox.demo.scenes import SCENES
from tests.dev.devtree import MODULE, REPOSITORY, Tree, commands, refused, run_module
from tests.mutation.areas import AREAS

WRONG_ARGUMENTS = 2


def help_of(command: str) -> str:
    """A command's help page."""
    return (REPOSITORY / "dev.d" / "help" / f"{command}.txt").read_text()


@pytest.fixture
def bare(tree: Tree) -> Tree:
    """A machine that has none of the packages, and no program of theirs."""
    tree.stand_in("dpkg-query", "exit 1")
    tree.take_away("cmake", "git", "bwrap", "debootstrap", "sudo")
    return tree


@pytest.mark.parametrize(
    ("arguments", "line"),
    [
        ("tset", "there is no command 'tset'; see ./dev help"),
        ("--speed", "there is no command '--speed'; see ./dev help"),
        ("demo --spede 3", "demo: there is no option --spede; see ./dev demo --help"),
        ("demo --speed", "demo: --speed needs a value: N; see ./dev demo --help"),
        ("demo --speed fast", "demo: 'fast' is not a whole number of at least 1; see ./dev demo --help"),
        ("demo --speed=0", "demo: '0' is not a whole number of at least 1; see ./dev demo --help"),
        ("demo --log=yes", "demo: --log takes no value; see ./dev demo --help"),
        ("demo --only x", "demo: 'x' is not a list of numbers, such as 4,10; see ./dev demo --help"),
        ("demo --only 4,99", "demo: there is no scene 99; see ./dev demo --help"),
        ("demo --patience 0", "demo: '0' is not a whole number of at least 1; see ./dev demo --help"),
        ("dev", "there is no command 'dev'; see ./dev help"),
        ("box --speed 1.5", "box: '1.5' is not a whole number of at least 1; see ./dev box --help"),
        ("soak --hours 0", "soak: '0' is not a whole number of at least 1; see ./dev soak --help"),
        ("soak --allowance -1", "soak: '-1' is not a whole number of at least 1; see ./dev soak --help"),
        ("mutate --limit x", "mutate: 'x' is not a whole number of at least 1; see ./dev mutate --help"),
        ("mutate src/main.cpp", "mutate: there is no 'main.cpp' here; see ./dev mutate --help"),
        ("bench --records -1", "bench: '-1' is not a whole number; see ./dev bench --help"),
        ("bench --json /tmp/.", "bench: /tmp/. cannot be written: it is a folder"),
        ("bench --compare /no.json", "bench: there is no file /no.json"),
        (
            "demo --svg /nowhere/x.svg",
            "demo: /nowhere/x.svg cannot be written: its folder does not exist or is not writable",
        ),
        ("sanitize memory --hours x", "soak: 'x' is not a whole number of at least 1; see ./dev soak --help"),
        ("sanitize address nonsense", "test: there is no 'nonsense' here; see ./dev test --help"),
        ("fuzz --seconds x", "fuzz: 'x' is not a whole number of at least 1; see ./dev fuzz --help"),
        ("elsewhere ../x", "elsewhere: there is no '../x' here; see ./dev elsewhere --help"),
        *(
            (
                arguments,
                "elsewhere: it needs the name of a release, such as bookworm or trixie; "
                "see ./dev elsewhere --help",
            )
            for arguments in ("elsewhere", "elsewhere --keep")
        ),
        *(
            (f"{command} nonsense", f"{command}: there is no 'nonsense' here; see ./dev {command} --help")
            for command in commands()
        ),
    ],
)
def test_wrong_arguments_are_one_line_and_nothing_is_done(bare: Tree, arguments: str, line: str) -> None:
    assert refused(bare.dev(*arguments.split()), WRONG_ARGUMENTS) == line
    assert not bare.calls()
    assert not (bare.root / "build").exists()


@pytest.mark.parametrize(
    ("variable", "value", "line"),
    [
        ("VELK_PRESET", "fast", "VELK_PRESET: there is no preset 'fast'; there are: debug, release, "),
        ("VELK_TEST_JOBS", "many", "VELK_TEST_JOBS: 'many' is not a whole number of at least 1"),
    ],
)
def test_a_wrong_variable_is_one_line_and_nothing_is_done(
    bare: Tree, variable: str, value: str, line: str
) -> None:
    bare.extra = {variable: value}

    assert refused(bare.dev("build"), WRONG_ARGUMENTS).startswith(line)
    assert not bare.calls()


@pytest.mark.parametrize("option", ["--compare", "--json"])
@pytest.mark.parametrize("text", ["", '{"other": 1}'])
def test_a_report_that_is_none_is_refused_at_once(bare: Tree, tmp_path: Path, option: str, text: str) -> None:
    report = tmp_path / "report.json"
    report.write_text(text)

    line = refused(bare.dev("bench", option, str(report)), WRONG_ARGUMENTS)

    assert line == f"bench: {report} is not a report of a run, or you may not read it"
    assert not bare.calls()


def test_figures_that_were_never_measured_cannot_be_shown(tmp_path: Path) -> None:
    ended = run_module("bench", "--no-measure", "--json", str(tmp_path / "new.json"))

    assert ended.returncode == WRONG_ARGUMENTS
    assert ended.stderr == f"bench: there are no figures in {tmp_path}/new.json yet; measure first\n"


def test_the_report_that_is_committed_can_be_compared(tree: Tree) -> None:
    report = REPOSITORY / "bench" / "baseline.json"

    assert tree.dev("bench", "--compare", str(report)).returncode == 0
    assert tree.calls("bench") == [f"bench --compare {report}"]


@pytest.mark.parametrize("option", ["demo --svg", "bench --json", "bench --compare"])
def test_a_files_name_counts_from_where_one_stands(tree: Tree, tmp_path: Path, option: str) -> None:
    (tmp_path / "here").write_text('{"figures": []}')

    tree.dev(*option.split(), "here", folder=tmp_path)

    (call,) = tree.calls("sandbox", "bench")
    assert call.endswith(f"{option} {tmp_path}/here")


@pytest.mark.parametrize(
    "arguments",
    ["demo --only 4,10 --speed=60 --table", "soak --seed 3", "fuzz --seconds 5 http", "bench dock"],
)
def test_right_arguments_reach_their_program(tree: Tree, arguments: str) -> None:
    tree.write("tests/fuzz/run.py", MODULE.format(name="fuzz"))

    tree.dev(*arguments.split())

    assert f" {' '.join(tree.calls('sandbox', 'fuzz', 'bench'))}".endswith(arguments.replace("=", " "))


def test_a_source_to_change_may_be_named_by_its_path(tree: Tree) -> None:
    tree.write("tests/mutation/mutate.py", MODULE.format(name="mutate"))

    tree.dev("mutate", "src/velk/velks/domain_exit.cpp", "--quick")

    assert tree.calls("mutate") == ["mutate domain_exit.cpp --quick"]


@pytest.mark.parametrize("layer", ["dev", "bench", "contracts", "sandbox", "e2e"])
def test_what_pytest_does_not_understand_is_refused_before_anything_is_built(tree: Tree, layer: str) -> None:
    (tree.root / "pytest.py").unlink()  # the real one reads them
    line = refused(tree.dev("test", layer, "--no-such"), WRONG_ARGUMENTS)
    assert line.startswith("test: unrecognized arguments: --no-such; see ")
    assert tree.calls("cmake") == []


@pytest.mark.parametrize("command", commands())
def test_each_command_shows_its_help_and_does_nothing_else(tree: Tree, command: str) -> None:
    ended = tree.dev(command, "--help")

    assert (ended.returncode, ended.stderr) == (0, "")
    assert ended.stdout.startswith(f"usage: ./dev {command}")
    assert not tree.calls()


@pytest.mark.parametrize("command", ["test unit", "test e2e", "sanitize memory", "elsewhere trixie"])
def test_help_is_shown_after_a_word_too(bare: Tree, command: str) -> None:
    ended = bare.dev(*command.split(), "--help")

    assert ended.stdout.startswith(f"usage: ./dev {command.split()[0]}")
    assert not bare.calls()


def test_the_help_lists_the_scenes_of_the_tour() -> None:
    listed = re.findall(r"^ {3,}(\d+)  (.*)$", help_of("demo"), re.MULTILINE)

    assert listed == [(str(number), scene.title) for number, scene in enumerate(SCENES, 1)]


def test_the_help_lists_the_sources_that_can_be_changed() -> None:
    by_default, _, by_name = help_of("mutate").partition("Only when they are named")

    for text, wanted in ((by_default, True), (by_name, False)):
        assert re.findall(r"^  (\S+\.cpp)$", text, re.MULTILINE) == sorted(
            {Path(area.file).name for area in AREAS if area.by_default == wanted}
        )


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
        ("mutate", ["tests.mutation.mutate"]),
    ],
)
def test_the_help_names_the_options_that_the_program_takes(command: str, module: list[str]) -> None:
    shown = run_module(*module, "--help").stdout

    assert set(re.findall(r"^  (--[a-z-]+)", help_of(command), re.MULTILINE)) == set(
        re.findall(r"^  (?:-h, )?(--[a-z-]+)", shown, re.MULTILINE)
    ) - {"--help"}
