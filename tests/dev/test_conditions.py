"""What must be so before ./dev installs or builds: each trouble is one line that is true for its cause."""

from __future__ import annotations

import os
from pathlib import Path
from tempfile import NamedTemporaryFile
from typing import Iterator

import pytest

from tests.dev.devtree import Tree, refused, run_module

NEEDS_BOXES = ("demo", "box", "soak", "picture", "test", "bench", "mutate", "fuzz", "coverage")
NEEDS_GIT = ("lint", "format", "package", "mutate")
WORKERS = ("apt-get", "cmake", "ctest", "sandbox", "pytest", "clang-format", "dpkg-buildpackage")


def refusal(tree: Tree, *arguments: str, uid: int = 1000) -> str:
    """What ./dev says of a command that it refuses before anything is installed or built."""
    line = refused(tree.dev(*arguments, uid=uid))
    assert not tree.calls(*WORKERS)
    return line


def refusal_in_namespace(tree: Tree, preparation: str) -> str:
    """What ./dev says of the tour in a user namespace of its own, where the preparation was made."""
    command = tree.command("demo", uid=0)
    script = f'{preparation}; exec "$0" "$@"'
    return refused(tree.run([*command[:4], "--mount", "sh", "-c", script, *command[4:]]))


@pytest.mark.parametrize("command", NEEDS_BOXES)
def test_without_boxes_nothing_is_installed_or_built(tree: Tree, command: str) -> None:
    tree.stand_in("bwrap", "echo no >&2; exit 1")

    line = refusal(tree, command)

    assert line.startswith("no boxes can be made here: user namespaces are forbidden") and "(no)" in line


@pytest.mark.parametrize(
    ("preparation", "line"),
    [
        (
            "echo 0 >/proc/sys/user/max_user_namespaces",
            "user namespaces are switched off; allow them with: sudo sysctl user.max_user_namespaces=10000",
        ),
        ("mount -t tmpfs none /proc", "/proc is missing; mount it with: mount -t proc proc /proc"),
    ],
)
def test_what_boxes_lack_is_named_with_its_remedy(tree: Tree, preparation: str, line: str) -> None:
    tree.stand_in("bwrap", "exit 1")

    assert refusal_in_namespace(tree, preparation) == f"no boxes can be made here: {line}"


def test_in_a_chroot_no_setting_is_named_that_would_not_help(tree: Tree, tmp_path: Path) -> None:
    tree.stand_in("bwrap", "exec /usr/bin/unshare --user true")
    root = tmp_path / "root"
    root.mkdir()

    line = refusal_in_namespace(tree, f'mount --rbind / {root}; set -- "$0" "$@"; exec chroot {root} "$@"')

    assert "chroot" in line and "sysctl" not in line


@pytest.mark.parametrize(
    ("setting", "value", "trouble"),
    [
        ("unprivileged_userns_clone", 0, "user namespaces are for root only"),
        ("apparmor_restrict_unprivileged_userns", 1, "AppArmor forbids user namespaces"),
    ],
)
def test_the_setting_that_forbids_boxes_is_named(tree: Tree, setting: str, value: int, trouble: str) -> None:
    tree.stand_in("bwrap", "exit 1")
    tree.stand_in("cat", f'[[ $1 == /proc/sys/kernel/{setting} ]] && echo {value} || exec /bin/cat "$@"')

    remedy = f"allow them with: sudo sysctl kernel.{setting}={1 - value}"
    assert refusal(tree, "demo") == f"no boxes can be made here: {trouble}; {remedy}"


def test_a_machine_that_can_boot_no_other_is_refused_before_anything_is_built(tree: Tree) -> None:
    tree.write("tests/booted/can-boot", "#!/bin/sh\necho no machine can be booted here: no; exit 1\n")
    (tree.root / "tests/booted/can-boot").chmod(0o755)

    assert refusal(tree, "test", "booted") == "no machine can be booted here: no"


def test_a_container_is_no_machine_that_can_boot_another(tree: Tree) -> None:
    tree.copy("tests/booted/can-boot")

    line = refusal(tree, "test", "booted", uid=0)

    assert line.startswith("no machine can be booted here: ") and line.endswith("; use a machine of its own")


def test_a_folder_that_one_may_not_write_to_is_refused(tree: Tree) -> None:
    tree.stand_in("stat", "echo root")
    tree.write("calls", "")
    tree.root.chmod(0o555)

    line = refusal(tree, "demo")

    tree.root.chmod(0o755)
    assert line == "this folder belongs to root and you may not write to it; make a clone of your own"


def test_a_build_by_root_in_a_users_folder_is_refused(tree: Tree) -> None:
    tree.stand_in("stat", "echo anna")

    line = refusal(tree, "demo", uid=0)

    assert line == (
        "this folder belongs to anna; run ./dev as anna, it asks for sudo itself where that is needed"
    )


@pytest.mark.parametrize("command", NEEDS_GIT)
@pytest.mark.parametrize(
    "answer", ["fatal: detected dubious ownership in repository at '/x'", "fatal: not a git repository"]
)
def test_where_git_lists_nothing_nothing_is_checked(tree: Tree, command: str, answer: str) -> None:
    tree.stand_in("git", f'echo "{answer}" >&2; echo "and more" >&2; exit 128')

    assert refusal(tree, command) == f"git lists no sources here: {answer}"


def test_a_tree_that_is_no_clone_is_refused_before_git_is_installed(tree: Tree) -> None:
    tree.take_away("git")

    assert refusal(tree, "lint") == "this is not a git clone, and this command works on what git lists"


@pytest.mark.parametrize("command", ["demo", "test", "lint", "fuzz", "package", "mutate"])
def test_a_full_disk_is_named_beforehand(tree: Tree, command: str) -> None:
    tree.stand_in("df", "echo Avail; echo '   16'")

    line = refusal(tree, command)

    assert line.startswith("this needs about ") and line.endswith("only 16 MB are free there")


def test_a_package_cannot_be_built_under_a_blank(tmp_path: Path) -> None:
    tree = Tree(tmp_path / "vel ks")

    line = refusal(tree, "package")

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
    ended = run_module("sandbox", "demo", VELK_AGENT=agent or str(program_in_tmp))

    assert (ended.returncode, ended.stderr) == (1, f"demo: {line}\n")
