"""The agent's log in a real journal, also in one that takes nothing."""

from __future__ import annotations

import json

import pytest

from tests.booted.machine import USERS, Machine
from tests.booted.patience import wait_for

BURST = 10_000
MORE_THAN_IT_QUEUES = 1_000


def entries(machine: Machine, text: str) -> list[dict[str, str]]:
    """The agent's entries with this text, oldest first."""
    output = machine.said(
        "journalctl", "--boot", "--output=json", "_SYSTEMD_USER_UNIT=velks.service", f"--grep={text}"
    )
    return [json.loads(line) for line in output.splitlines()]


def push_many(machine: Machine, count: int, text: str) -> None:
    """Have the daemon broadcast a text as a policy, again and again."""
    machine.command_daemon(
        "EmitMany", str(count), "/com/norix/velk/velkg", "com.norix.velk.velkg", "pushPolicyMsg", "", text
    )


@pytest.mark.quick
def test_entry_says_who_logged_what_and_where(session: Machine) -> None:
    session.push_policy("logged once")
    (entry,) = wait_for("the entry", lambda: entries(session, "logged once"))
    assert entry["CODE_FUNC"] == "MessageTransfer::onPolicyMsg"
    assert entry["CODE_FILE"] == "src/velk/velks/message_transfer.cpp"
    assert (entry["PRIORITY"], entry["_UID"]) == ("6", str(USERS["alice"]))
    assert entry["SYSLOG_IDENTIFIER"] == "velks"


# Who asks, as options of setpriv, and whether alice's lines are for them.
READERS = {
    "--reuid=1000 --regid=1000 --clear-groups": True,
    "--reuid=1001 --regid=1001 --clear-groups": False,
    "--reuid=1001 --regid=1001 --groups=adm": True,
    "--reuid=1001 --regid=1001 --groups=systemd-journal": True,
}


@pytest.mark.quick
@pytest.mark.parametrize("reader", READERS)
def test_lines_are_for_the_user_and_administrators(session: Machine, reader: str) -> None:
    session.push_policy("a secret")
    wait_for("the entry", lambda: entries(session, "a secret"))
    asked = ["journalctl", "--quiet", "--boot", "--output=cat", "_SYSTEMD_USER_UNIT=velks.service"]
    assert ("a secret" in session.said("setpriv", *reader.split(), *asked)) == READERS[reader]


def test_burst_of_policies_is_forwarded_whole(session: Machine) -> None:
    mark = session.mark()
    push_many(session, BURST, '{"type": 5}')
    wait_for("all policies", lambda: session.count("onPolicyMsg", mark) == BURST, seconds=240)


def test_journal_that_is_frozen_holds_nothing_up(session: Machine) -> None:
    session.run("systemctl", "kill", "--signal=STOP", "systemd-journald")
    mark = session.mark()
    push_many(session, MORE_THAN_IT_QUEUES, "no JSON")
    session.push_policy({"type": 1300})
    session.wait_for_event(lambda event: event.member == "Notify", mark)
    session.run("systemctl", "kill", "--signal=CONT", "systemd-journald")
    session.push_policy("after the frost")
    wait_for("the count of lost lines", lambda: entries(session, "log lines are lost"))
