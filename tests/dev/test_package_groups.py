"""Which packages a command installs, what it says of them, and what it says when they cannot be installed."""

from __future__ import annotations

import re
import subprocess
from pathlib import Path
from typing import Callable

import pytest

from tests.dev.devtree import REPOSITORY, Tree, refused

PLAN = """Reading package lists...
0 upgraded, 226 newly installed, 0 to remove and 4 not upgraded.
Need to get 177 MB/180 MB of archives.
After this operation, 750 MB of additional disk space will be used.
"""
ERROR = "Could not resolve 'deb.debian.org'"
AS_ROOT = "as root, run: apt-get update && apt-get install --no-install-recommends graphviz"


@pytest.fixture
def bare(tree: Tree) -> Tree:
    """A machine that has none of the packages, and a package manager that can get them."""
    tree.stand_in("dpkg-query", "exit 1")
    tree.stand_in(
        "apt-get",
        f"""case $* in
            *assume-no*) printf '%s' '{PLAN}'; exit 1 ;;
            *install*)
                echo 'Reading package lists...'
                echo 'dlstatus:1:50.5:Retrieving file 1 of 2'
                echo 'pmstatus:graphviz:100:Installed graphviz' ;;
        esac""",
    )
    return tree


def installation(tree: Tree) -> tuple[str, set[str]]:
    """The options and the names that packages were installed with."""
    (asked,) = [call for call in tree.calls("apt-get") if "install" in call and "assume-no" not in call]
    options, names = asked.split(" install ")
    return options, set(names.split())


def groups() -> dict[str, list[str]]:
    """The names in each group of packages."""
    parts = (REPOSITORY / "packages.txt").read_text().split("\n[")[1:]
    known = [part.partition("]") for part in parts]
    return {group: re.findall(r"^[^#\n].*", names, re.MULTILINE) for group, _, names in known}


def packages(*wanted: str) -> set[str]:
    """The packages of these groups."""
    known = groups()
    return {name for group in wanted or known.keys() - {"booted", "neighbours"} for name in known[group]}


@pytest.mark.parametrize(
    ("command", "needed"),
    [
        ("demo", "build terminal"),
        ("box", "build terminal"),
        ("soak", "build terminal soak"),
        ("test contracts", "build terminal tests"),
        ("format", "lint"),
        ("lint", "build terminal tests lint"),
        ("diagrams", "diagrams"),
        ("package", "build package"),
        ("fuzz", "build terminal fuzz"),
        ("bench", "build terminal soak bench"),
        ("bench --write-docs", "build terminal soak bench plots"),
        ("setup", ""),
        ("setup lint plots", "lint plots"),
    ],
)
def test_a_command_installs_what_it_needs_and_no_more(bare: Tree, command: str, needed: str) -> None:
    bare.dev(*command.split())

    options, names = installation(bare)
    assert names == packages(*needed.split())
    assert "--no-install-recommends" in options


def test_what_is_there_is_not_installed_again(bare: Tree) -> None:
    bare.stand_in("dpkg-query", '[[ $* == *graphviz ]] || echo "installed"')

    ended = bare.dev("setup", "diagrams", "plots")

    assert installation(bare)[1] == {"graphviz"}
    assert "All packages are installed." in ended.stdout


def test_names_and_sizes_are_shown_beforehand_and_progress_after(bare: Tree) -> None:
    shown = bare.dev("diagrams").stdout.splitlines()

    listed = [
        "Installing graphviz",
        "With all that they need: 226 packages",
        "To download: 177 MB",
        "On the disk: 750 MB",
        "[ 50 %] Retrieving file 1 of 2",
    ]
    assert [line for line in shown if line in listed] == listed


@pytest.mark.parametrize(
    ("command", "step", "line"),
    [
        ("diagrams", "update", f"Debian's package lists could not be fetched: {ERROR}; is there a network?"),
        ("diagrams", "install", f"the packages could not be installed: {ERROR}; see build/apt.log"),
        (
            "bench neighbours",
            "download",
            f"the neighbours could not be fetched: {ERROR}; is there a network?",
        ),
        (
            "bench neighbours",
            "--simulate",
            "apt-get does not find the neighbours; update its lists with: sudo apt-get update",
        ),
    ],
)
def test_what_the_package_manager_refuses_is_one_line_with_the_first_cause(
    tree: Tree, command: str, step: str, line: str
) -> None:
    tree.stand_in("dpkg-query", "[[ $* != *graphviz ]] || exit 1; echo installed")
    tree.stand_in(
        "apt-get",
        f"""case $* in
            *{step}*) echo "E: {ERROR}"; echo "E: more"; exit 100 ;;
            *--simulate*) echo "Inst kded5" ;;
        esac""",
    )

    assert refused(tree.dev(*command.split())) == line


@pytest.mark.parametrize(
    ("lose", "line"),
    [
        (
            lambda tree: tree.take_away("apt-get"),
            "this needs Debian's apt-get; install the packages of packages.txt by hand",
        ),
        (lambda tree: tree.take_away("sudo"), f"packages are missing and there is no sudo; {AS_ROOT}"),
        (lambda tree: tree.stand_in("sudo", "exit 1"), f"packages are missing and sudo refuses; {AS_ROOT}"),
    ],
    ids=["no package manager", "no sudo", "sudo refuses"],
)
def test_where_nothing_can_be_installed_a_line_says_what_to_do_by_hand(
    bare: Tree, lose: Callable[[Tree], None], line: str
) -> None:
    lose(bare)

    assert refused(bare.dev("diagrams")) == line
    assert not bare.calls("apt-get")


def test_root_needs_no_sudo(bare: Tree) -> None:
    bare.dev("diagrams", uid=0)

    assert not bare.calls("sudo") and bare.calls("apt-get")


def test_what_the_package_is_built_from_is_installed() -> None:
    control = Path(REPOSITORY, "debian/control").read_text()
    (wanted,) = re.findall(r"^Build-Depends:((?:.*\n )*.*)", control, re.MULTILINE)
    named = {re.split(r"[ :(]", name.strip())[0] for name in wanted.split(",")}

    assert named - {"", "debhelper-compat"} <= packages("build", "package")


def test_no_package_starts_anything_that_stays() -> None:
    for name in packages():
        listed = subprocess.run(["dpkg", "-L", name], capture_output=True, text=True).stdout
        units = re.findall(
            r"/lib/systemd/system/.*\.(?:service|socket)$|^/etc/init.d/.+", listed, re.MULTILINE
        )
        # What a timer starts ends again.
        assert [unit for unit in units if not listed.count(unit.replace(".service", ".timer"))] == [], name


def test_the_names_are_in_order_and_none_is_there_twice_in_a_group() -> None:
    assert {group: sorted(set(names)) for group, names in groups().items()} == groups()


def test_the_help_of_setup_names_every_group() -> None:
    explained = re.findall(r"^  (\w+) ", (REPOSITORY / "dev.d/help/setup.txt").read_text(), re.MULTILINE)

    assert explained == list(groups())
