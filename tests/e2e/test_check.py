"""velks-check says in plain words whether the session's agent can work, and changes nothing."""

from __future__ import annotations

import json
from pathlib import Path

import pytest

from sandbox.machine import layout
from sandbox.machine.files import DEFAULT_USERINFO
from sandbox.terminal import Terminal
from tests.e2e.checkreport import binary, make_all_well, report, run


# What it asks the services: nothing that would change them.
QUESTIONS = [
    *[("daemon", "GetMachineID"), ("logind", "Get"), ("identity", "Get")],
    *[("logind", "Get")] * 4,  # of the session
    ("logind", "CanReboot"),
]


def test_session_that_lacks_nothing_is_good(terminal: Terminal) -> None:
    make_all_well(terminal)
    found = report(terminal)
    assert found.worse_than_good() == []
    assert (found.status, found.result) == (0, "good")
    assert found.line("user").text == "domain user @zhang.wei, uid 20001"
    assert found.line("platform").text == "answers and accepts this terminal"


@pytest.mark.local_user
def test_local_session_that_lacks_nothing_is_good_and_asks_no_platform(terminal: Terminal) -> None:
    make_all_well(terminal)
    found = report(terminal)
    assert found.worse_than_good() == []
    assert found.status == 0
    assert found.line("user").text.startswith("local user operator, uid 1000: ")
    assert found.line("platform").text == "not needed for a local user"
    assert not found.subjects() & {"platform address", "terminal certificate", "terminal key"}


@pytest.mark.local_user
def test_information_file_is_not_vital_for_a_local_user(terminal: Terminal) -> None:
    make_all_well(terminal)
    terminal.files.remove(layout.USERINFO)
    found = report(terminal)
    assert (found.status, found.line("information file").result) == (1, "warning")


def test_text_report_has_a_marked_line_per_finding_and_a_conclusion(terminal: Terminal) -> None:
    make_all_well(terminal)
    terminal.files.write_machine_id("")
    terminal.screensaver.leave()
    ended = run(terminal)
    *lines, conclusion = ended.stdout.splitlines()
    known = [(subject, line) for subject, line in report(terminal).lines]
    marked = [f"{f'[{line.result}]':9} {subject}: {line.text}" for subject, line in known]
    assert lines == marked
    assert {line.split()[0] for line in lines} == {"[good]", "[warning]", "[bad]"}
    assert conclusion == "The agent cannot do its work in this session; see the lines marked as bad."
    assert (ended.returncode, ended.stderr) == (2, "")


def test_warnings_alone_are_exit_status_1(terminal: Terminal) -> None:
    make_all_well(terminal)
    terminal.screensaver.leave()
    ended = run(terminal)
    assert ended.returncode == 1
    assert ended.stdout.splitlines()[-1].endswith("only part of its work in this session; see the warnings.")


def test_user_without_account_entry_is_bad(terminal: Terminal) -> None:
    make_all_well(terminal)
    terminal.files.write_accounts()
    found = report(terminal)
    assert found.line("user").result == "bad"
    assert "uid 20001 has no account entry" in found.line("user").text


@pytest.mark.parametrize(
    ("content", "reason"),
    [
        (b"", "holds no JSON object (illegal value"),
        (b'{"server_host": "a"', "holds no JSON object (unterminated string"),
        (b"[]", "holds no JSON object (another kind of JSON"),
    ],
)
def test_information_file_that_is_no_json_object_is_bad(
    terminal: Terminal, content: bytes, reason: str
) -> None:
    terminal.files.write_userinfo(content)
    found = report(terminal)
    assert found.status == 2
    assert found.line("information file").result == "bad"
    assert reason in found.line("information file").text


def test_information_file_that_is_missing_is_bad(terminal: Terminal) -> None:
    terminal.files.remove(layout.USERINFO)
    assert report(terminal).line("information file", "No such file").result == "bad"


def test_unreadable_information_file_is_bad(terminal: Terminal) -> None:
    layout.USERINFO.chmod(0)
    assert report(terminal).line("information file", "Permission denied").result == "bad"


def test_address_of_the_platform_is_needed(terminal: Terminal) -> None:
    found = report(terminal)  # the default file names none
    assert found.line("platform address", "names no server_host").result == "bad"
    assert found.line("platform", "address is unknown").result == "bad"


def test_port_that_is_none_is_bad(terminal: Terminal) -> None:
    terminal.files.write_userinfo(json.dumps({"server_host": "a", "server_port": "84430"}))
    assert report(terminal).line("platform address").text == 'server_port "84430" is no port number'


@pytest.mark.parametrize(
    ("keys", "result", "text"),
    [
        ({"is_Domain": False}, "warning", "the terminal is in no domain"),
        ({"is_Domain": True}, "good", "the terminal is in a domain"),
        ({}, "warning", "the information file does not say whether the terminal is in a domain"),
    ],
)
def test_domain_of_the_terminal(terminal: Terminal, keys: dict[str, bool], result: str, text: str) -> None:
    terminal.files.write_userinfo(json.dumps(keys))
    line = report(terminal).line("domain")
    assert (line.result, line.text) == (result, text)


def test_terminal_without_a_name_is_a_warning(terminal: Terminal) -> None:
    terminal.files.write_userinfo(json.dumps({"is_Domain": True}))
    assert report(terminal).line("terminal name").result == "warning"


@pytest.mark.parametrize(
    ("identifier", "result"), [("abc-1", "good"), ("", "bad"), ("abc\ndef", "warning"), ("a b", "warning")]
)
def test_machine_identifier_is_one_word(terminal: Terminal, identifier: str, result: str) -> None:
    terminal.files.write_machine_id(identifier)
    assert report(terminal).line("machine identifier").result == result


def test_machine_identifier_that_is_missing_is_bad(terminal: Terminal) -> None:
    terminal.files.remove(layout.MACHINE_ID)
    assert report(terminal).line("machine identifier", "cannot be read").result == "bad"


@pytest.mark.parametrize("path", [layout.RESTORE_SCRIPT, layout.BACKUP_CONFIG])
def test_file_that_the_exit_restores_from_is_a_warning_where_it_is_missing(
    terminal: Terminal, path: Path
) -> None:
    make_all_well(terminal)
    terminal.files.remove(path)
    line = report(terminal).line("restore", "cannot be read")
    assert (line.result, line.text.split()[0]) == ("warning", str(path))


def test_changes_nothing(terminal: Terminal) -> None:
    make_all_well(terminal)
    older = {**DEFAULT_USERINFO, "server_host": layout.PLATFORM_HOST, "server_ip": "10.0.0.1"}
    del older["domain_host"]
    terminal.files.write_userinfo(json.dumps({**older, "server_port": str(terminal.platform.port)}))
    uid = terminal.user.plain_name
    terminal.platform.post_message(uid, "T", "C")
    before = {path: path.read_bytes() for path in layout.CONFIG.iterdir()}
    terminal.sync()
    mark = terminal.events.mark()

    assert report(terminal).status == 0

    assert {path: path.read_bytes() for path in layout.CONFIG.iterdir()} == before
    assert [message["read_at"] for message in terminal.platform.messages(uid)] == [""]
    calls = [(event.target, event.member) for event in terminal.events.all(kind="call", after=mark)]
    assert calls == QUESTIONS
    assert [event.member for event in terminal.events.all(kind="http", after=mark)] == ["list"]


@pytest.mark.parametrize("arguments", [["--nonsense"], ["something"], ["--json", "something"]])
def test_wrong_usage_is_no_result(terminal: Terminal, arguments: list[str]) -> None:
    ended = run(terminal, *arguments)
    assert ended.returncode == 3
    assert ended.stdout == ""
    assert ended.stderr == "velks-check: wrong usage; see velks-check --help\n"


def test_help_names_the_exit_statuses(terminal: Terminal) -> None:
    ended = run(terminal, "--help")
    assert ended.returncode == 0
    assert "Exit status: 0 good, 1 warnings, 2 bad, 3 wrong usage." in ended.stdout
    assert terminal.events.all(kind="http") == []
    assert binary(terminal).name in ended.stdout
