"""The process itself: its log, its command line, its environment, its end."""

from __future__ import annotations

import pytest

from sandbox.machine.users import User
from sandbox.terminal import Terminal
from tests.e2e.wire import FIVE_MINUTES, log_lines, next_status, push, start_agent


def test_log_calls_carry_file_line_and_function(session: Terminal) -> None:
    mark = push(session, "no JSON")
    session.sync()
    entry = session.events.all(kind="log", after=mark)[0]
    assert entry.member == "info"
    assert entry.detail["file"] == "src/velk/velks/message_transfer.cpp"
    assert entry.detail["line"] > 0
    assert "MessageTransfer::onPolicyMsg" in entry.detail["function"]


@pytest.mark.parametrize(
    ("beginning", "level"),
    [
        ("getCurrentLoginUser getusername:", "info"),
        ("---getusername:", "info"),
        ("onPolicyMsg ---------payload:", "info"),
        ("velkg restart sendonline", "debug"),
        ("get screenSaver state", "debug"),
        ("get screenLocked state", "debug"),
        ("sendUID :", "debug"),
    ],
)
def test_line_is_logged_at_its_level(terminal: Terminal, beginning: str, level: str) -> None:
    mark = start_agent(terminal)
    terminal.daemon.push_online()
    terminal.daemon.push_policy({"type": 1202, "payload": {"uid": 7}})
    terminal.sync()
    lines = terminal.events.all(lambda event: event.args[0].startswith(beginning), kind="log", after=mark)
    assert {line.member for line in lines} == {level}


@pytest.mark.parametrize(
    ("name", "language", "plain"), [("@@zhang@wei", "C", "@zhang@wei"), ("张伟é", "C.UTF-8", "张伟é")]
)
def test_login_name_is_logged_as_it_is_and_without_its_first_at_sign(
    terminal: Terminal, name: str, language: str, plain: str
) -> None:
    """It is read in the encoding of the locale."""
    terminal.files.write_accounts(User(name, terminal.user.uid))
    terminal.start_agent(extra_env={"LANG": language})
    assert [line for line in log_lines(terminal, 0) if "getusername:" in line] == [
        f'getCurrentLoginUser getusername: "{name}"',
        f'---getusername: "{name}"',
        f'---getusername: "{plain}"',
    ]


def test_user_without_account_entry_has_an_empty_login_name(terminal: Terminal) -> None:
    terminal.files.write_accounts()
    mark = start_agent(terminal)
    assert [line for line in log_lines(terminal, mark) if "getusername:" in line] == [
        '---getusername: ""',
        '---getusername: ""',
    ]
    assert next_status(terminal, mark) == (1, "zhang.wei")


def test_arguments_are_not_read(terminal: Terminal) -> None:
    mark = terminal.events.mark()
    terminal.agent.start(terminal.clock, extra_argv=["--help", "--version", "--test"])
    assert next_status(terminal, mark) == (1, "zhang.wei")


def test_binary_knows_no_variable_of_ours(terminal: Terminal) -> None:
    assert b"VELK_" not in terminal.agent.binary.read_bytes()


def test_no_services_at_all_do_not_keep_the_agent_from_running(terminal: Terminal) -> None:
    for fake in terminal.fakes.values():
        fake.leave()
    terminal.start_agent()
    terminal.daemon.appear()
    mark = terminal.events.mark()
    terminal.advance(FIVE_MINUTES)
    assert next_status(terminal, mark) == (1, "")


def test_memory_of_many_policies_is_given_back(session: Terminal) -> None:
    payload = '{"type":5,"text":"' + "x" * 10000 + '"}'

    def resident_after(policies: int) -> int:
        for _ in range(policies):
            mark = push(session, payload)
            session.events.wait_for(target="policy_service", member="onPolicyMsg", after=mark)
        return session.agent.resident_bytes()

    warm = resident_after(500)
    assert resident_after(2000) - warm < 2000 * len(payload) / 10
