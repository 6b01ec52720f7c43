"""Where the log goes: to the journal under a service manager, to standard error anywhere else."""

from __future__ import annotations

from pathlib import Path
from typing import Iterator

import pytest

from sandbox.terminal import Terminal
from tests.e2e.journal import Journal, service
from tests.e2e.wire import carries_out_policies

PLAIN = {"QT_MESSAGE_PATTERN": "%{if-category}%{category}: %{endif}%{message}"}


MORE_THAN_A_JOURNAL_QUEUES = 1500


@pytest.fixture
def journal() -> Iterator[Journal]:
    """A journal that takes entries."""
    opened = Journal()
    yield opened
    opened.close()


@pytest.fixture
def as_service(terminal: Terminal, journal: Journal, tmp_path: Path) -> Terminal:
    """A terminal whose agent runs as a unit of a service manager and has announced the session."""
    terminal.agent.binary = service(terminal.agent.binary, tmp_path)
    terminal.start_agent(
        ready=lambda: terminal.events.wait_for(target="daemon", member="SendUserStatus"), extra_env=PLAIN
    )
    return terminal


def test_entry_has_text_priority_file_line_and_function(as_service: Terminal, journal: Journal) -> None:
    as_service.daemon.push_policy('no JSON, 中文\nand a second "line"')
    entry = journal.wait_for("onPolicyMsg ---------payload:")
    assert entry["MESSAGE"] == r'onPolicyMsg ---------payload: "no JSON, 中文\nand a second \"line\""'
    assert entry["PRIORITY"] == "6"
    assert entry["CODE_FILE"] == "src/velk/velks/message_transfer.cpp"
    assert int(entry["CODE_LINE"]) > 0
    assert entry["CODE_FUNC"] == "MessageTransfer::onPolicyMsg"
    assert entry["SYSLOG_IDENTIFIER"] == "velks"
    assert as_service.agent.log == ""


def test_function_inside_a_namespace_has_its_name(as_service: Terminal, journal: Journal) -> None:
    assert journal.wait_for("getCurrentLoginUser")["CODE_FUNC"] == "{anonymous}::getCurrentLoginUser"


@pytest.mark.parametrize(
    ("text", "priority"),
    [("velkg restart sendonline", "7"), ("--@@@@--", "4"), ("----HandleEvent::sendMessage----", "6")],
)
def test_level_is_the_priority(as_service: Terminal, journal: Journal, text: str, priority: str) -> None:
    as_service.notifications.leave()
    as_service.daemon.push_online()
    as_service.daemon.push_policy({"type": 1300})  # the service is absent: a warning
    as_service.daemon.push_policy({"type": 1200})  # a notification with an action
    assert journal.wait_for(text)["PRIORITY"] == priority


def test_line_too_long_for_a_datagram_arrives_whole(as_service: Terminal, journal: Journal) -> None:
    payload = "x" * 5_000_000
    as_service.daemon.push_policy(payload)
    assert journal.wait_for("payload:")["MESSAGE"] == f'onPolicyMsg ---------payload: "{payload}"'


def test_log_stays_on_a_standard_error_that_is_not_the_journals(
    terminal: Terminal, journal: Journal, tmp_path: Path
) -> None:
    """A child of a service inherits the variable; its standard error may lead elsewhere."""
    terminal.agent.binary = service(terminal.agent.binary, tmp_path, stream="0")
    terminal.start_agent()
    assert '---getusername: "@zhang.wei"' in terminal.agent.log


def test_journal_that_has_gone_does_not_stop_the_agent(as_service: Terminal, journal: Journal) -> None:
    journal.close()
    carries_out_policies(as_service)


def test_journal_that_comes_back_takes_lines_again(as_service: Terminal, journal: Journal) -> None:
    journal.close()
    back = Journal()
    as_service.daemon.push_policy("to the new journal")
    assert "to the new journal" in back.wait_for("onPolicyMsg")["MESSAGE"]
    back.close()


def test_journal_that_hangs_blocks_nothing_and_learns_how_much_it_missed(
    as_service: Terminal, journal: Journal
) -> None:
    mark = as_service.events.mark()
    for _ in range(MORE_THAN_A_JOURNAL_QUEUES):
        as_service.daemon.push_policy("no JSON")
    as_service.daemon.push_policy({"type": 1300})
    as_service.events.wait_for(member="Notify", after=mark)

    journal.wait_for("getCurrentLoginUser")  # makes room
    as_service.daemon.push_policy("no JSON")
    lost = journal.wait_for("log lines are lost")
    assert 0 < int(lost["MESSAGE"].split()[0]) <= MORE_THAN_A_JOURNAL_QUEUES + 10
    assert lost["MESSAGE"].endswith("log lines are lost, the journal did not take them")
    assert lost["PRIORITY"] == "4"
    assert "no JSON" in journal.wait_for("onPolicyMsg")["MESSAGE"]
    assert as_service.agent.log == ""
