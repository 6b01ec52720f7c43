"""Fixtures of the tests on a machine that really boots; `./dev test booted` runs them as root.

    VELK_PACKAGE=build/booted/velk-session-agent_0.1.0_amd64.deb \\
        unshare --mount --pid --fork --kill-child --mount-proc \\
        /usr/bin/python3 -m pytest --confcutdir=tests/booted tests/booted

In namespaces of its own no process and no mount is left behind, whatever happens to the tests. Each worker of
pytest boots a machine for itself.
"""

from __future__ import annotations

import os
import secrets
from pathlib import Path
from typing import Iterator

import pytest

from tests.booted.machine import USERS, Machine
from tests.booted.platform import Platform

PACKAGE = Path(os.environ["VELK_PACKAGE"])
DROP_IN = "/run/systemd/user/velks.service.d"
_FASTER = 20
_FAST_CLOCK = f"""[Service]
Environment=LD_PRELOAD=%s
Environment="FAKETIME=+0 x{_FASTER}"
"""


def pytest_collection_modifyitems(items: list[pytest.Item]) -> None:
    """What takes minutes begins first."""
    items.sort(key=lambda item: item.get_closest_marker("outlasting") is None)


def boot(folder: Path) -> Machine:
    """A machine with the package installed while it runs."""
    machine = Machine(f"terminal-{secrets.token_hex(4)}", folder / "console.log")
    machine.install(PACKAGE)
    return machine


@pytest.fixture(scope="session")
def booted(tmp_path_factory: pytest.TempPathFactory) -> Iterator[Machine]:
    """The machine, booted once for all tests."""
    machine = boot(tmp_path_factory.mktemp("machine"))
    yield machine
    machine.close()


@pytest.fixture
def machine(booted: Machine) -> Iterator[Machine]:
    """The machine with nobody logged in."""
    yield booted
    booted.end_sessions()


@pytest.fixture
def session(machine: Machine) -> Machine:
    """The machine with alice's agent at work."""
    machine.log_in("alice")
    machine.wait_for_agent("alice")
    return machine


@pytest.fixture
def hasty(machine: Machine) -> Iterator[Machine]:
    """A machine whose agents live twenty times as fast, so that a countdown takes three seconds."""
    library = machine.said("sh", "-c", "echo /usr/lib/*/faketime/libfaketime.so.1")
    machine.write(f"{DROP_IN}/clock.conf", _FAST_CLOCK % library)
    yield machine
    machine.end_sessions()
    machine.run("rm", "-rf", DROP_IN)


@pytest.fixture
def lingering(machine: Machine) -> Iterator[Machine]:
    """A machine where alice's service manager runs without a log-in, as where it lingers."""
    machine.run("systemctl", "start", f"user@{USERS['alice']}.service")
    machine.wait_for_manager("alice")
    yield machine
    machine.run("systemctl", "stop", f"user@{USERS['alice']}.service")


@pytest.fixture
def inhibited(machine: Machine) -> Iterator[None]:
    """A program of root's holds a block inhibitor, as package managers do: no reboot is permitted."""
    inhibitor = ["systemd-inhibit", "--what=shutdown", "--mode=block", "sleep", "infinity"]
    machine.run("systemd-run", "--quiet", "--unit=inhibitor", *inhibitor)
    yield
    machine.end_sessions()
    machine.run("systemctl", "stop", "inhibitor", check=False)  # it has gone if the machine has rebooted


@pytest.fixture
def no_policy_kit(machine: Machine) -> Iterator[None]:
    """The bus and the login manager find no policy kit, as where it is not installed."""
    service = "/usr/share/dbus-1/system-services/org.freedesktop.PolicyKit1.service"
    machine.run("mv", service, f"{service}.away")
    machine.reload_bus()
    machine.run("systemctl", "stop", "polkit")
    yield
    machine.run("mv", f"{service}.away", service)
    machine.reload_bus()


@pytest.fixture
def platform(machine: Machine, tmp_path: Path) -> Iterator[Platform]:
    """The platform, whose server is to be started."""
    fresh = Platform(machine, tmp_path)
    yield fresh
    machine.end_sessions()
    fresh.close()
