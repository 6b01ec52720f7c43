"""The package in its life on a terminal where people work: no session ends, and no agent is left behind."""

from __future__ import annotations

import re
import subprocess
from pathlib import Path
from typing import Iterator

import pytest

from tests.booted.conftest import PACKAGE
from tests.booted.machine import USERS, Machine
from tests.booted.patience import wait_for

NAME = "velk-session-agent"


@pytest.fixture(scope="session")
def newer(tmp_path_factory: pytest.TempPathFactory) -> Path:
    """The same package as a later version."""
    folder = tmp_path_factory.mktemp("newer")
    subprocess.run(["dpkg-deb", "--raw-extract", PACKAGE, folder / "tree"], check=True)
    control = folder / "tree" / "DEBIAN" / "control"
    control.write_text(re.sub(r"(?m)^Version: .*", "Version: 9.0", control.read_text()))
    package = folder / "newer.deb"
    subprocess.run(
        ["dpkg-deb", "--root-owner-group", "--build", "-Znone", folder / "tree", package], check=True
    )
    return package


@pytest.fixture
def terminal(machine: Machine) -> Iterator[Machine]:
    """The machine, with the package as it was once the test is over."""
    yield machine
    machine.end_sessions()
    machine.run("systemctl", "--global", "unmask", "velks.service")
    machine.run("dpkg", "--purge", NAME)
    machine.install(PACKAGE)


def program_of(machine: Machine, pid: int) -> str:
    """What a process runs."""
    return machine.said("readlink", f"/proc/{pid}/exe")


def test_upgrade_and_downgrade_renew_each_running_agent_and_start_no_other(
    terminal: Machine, newer: Path
) -> None:
    terminal.run("systemctl", "start", f"user@{USERS['bob']}.service")  # a manager without a session
    terminal.log_in("alice")
    terminal.log_in("zhang@corp.example", "autostart")
    terminal.log_in("@li", kind="tty", seat="")
    sessions = terminal.session_names()
    for package in (newer, PACKAGE):
        old = {user: terminal.wait_for_agent(user) for user in ("alice", "zhang@corp.example")}
        terminal.install(package)
        for user, pid in old.items():
            fresh = terminal.wait_for_agent(user, other_than=pid)
            assert program_of(terminal, fresh) == "/usr/bin/velks"
        assert terminal.agents() == [USERS["alice"], USERS["zhang@corp.example"]]
    assert terminal.session_names() == sessions
    terminal.run("systemctl", "stop", f"user@{USERS['bob']}.service")


def test_upgrade_leaves_an_agent_alone_that_is_about_to_end_its_session(
    terminal: Machine, newer: Path
) -> None:
    terminal.log_in("alice")
    agent = terminal.wait_for_agent("alice")
    mark = terminal.mark()
    terminal.push_policy({"type": 1201})
    terminal.wait_for_event(lambda event: event.member == "Notify", mark)
    wait_for("the countdown in the unit's status", lambda: status_of(terminal))
    told = terminal.install(newer)
    assert "velks of user 1000 carries out a policy that ends the session; it is not restarted" in told
    assert terminal.agent("alice") == agent
    assert "runs an older program than the one installed" in terminal.said("velks-check", user="alice")


def status_of(machine: Machine) -> str:
    """What the service manager shows of alice's agent."""
    return machine.said(
        "systemctl", "--user", "show", "velks", "--property=StatusText", "--value", user="alice"
    )


def test_removal_ends_the_agents_and_their_start_and_a_new_log_in_brings_them_back(terminal: Machine) -> None:
    terminal.log_in("alice", "autostart")
    terminal.log_in("bob")
    sessions = terminal.session_names()
    for user in ("alice", "bob"):
        terminal.wait_for_agent(user)
    terminal.run("dpkg", "--remove", NAME)
    wait_for("the agents' end", lambda: not terminal.agents())
    assert terminal.session_names() == sessions
    entry = terminal.log_in("alice", "autostart", seat="")  # the entry is configuration, which stays
    terminal.run("systemctl", "--user", "restart", "booted-desktop.target", user="bob")
    assert "not-found" in terminal.said(
        "systemctl", "--user", "show", "velks", "--property=LoadState", user="bob"
    )
    assert terminal.agents() == []
    terminal.log_out(entry)
    terminal.install(PACKAGE)
    terminal.end_sessions()
    terminal.log_in("bob")
    terminal.wait_for_agent("bob")


def test_removal_tells_of_a_countdown_that_it_drops(terminal: Machine) -> None:
    session = terminal.log_in("alice")
    terminal.wait_for_agent("alice")
    terminal.push_policy({"type": 1201})
    wait_for("the countdown in the unit's status", lambda: status_of(terminal))
    told = terminal.run("dpkg", "--remove", NAME).stdout
    assert "velks of user 1000 was about to end the session by a policy; that is dropped" in told
    assert session.name in terminal.session_names()


def test_purge_leaves_nothing(terminal: Machine) -> None:
    terminal.log_in("alice")
    terminal.wait_for_agent("alice")
    terminal.run("dpkg", "--purge", NAME)
    assert terminal.agents() == []
    left = terminal.said(
        "find", "/etc", "/usr", "/var/lib/systemd", "-path", "*velks*", "-not", "-path", "*/booted*"
    )
    assert left == ""


def test_mask_holds_over_an_upgrade(terminal: Machine, newer: Path) -> None:
    terminal.run("systemctl", "--global", "mask", "velks.service")
    terminal.install(newer)
    for way in ("target", "autostart"):
        session = terminal.log_in("alice", way)
        terminal.run("systemctl", "--user", "start", "default.target", user="alice")
        assert terminal.agents() == []
        terminal.log_out(session)


def test_installed_units_are_understood_also_with_the_example_of_a_drop_in(terminal: Machine) -> None:
    terminal.run(
        *["install", "-D", "--mode=644", f"/usr/share/doc/{NAME}/examples/hardening.conf"],
        "/etc/systemd/user/velks.service.d/hardening.conf",
    )
    terminal.log_in("alice")
    agent = terminal.wait_for_agent("alice")
    assert "NoNewPrivs:\t1" in terminal.said("cat", f"/proc/{agent}/status")
    units = ["velks.service", "velks-session@1.path", "velks-session@1.service"]
    verified = terminal.run("systemd-analyze", "--user", "--man=no", "verify", *units, user="alice")
    assert (verified.stdout, verified.stderr) == ("", "")
    terminal.run("rm", "-r", "/etc/systemd/user/velks.service.d")
