"""What must be so before ./dev installs or builds: each trouble is one line that is true for its cause."""

from __future__ import annotations

import os
import subprocess
from pathlib import Path
from tempfile import NamedTemporaryFile
from typing import Iterator

import pytest

from tests.dev.devtree import REPOSITORY, Tree, refused

NEEDS_BOXES = ("demo", "box", "soak", "picture", "test", "bench", "mutate", "fuzz", "coverage")
NEEDS_GIT = ("lint", "format", "package", "mutate")
WORKERS = ("apt-get", "cmake", "ctest", "sandbox", "pytest", "clang-format", "dpkg-buildpackage")


def _in_namespace(tree: Tree, preparation: str, *arguments: str) -> str:
    """What ./dev says in a user namespace of its own, where the preparation was made."""
    script = f'{preparation}; exec "$0" "$@"'
    command = tree.command(*arguments, uid=0)
    wrapped = [*command[:4], "--mount", "sh", "-c", script, *command[4:]]
    ended = tree.run(wrapped)
    return refused(ended)


@pytest.mark.parametrize("command", NEEDS_BOXES)
def test_without_boxes_nothing_is_installed_or_built(tree: Tree, command: str) -> None:
    tree.stand_in("bwrap", "echo no >&2; exit 1")

    line = refused(tree.dev(command))

    assert line.startswith("no boxes can be made here: user namespaces are forbidden") and "(no)" in line
    assert not tree.calls(*WORKERS)


def test_user_namespaces_that_are_switched_off_can_be_switched_on(tree: Tree) -> None:
    tree.stand_in("bwrap", "exec /usr/bin/unshare --user true")

    line = _in_namespace(tree, "echo 0 >/proc/sys/user/max_user_namespaces", "demo")

    assert line == (
        "no boxes can be made here: user namespaces are switched off; "
        "allow them with: sudo sysctl user.max_user_namespaces=10000"
    )


def test_in_a_chroot_no_setting_is_named_that_would_not_help(tree: Tree, tmp_path: Path) -> None:
    tree.stand_in("bwrap", "exec /usr/bin/unshare --user true")
    root = tmp_path / "root"
    root.mkdir()

    line = _in_namespace(tree, f'mount --rbind / {root}; set -- "$0" "$@"; exec chroot {root} "$@"', "demo")

    assert "chroot" in line and "sysctl" not in line


@pytest.mark.parametrize(
    ("setting", "value", "line"),
    [
        (
            "kernel/unprivileged_userns_clone",
            "0",
            "user namespaces are for root only; "
            "allow them with: sudo sysctl kernel.unprivileged_userns_clone=1",
        ),
        (
            "kernel/apparmor_restrict_unprivileged_userns",
            "1",
            "AppArmor forbids user namespaces; "
            "allow them with: sudo sysctl kernel.apparmor_restrict_unprivileged_userns=0",
        ),
    ],
)
def test_the_setting_that_forbids_boxes_is_named(tree: Tree, setting: str, value: str, line: str) -> None:
    tree.stand_in("bwrap", "exit 1")
    tree.stand_in("cat", f'[[ $1 == /proc/sys/{setting} ]] && echo {value} || exec /bin/cat "$@"')

    assert refused(tree.dev("demo")) == f"no boxes can be made here: {line}"
    assert not tree.calls(*WORKERS)


def test_without_proc_it_is_to_be_mounted(tree: Tree) -> None:
    tree.stand_in("bwrap", "exit 1")

    line = _in_namespace(tree, "mount -t tmpfs none /proc", "demo")

    assert line == ("no boxes can be made here: /proc is missing; mount it with: mount -t proc proc /proc")


def test_a_machine_that_can_boot_no_other_is_refused_before_anything_is_built(tree: Tree) -> None:
    tree.write("tests/booted/can-boot", "#!/bin/sh\necho no machine can be booted here: no; exit 1\n")
    (tree.root / "tests/booted/can-boot").chmod(0o755)

    assert refused(tree.dev("test", "booted")) == "no machine can be booted here: no"
    assert not tree.calls(*WORKERS)


def test_a_container_is_no_machine_that_can_boot_another(tree: Tree) -> None:
    tree.copy("tests/booted/can-boot")

    line = refused(tree.dev("test", "booted", uid=0))

    assert line.startswith("no machine can be booted here: ") and line.endswith("; use a machine of its own")


def test_a_folder_that_one_may_not_write_to_is_refused(tree: Tree) -> None:
    tree.stand_in("stat", "echo root")
    tree.write("calls", "")
    tree.root.chmod(0o555)

    line = refused(tree.dev("demo"))

    tree.root.chmod(0o755)
    assert line == "this folder belongs to root and you may not write to it; make a clone of your own"
    assert not tree.calls(*WORKERS)


def test_a_build_by_root_in_a_users_folder_is_refused(tree: Tree) -> None:
    tree.stand_in("stat", "echo anna")

    line = refused(tree.dev("demo", uid=0))

    assert line == (
        "this folder belongs to anna; run ./dev as anna, it asks for sudo itself where that is needed"
    )
    assert not tree.calls(*WORKERS)


@pytest.mark.parametrize("command", NEEDS_GIT)
@pytest.mark.parametrize(
    "answer", ["fatal: detected dubious ownership in repository at '/x'", "fatal: not a git repository"]
)
def test_where_git_lists_nothing_nothing_is_checked(tree: Tree, command: str, answer: str) -> None:
    tree.stand_in("git", f'echo "{answer}" >&2; echo "and more" >&2; exit 128')

    assert refused(tree.dev(command)) == f"git lists no sources here: {answer}"
    assert not tree.calls(*WORKERS)


def test_a_tree_that_is_no_clone_is_refused_before_git_is_installed(tree: Tree) -> None:
    tree.take_away("git")

    assert refused(tree.dev("lint")) == "this is not a git clone, and this command works on what git lists"
    assert not tree.calls(*WORKERS)


@pytest.mark.parametrize("command", ["demo", "test", "lint", "fuzz", "package", "mutate"])
def test_a_full_disk_is_named_beforehand(tree: Tree, command: str) -> None:
    tree.stand_in("df", "echo Avail; echo '   16'")

    line = refused(tree.dev(command))

    assert line.startswith("this needs about ") and line.endswith("only 16 MB are free there")
    assert not tree.calls(*WORKERS)


def test_a_package_cannot_be_built_under_a_blank(tmp_path: Path) -> None:
    tree = Tree(tmp_path / "vel ks")

    line = refused(tree.dev("package"))

    assert line == f"Debian's package tools cannot work in a folder with a blank in its name: {tree.root}"


@pytest.fixture
def program_in_tmp() -> Iterator[Path]:
    """A program in a folder that the box covers with one of its own."""
    with NamedTemporaryFile(dir="/tmp") as file:
        os.chmod(file.name, 0o755)
        yield Path(file.name)


@pytest.mark.parametrize(
    ("agent", "line"),
    [
        ("/nonexistent", "VELK_AGENT names no program: /nonexistent"),
        ("/etc/passwd", "VELK_AGENT names no program: /etc/passwd"),
        (None, "the box has its own /tmp; put the agent into another folder"),
    ],
)
def test_an_agent_that_the_box_would_lack_is_refused_at_once(
    program_in_tmp: Path, agent: str | None, line: str
) -> None:
    ended = subprocess.run(
        ["/usr/bin/python3", "-m", "sandbox", "demo"],
        cwd=REPOSITORY,
        env={**os.environ, "VELK_AGENT": agent or str(program_in_tmp)},
        capture_output=True,
        text=True,
    )

    assert (ended.returncode, ended.stderr) == (1, f"demo: {line}\n")
