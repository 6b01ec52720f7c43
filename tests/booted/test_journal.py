"""The agent's log in a real journal, also in one that takes nothing."""

from __future__ import annotations

import json

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


def test_entry_says_who_logged_what_and_where(machine: Machine) -> None:
    machine.log_in("alice")
    machine.wait_for_agent("alice")
    machine.push_policy("told once")
    (entry,) = wait_for("the entry", lambda: entries(machine, "told once"))
    assert entry["CODE_FUNC"] == "MessageTransfer::onPolicyMsg"
    assert entry["CODE_FILE"] == "src/velk/velks/message_transfer.cpp"
    assert (entry["PRIORITY"], entry["_UID"]) == ("6", str(USERS["alice"]))
    assert entry["SYSLOG_IDENTIFIER"] == "velks"


def test_burst_of_policies_is_forwarded_whole(machine: Machine) -> None:
    machine.log_in("alice")
    machine.wait_for_agent("alice")
    mark = machine.mark()
    push_many(machine, BURST, '{"type": 5}')
    wait_for("all policies", lambda: machine.count("onPolicyMsg", mark) == BURST, seconds=120)


def test_journal_that_is_frozen_holds_nothing_up(machine: Machine) -> None:
    machine.log_in("alice")
    machine.wait_for_agent("alice")
    machine.run("systemctl", "kill", "--signal=STOP", "systemd-journald")
    mark = machine.mark()
    push_many(machine, MORE_THAN_IT_QUEUES, "no JSON")
    machine.push_policy({"type": 1300})
    machine.wait_for_event(lambda event: event.member == "Notify", mark)
    machine.run("systemctl", "kill", "--signal=CONT", "systemd-journald")
    machine.push_policy("after the frost")
    wait_for("the count of lost lines", lambda: entries(machine, "log lines are lost"))
