"""A command that is interrupted ends with all that it started, and begins nothing more."""

from __future__ import annotations

import os
import signal
import subprocess
from select import select
from typing import IO, Iterator

import pytest

from tests.dev.devtree import Tree
from tests.dev.otherroot import let_roots_be_made

_PATIENCE = 60.0
_TIDYING = ("sudo chown", "chown", "sudo rm")
_HANGS = "echo running >&$HELD; sleep 1000"
# Handles Ctrl+C, and then ends like any other program that failed.
_HANGING_MODULE = """import os, signal, sys
signal.pthread_sigmask(signal.SIG_BLOCK, [signal.SIGINT])
os.write(int(os.environ["HELD"]), b"running\\n")
signal.sigwait([signal.SIGINT])
sys.exit(2)
"""
_MODULES = {
    "demo": "sandbox/__main__",
    "box": "sandbox/__main__",
    "soak": "sandbox/__main__",
    "picture": "sandbox/__main__",
    "sanitize memory": "sandbox/__main__",
    "test": "pytest",
    "test dev": "pytest",
    "test e2e": "pytest",
    "sanitize address": "pytest",
    "coverage": "pytest",
    "bench": "bench/__main__",
    "fuzz": "tests/fuzz/run",
    "mutate": "tests/mutation/mutate",
}
_PROGRAMS = {
    "setup": "apt-get",
    "build": "cmake",
    "test unit": "ctest",
    "sanitize thread": "ctest",
    "lint": "mypy",
    "format": "black",
    "diagrams": "dot",
    "package": "dpkg-buildpackage",
    "elsewhere trixie": "debootstrap",
    "elsewhere bookworm worker": "worker",
}


@pytest.fixture
def pipe() -> Iterator[tuple[IO[bytes], IO[bytes]]]:
    """Its second end is with every process of the command."""
    reading, writing = os.pipe()
    with os.fdopen(reading, "rb", 0) as first, os.fdopen(writing, "wb", 0) as second:
        yield first, second


def read(pipe: IO[bytes]) -> bytes:
    """What comes next, nothing once no process is left that holds the other end."""
    assert select([pipe], [], [], _PATIENCE)[0], "nothing has begun, or a process is left"
    return pipe.read(100)


@pytest.mark.parametrize("number", [signal.SIGINT, signal.SIGTERM], ids=lambda number: str(number.name))
@pytest.mark.parametrize("command", [*_MODULES, *_PROGRAMS])
def test_an_interrupted_command_ends_with_all_that_it_started(
    tree: Tree, pipe: tuple[IO[bytes], IO[bytes]], command: str, number: signal.Signals
) -> None:
    let_roots_be_made(tree)
    if command in _MODULES:
        tree.write(f"{_MODULES[command]}.py", _HANGING_MODULE)
    else:
        tree.stand_in(_PROGRAMS[command], _HANGS)
    tree.write("build/coverage/counters", "")
    if command == "setup":
        tree.stand_in("dpkg-query", "exit 1")
    tree.extra = {"HELD": str(pipe[1].fileno())}

    running = subprocess.Popen(
        tree.command(*command.split()),
        cwd=tree.root,
        env=tree.environment,
        stdin=subprocess.DEVNULL,
        stdout=subprocess.DEVNULL,
        stderr=subprocess.DEVNULL,
        start_new_session=True,
        pass_fds=[pipe[1].fileno()],
    )
    try:
        pipe[1].close()
        assert read(pipe[0]) == b"running\n"
        calls = tree.calls()
        os.killpg(running.pid, number)
        assert read(pipe[0]) == b""
    except AssertionError:
        os.killpg(running.pid, signal.SIGKILL)
        raise
    finally:
        running.wait()

    assert running.returncode in (2, 128 + number, -number)
    begun = [call for call in tree.calls()[len(calls) :] if not call.startswith(_TIDYING)]
    assert begun == []
    assert {file.suffix for file in tree.root.glob("build/elsewhere/*.*")} <= {".debs", ".log", ".tar"}
