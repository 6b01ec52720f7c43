"""Which packages a command installs, what it says of them, and what it says when they cannot be installed."""

from __future__ import annotations

import re
import subprocess
from pathlib import Path

import pytest

from tests.dev.devtree import REPOSITORY, Tree, refused

PLAN = """Reading package lists...
0 upgraded, 226 newly installed, 0 to remove and 4 not upgraded.
Need to get 177 MB/180 MB of archives.
After this operation, 750 MB of additional disk space will be used.
"""


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


def names(tree: Tree) -> set[str]:
    """What was asked of the package manager."""
    (asked,) = [call for call in tree.calls("apt-get") if "install" in call and "assume-no" not in call]
    return set(asked.split(" install ")[1].split())


def group(tree: Tree, *wanted: str) -> set[str]:
    """The packages of these groups."""
    found: dict[str, set[str]] = {}
    for line in (tree.root / "packages.txt").read_text().splitlines():
        if line.startswith("["):
            current = found.setdefault(line.strip("[]"), set())
        elif line and not line.startswith("#"):
            current.add(line)
    return set.union(*(found[name] for name in wanted or found.keys() - {"booted", "neighbours"}))


@pytest.mark.parametrize(
    ("command", "groups"),
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
def test_a_command_installs_what_it_needs_and_no_more(bare: Tree, command: str, groups: str) -> None:
    bare.dev(*command.split())

    assert names(bare) == group(bare, *groups.split())


def test_what_is_there_is_not_installed_again(bare: Tree) -> None:
    bare.stand_in("dpkg-query", '[[ $* == *graphviz ]] || echo "installed"')

    ended = bare.dev("setup", "diagrams", "plots")

    assert names(bare) == {"graphviz"}
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


def test_nothing_is_recommended_into_the_machine(bare: Tree) -> None:
    bare.dev("diagrams")

    (asked,) = [call for call in bare.calls("apt-get") if "assume-no" not in call and "install" in call]
    assert "--no-install-recommends" in asked


def test_without_a_network_the_cause_is_one_line(bare: Tree) -> None:
    bare.stand_in(
        "apt-get", "for i in 1 2 3; do echo \"E: Could not resolve 'deb.debian.org'\"; done; exit 100"
    )

    assert refused(bare.dev("diagrams")) == (
        "Debian's package lists could not be fetched: Could not resolve 'deb.debian.org'; is there a network?"
    )


def test_a_package_that_cannot_be_installed_is_one_line(bare: Tree) -> None:
    bare.stand_in(
        "apt-get", "[[ $* != *install* ]] || { echo 'E: Unable to locate package graphviz'; exit 100; }"
    )

    assert refused(bare.dev("diagrams")) == (
        "the packages could not be installed: Unable to locate package graphviz; " "see build/apt.log"
    )


def test_an_interrupted_installation_is_named_with_its_remedy(bare: Tree) -> None:
    words = "dpkg was interrupted, you must manually run 'sudo dpkg --configure -a' to correct the problem."
    bare.stand_in("apt-get", f"""[[ $* != *install* ]] || {{ echo "E: {words}"; exit 100; }}""")

    assert refused(bare.dev("diagrams")) == (
        f"the packages could not be installed: {words}; see build/apt.log"
    )


def test_without_sudo_the_line_for_root_is_shown(bare: Tree) -> None:
    bare.take_away("sudo")

    assert refused(bare.dev("diagrams")) == (
        "packages are missing and there is no sudo; as root, run: "
        "apt-get update && apt-get install --no-install-recommends graphviz"
    )


def test_a_refusal_by_sudo_shows_the_line_for_root(bare: Tree) -> None:
    bare.stand_in("sudo", "exit 1")

    assert refused(bare.dev("diagrams")).startswith("packages are missing and sudo refuses; as root, run: ")
    assert not bare.calls("apt-get")


def test_without_a_package_manager_the_list_is_named(bare: Tree) -> None:
    bare.take_away("apt-get")

    line = refused(bare.dev("diagrams"))

    assert line == "this needs Debian's apt-get; install the packages of packages.txt by hand"


def test_root_needs_no_sudo(bare: Tree) -> None:
    bare.dev("diagrams", uid=0)

    assert not bare.calls("sudo") and bare.calls("apt-get")


def test_what_the_package_is_built_from_is_installed(tree: Tree) -> None:
    control = Path(REPOSITORY, "debian/control").read_text()
    (wanted,) = re.findall(r"^Build-Depends:((?:.*\n )*.*)", control, re.MULTILINE)
    named = {re.split(r"[ :(]", name.strip())[0] for name in wanted.split(",")}

    assert named - {"", "debhelper-compat"} <= group(tree, "build", "package")


def test_no_package_starts_anything_that_stays(tree: Tree) -> None:
    for name in group(tree):
        listed = subprocess.run(["dpkg", "-L", name], capture_output=True, text=True).stdout
        units = re.findall(
            r"/lib/systemd/system/.*\.(?:service|socket)$|^/etc/init.d/.+", listed, re.MULTILINE
        )
        # What a timer starts ends again.
        assert [unit for unit in units if not listed.count(unit.replace(".service", ".timer"))] == [], name


def test_the_names_are_in_order_and_none_is_there_twice_in_a_group(tree: Tree) -> None:
    text = Path(tree.root, "packages.txt").read_text()

    for part in text.split("[")[1:]:
        listed = [line for line in part.splitlines()[1:] if line and not line.startswith("#")]
        assert listed == sorted(set(listed))


def test_the_help_of_setup_names_every_group() -> None:
    groups = re.findall(r"^\[(\w+)\]", (REPOSITORY / "packages.txt").read_text(), re.MULTILINE)
    explained = re.findall(r"^  (\w+) ", (REPOSITORY / "dev.d/help/setup.txt").read_text(), re.MULTILINE)

    assert explained == groups
