"""The box keeps the host out of sight and out of reach."""

from __future__ import annotations

import os
import subprocess
from pathlib import Path

import pytest

from sandbox import REPOSITORY
from sandbox.machine import layout
from sandbox.machine.users import LOCAL_USER, current_user
from sandbox.terminal import Terminal


def test_etc_holds_nothing_but_the_terminals_own_files() -> None:
    found = {str(path.relative_to("/etc")) for path in Path("/etc").iterdir()}

    own = {"group", "hosts", "machine-id", "nsswitch.conf", "passwd", "velk"}
    assert found - own <= {"alternatives", "ld.so.cache", "ssl"}


@pytest.mark.parametrize("kind", ["CapPrm", "CapEff", "CapAmb"])
def test_programs_have_no_power_over_the_box(kind: str) -> None:
    status = dict(line.split(":\t") for line in Path("/proc/self/status").read_text().splitlines())

    assert int(status[kind], 16) == 0


@pytest.mark.parametrize("folder", ["/", "/usr", "/usr/share", str(REPOSITORY)])
def test_the_system_is_read_only(folder: str) -> None:
    with pytest.raises(OSError, match="Read-only|Permission denied"):
        (Path(folder) / "box-was-here").touch()


@pytest.mark.parametrize("folder", [layout.CONFIG, layout.SCRIPTS, layout.VELK_STATE, layout.PRYG_STATE])
def test_the_daemons_folders_are_writable(folder: Path) -> None:
    fresh = folder / "box-was-here"
    fresh.touch()
    fresh.unlink()


def test_programs_see_the_boxs_user() -> None:
    shown = subprocess.run(["id", "-un"], capture_output=True, text=True, check=True).stdout.strip()

    assert (shown, os.getuid()) == (current_user().name, current_user().uid)


@pytest.mark.local_user
def test_a_local_box_belongs_to_the_local_user() -> None:
    assert current_user() == LOCAL_USER


def test_files_are_as_before_after_a_reset(terminal: Terminal) -> None:
    default = layout.USERINFO.read_bytes()
    terminal.files.write_userinfo("not json")
    (Path(current_user().home) / "left-over").touch()

    terminal.files.reset()

    assert (layout.USERINFO.read_bytes(), os.listdir(current_user().home)) == (default, [])
