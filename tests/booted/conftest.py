"""Fixtures of the tests on a machine that really boots; `./dev test booted` runs them as root.

    VELK_PACKAGE=build/booted/velk-session-agent_0.1.0_amd64.deb \\
        unshare --mount --pid --fork --kill-child --mount-proc \\
        /usr/bin/python3 -m pytest --confcutdir=tests/booted tests/booted

In namespaces of its own nothing is left behind, whatever happens to the tests.
"""

from __future__ import annotations

import os
import secrets
from pathlib import Path
from typing import Iterator

import pytest

from tests.booted.machine import Machine

PACKAGE = Path(os.environ["VELK_PACKAGE"])


@pytest.fixture(scope="session")
def booted(tmp_path_factory: pytest.TempPathFactory) -> Iterator[Machine]:
    """The machine, booted once for all tests, with the package installed while it ran."""
    machine = Machine(f"terminal-{secrets.token_hex(4)}", tmp_path_factory.mktemp("machine") / "console.log")
    machine.install(PACKAGE)
    yield machine
    machine.close()


@pytest.fixture
def machine(booted: Machine) -> Iterator[Machine]:
    """The machine with nobody logged in."""
    yield booted
    booted.end_sessions()
