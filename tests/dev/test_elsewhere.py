"""Roots of other releases: how they are made, what runs in them, and what stays of them."""

from __future__ import annotations

from pathlib import Path

import pytest

from tests.dev.devtree import Tree, refused
from tests.dev.otherroot import let_roots_be_made


@pytest.fixture(autouse=True)
def roots(tree: Tree) -> None:
    """Roots are made of an empty folder, and the tree is a clone."""
    let_roots_be_made(tree)


def files(tree: Tree) -> set[str]:
    """What stays."""
    return {path.name for path in (tree.root / "build" / "elsewhere").iterdir()}


def test_the_root_is_a_bare_minimum_and_its_mounts_end_with_its_maker(tree: Tree) -> None:
    tree.dev("elsewhere", "trixie", "true")

    new = tree.root / "build" / "elsewhere" / "trixie.new"
    made = f"debootstrap --variant=minbase --include=ca-certificates,sudo trixie {new}"
    assert tree.calls("debootstrap") == [made]
    assert f"unshare --mount {made}" in tree.calls("unshare")


def test_the_command_runs_in_a_copy_of_the_tree_as_it_stands(tree: Tree) -> None:
    tree.write("source.cpp", "changed")

    ended = tree.dev("elsewhere", "trixie", "cat", "source.cpp")

    assert (ended.returncode, ended.stdout.splitlines()[-1]) == (0, "changed")


def test_the_status_is_that_of_the_command(tree: Tree) -> None:
    assert tree.dev("elsewhere", "trixie", "sh", "-c", "exit 7").returncode == 7


def test_all_that_it_starts_ends_with_the_namespaces(tree: Tree) -> None:
    tree.dev("elsewhere", "trixie", "true")

    (entered,) = [call for call in tree.calls("unshare") if "enter-root" in call]
    assert {"--mount", "--pid", "--fork", "--kill-child"} <= set(entered.split())


def test_machines_can_boot_in_the_root(tree: Tree) -> None:
    for name in ("hostname", "mount", "pivot_root", "setpriv", "umount"):
        tree.stand_in(name)
    root = tree.write("other/etc/apt/apt.conf.d/own", "").parents[3]

    ended = tree.run([str(tree.root / "dev.d" / "enter-root"), str(root), "archives", "true"])

    assert (ended.returncode, ended.stderr) == (0, "")
    assert f"mount --rbind /sys/fs/cgroup {root}/sys/fs/cgroup" in tree.calls("mount")


def test_a_root_is_thrown_away_and_made_anew_from_what_was_fetched_once(tree: Tree) -> None:
    for _ in range(2):
        tree.dev("elsewhere", "trixie", "touch", "left")
        assert files(tree) == {"trixie.debs", "trixie.log", "trixie.tar"}

    assert len(tree.calls("debootstrap")) == 1


def test_a_root_that_is_kept_is_gone_on_in(tree: Tree) -> None:
    tree.dev("elsewhere", "--keep", "trixie", "mkdir", "-p", "build/left")
    again = tree.dev("elsewhere", "--keep", "trixie", "ls", "build")

    assert again.stdout.splitlines()[-1] == "left"
    assert "trixie.root" in files(tree)


def test_a_root_that_cannot_be_made_is_one_line(tree: Tree) -> None:
    tree.stand_in("debootstrap", "echo 'I: Retrieving'; echo 'E: Unable to resolve'; echo 'E: more'; exit 1")

    line = refused(tree.dev("elsewhere", "trixie"))

    log = tree.root / "build" / "elsewhere" / "trixie.log"
    assert line == f"debootstrap failed: Unable to resolve; see {log}"
    assert files(tree) == {"trixie.debs", "trixie.log"}


def test_without_the_right_to_become_root_nothing_is_begun(tree: Tree) -> None:
    tree.take_away("sudo")

    assert refused(tree.dev("elsewhere", "trixie")) == (
        "this must be root to make a root, and there is no sudo"
    )
    assert not tree.calls("debootstrap", "unshare")


def test_a_user_whom_sudo_refuses_makes_no_root(tree: Tree) -> None:
    tree.stand_in("sudo", "exit 1")

    assert refused(tree.dev("elsewhere", "trixie")) == "this must be root to make a root, and sudo refuses"
    assert not tree.calls("debootstrap", "unshare")


def test_root_makes_a_root_without_sudo(tree: Tree) -> None:
    assert tree.dev("elsewhere", "trixie", "true", uid=0).returncode == 0
    assert not tree.calls("sudo")


def test_the_tree_may_lie_in_a_folder_of_any_name(tmp_path: Path) -> None:
    tree = Tree(tmp_path / "pä th" / "vel ks")
    let_roots_be_made(tree)

    ended = tree.dev("elsewhere", "trixie", "cat", "source.cpp")

    assert (ended.returncode, ended.stderr) == (0, "")
    assert files(tree) == {"trixie.debs", "trixie.log", "trixie.tar"}
