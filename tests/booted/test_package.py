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

pytestmark = pytest.mark.quick

NAME = "velk-session-agent"
COMPILER = re.compile(r"(gcc|g\+\+|cpp|clang|llvm|tcc)(-|$)|(make|binutils|dpkg-dev|build-essential)$")


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
def machine(machine: Machine) -> Iterator[Machine]:
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
    machine: Machine, newer: Path
) -> None:
    machine.run("systemctl", "start", f"user@{USERS['bob']}.service")  # a manager without a session
    machine.log_in("alice")
    machine.log_in("zhang@corp.example", "autostart")
    machine.log_in("@li", kind="tty", seat="")
    sessions = machine.session_names()
    for package in (newer, PACKAGE):
        old = {user: machine.wait_for_agent(user) for user in ("alice", "zhang@corp.example")}
        machine.install(package)
        for user, pid in old.items():
            fresh = machine.wait_for_agent(user, other_than=pid)
            assert program_of(machine, fresh) == "/usr/bin/velks"
        assert machine.agents() == [USERS["alice"], USERS["zhang@corp.example"]]
    assert machine.session_names() == sessions
    machine.run("systemctl", "stop", f"user@{USERS['bob']}.service")


def test_upgrade_leaves_an_agent_alone_that_is_about_to_end_its_session(
    session: Machine, newer: Path
) -> None:
    agent = session.agent("alice")
    mark = session.mark()
    session.push_policy({"type": 1201})
    session.wait_for_event(lambda event: event.member == "Notify", mark)
    wait_for("the countdown in the unit's status", lambda: session.unit("StatusText"))
    printed = session.install(newer)
    assert "velks of user 1000 carries out a policy that ends the session; it is not restarted" in printed
    assert session.agent("alice") == agent
    assert "runs an older program than the one installed" in session.said("velks-check", user="alice")


def test_removal_ends_the_agents_and_their_start_and_a_new_log_in_brings_them_back(machine: Machine) -> None:
    machine.log_in("alice", "autostart")
    machine.log_in("bob")
    sessions = machine.session_names()
    for user in ("alice", "bob"):
        machine.wait_for_agent(user)
    machine.run("dpkg", "--remove", NAME)
    wait_for("the agents' end", lambda: not machine.agents())
    assert machine.session_names() == sessions
    entry = machine.log_in("alice", "autostart", seat="")  # the entry is configuration, which stays
    machine.run("systemctl", "--user", "restart", "booted-desktop.target", user="bob")
    assert machine.unit("LoadState", "bob") == "not-found"
    assert machine.agents() == []
    machine.log_out(entry)
    machine.install(PACKAGE)
    machine.end_sessions()
    machine.log_in("bob")
    machine.wait_for_agent("bob")


def test_installation_after_a_removal_starts_no_agent_by_itself(machine: Machine) -> None:
    session = machine.log_in("alice")
    old = machine.wait_for_agent("alice")
    machine.run("dpkg", "--remove", NAME)
    machine.install(PACKAGE)
    assert (machine.agents(), machine.session_names()) == ([], [session.name])
    machine.run("systemctl", "--user", "start", "velks", user="alice")
    machine.wait_for_agent("alice", other_than=old)


def test_installation_on_a_bare_system_draws_in_no_compiler(machine: Machine, tmp_path: Path) -> None:
    nothing = tmp_path / "status"
    nothing.touch()
    plan = machine.overlay.apt("-o", f"Dir::State::status={nothing}", "--simulate", "install", str(PACKAGE))
    names = re.findall(r"(?m)^Inst (\S+)", plan)
    assert {NAME, "polkitd", "libpam-systemd"} <= set(names)
    assert [name for name in names if COMPILER.match(name) and not name.endswith("-base")] == []


def test_removal_reports_a_countdown_that_it_drops(machine: Machine) -> None:
    session = machine.log_in("alice")
    machine.wait_for_agent("alice")
    machine.push_policy({"type": 1201})
    wait_for("the countdown in the unit's status", lambda: machine.unit("StatusText"))
    printed = machine.run("dpkg", "--remove", NAME).stdout
    assert "velks of user 1000 was about to end the session by a policy; that is dropped" in printed
    assert session.name in machine.session_names()


def test_purge_leaves_nothing(session: Machine) -> None:
    session.run("dpkg", "--purge", NAME)
    assert session.agents() == []
    left = session.said(
        "find", "/etc", "/usr", "/var/lib/systemd", "-path", "*velks*", "-not", "-path", "*/booted*"
    )
    assert left == ""


def test_mask_holds_over_an_upgrade(machine: Machine, newer: Path) -> None:
    machine.run("systemctl", "--global", "mask", "velks.service")
    machine.install(newer)
    for way in ("target", "autostart"):
        session = machine.log_in("alice", way)
        machine.run("systemctl", "--user", "start", "default.target", user="alice")
        assert machine.agents() == []
        machine.log_out(session)


def test_installed_units_are_understood_also_with_the_example_of_a_drop_in(machine: Machine) -> None:
    machine.run(
        *["install", "-D", "--mode=644", f"/usr/share/doc/{NAME}/examples/hardening.conf"],
        "/etc/systemd/user/velks.service.d/hardening.conf",
    )
    machine.log_in("alice")
    agent = machine.wait_for_agent("alice")
    assert "NoNewPrivs:\t1" in machine.said("cat", f"/proc/{agent}/status")
    units = ["velks.service", "velks-session@1.path", "velks-session@1.service"]
    verified = machine.run("systemd-analyze", "--user", "--man=no", "verify", *units, user="alice")
    assert (verified.stdout, verified.stderr) == ("", "")
    machine.run("rm", "-r", "/etc/systemd/user/velks.service.d")
