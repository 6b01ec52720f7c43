"""velks-check says in plain words whether the session's agent can work, and changes nothing."""

from __future__ import annotations

import json
from pathlib import Path
from typing import Callable

import pytest

from sandbox.machine import layout
from sandbox.machine.files import DEFAULT_USERINFO
from sandbox.terminal import Terminal
from tests.e2e.checkreport import binary, findings, run_check

# What it asks the services: nothing that would change them.
QUESTIONS = [
    *[("daemon", "GetMachineID"), ("logind", "Get"), ("identity", "Get")],
    *[("logind", "Get")] * 4,  # of the session
    ("logind", "CanReboot"),
]


def test_session_that_lacks_nothing_is_good(working: Terminal) -> None:
    found = findings(working)
    assert found.worse_than_good() == []
    assert (found.status, found.result) == (0, "good")
    assert found.line("user").text == "domain user @zhang.wei, uid 20001"
    assert found.line("platform").text == "answers and accepts this terminal"


@pytest.mark.local_user
def test_local_session_that_lacks_nothing_is_good_and_asks_no_platform(working: Terminal) -> None:
    found = findings(working)
    assert found.worse_than_good() == []
    assert found.status == 0
    assert found.line("user").text.startswith("local user operator, uid 1000: ")
    assert found.line("platform").text == "not needed for a local user"
    assert not found.subjects() & {"platform address", "terminal certificate", "terminal key"}


@pytest.mark.local_user
def test_information_file_is_not_vital_for_a_local_user(working: Terminal) -> None:
    layout.USERINFO.unlink()
    found = findings(working)
    assert (found.status, found.line("information file").result) == (1, "warning")


def test_text_report_has_a_marked_line_per_finding_and_a_conclusion(working: Terminal) -> None:
    working.files.write_machine_id("")
    working.screensaver.leave()
    ended = run_check(working)
    *lines, conclusion = ended.stdout.splitlines()
    known = [(subject, line) for subject, line in findings(working).lines]
    marked = [f"{f'[{line.result}]':9} {subject}: {line.text}" for subject, line in known]
    assert lines == marked
    assert {line.split()[0] for line in lines} == {"[good]", "[warning]", "[bad]"}
    assert conclusion == "The agent cannot do its work in this session; see the lines marked as bad."
    assert (ended.returncode, ended.stderr) == (2, "")


def test_warnings_alone_are_exit_status_1(working: Terminal) -> None:
    working.screensaver.leave()
    ended = run_check(working)
    assert ended.returncode == 1
    assert ended.stdout.splitlines()[-1].endswith("only part of its work in this session; see the warnings.")


def test_user_without_account_entry_is_bad(working: Terminal) -> None:
    working.files.write_accounts()
    found = findings(working)
    assert found.line("user").result == "bad"
    assert "uid 20001 has no account entry" in found.line("user").text


def unreadable(file: Path) -> None:
    """The user may not read the file."""
    file.chmod(0)


@pytest.mark.parametrize(
    ("path", "subject", "result"),
    [
        (layout.USERINFO, "information file", "bad"),
        (layout.RESTORE_SCRIPT, "restore", "warning"),
        (layout.BACKUP_CONFIG, "restore", "warning"),
        (layout.SERVER_CERTIFICATE, "platform authority", "bad"),
        (layout.CLIENT_CERTIFICATE, "terminal certificate", "bad"),
        (layout.CLIENT_KEY, "terminal key", "bad"),
    ],
    ids=str,
)
@pytest.mark.parametrize(
    ("spoil", "reason"), [(Path.unlink, "No such file or directory"), (unreadable, "Permission denied")]
)
def test_file_that_cannot_be_read_is_named_with_the_reason(
    working: Terminal, path: Path, subject: str, result: str, spoil: Callable[[Path], None], reason: str
) -> None:
    spoil(path)
    assert findings(working).line(subject, f"{path} cannot be read ({reason})").result == result


def test_machine_identifier_that_is_missing_is_bad(terminal: Terminal) -> None:
    layout.MACHINE_ID.unlink()
    assert findings(terminal).line("machine identifier", "cannot be read").result == "bad"


@pytest.mark.parametrize(
    ("identifier", "result"), [("abc-1", "good"), ("", "bad"), ("abc\ndef", "warning"), ("a b", "warning")]
)
def test_machine_identifier_is_one_word(terminal: Terminal, identifier: str, result: str) -> None:
    terminal.files.write_machine_id(identifier)
    assert findings(terminal).line("machine identifier").result == result


NO_OBJECT = f"{layout.USERINFO} holds no JSON object"


@pytest.mark.parametrize(
    ("content", "subject", "result", "text"),
    [
        ("", "information file", "bad", f"{NO_OBJECT} (illegal value"),
        ('{"server_host": "a"', "information file", "bad", f"{NO_OBJECT} (unterminated string"),
        ("[]", "information file", "bad", f"{NO_OBJECT} (another kind of JSON"),
        ("{}", "platform address", "bad", "the information file names no server_host"),
        ("{}", "platform", "bad", "cannot be reached: its address is unknown"),
        (
            '{"server_host": "a", "server_port": "84430"}',
            "platform address",
            "bad",
            'server_port "84430" is no port number',
        ),
        ('{"is_Domain": false}', "domain", "warning", "the terminal is in no domain"),
        ('{"is_Domain": true}', "domain", "good", "the terminal is in a domain"),
        ("{}", "domain", "warning", "the information file does not say whether the terminal is in a domain"),
        ('{"is_Domain": true}', "terminal name", "warning", "the information file names none"),
    ],
)
def test_information_file_is_judged_by_its_content(
    terminal: Terminal, content: str, subject: str, result: str, text: str
) -> None:
    terminal.files.write_userinfo(content)
    line = findings(terminal).line(subject)
    assert line.result == result
    assert line.text.startswith(text)


def test_changes_nothing(working: Terminal) -> None:
    older = {**DEFAULT_USERINFO, "server_host": layout.PLATFORM_HOST, "server_ip": "10.0.0.1"}
    del older["domain_host"]
    working.files.write_userinfo(json.dumps({**older, "server_port": str(working.platform.port)}))
    uid = working.user.plain_name
    working.platform.post_message(uid, "T", "C")
    before = {path: path.read_bytes() for path in layout.CONFIG.iterdir()}
    working.sync()
    mark = working.events.mark()

    assert findings(working).status == 0

    assert {path: path.read_bytes() for path in layout.CONFIG.iterdir()} == before
    assert [message["read_at"] for message in working.platform.messages(uid)] == [""]
    calls = [(event.target, event.member) for event in working.events.all(kind="call", after=mark)]
    assert calls == QUESTIONS
    assert [event.member for event in working.events.all(kind="http", after=mark)] == ["list"]


@pytest.mark.parametrize("arguments", [["--nonsense"], ["something"], ["--json", "something"]])
def test_wrong_usage_is_no_result(terminal: Terminal, arguments: list[str]) -> None:
    ended = run_check(terminal, *arguments)
    assert ended.returncode == 3
    assert ended.stdout == ""
    assert ended.stderr == "velks-check: wrong usage; see velks-check --help\n"


def test_help_names_the_exit_statuses(terminal: Terminal) -> None:
    ended = run_check(terminal, "--help")
    assert ended.returncode == 0
    assert "Exit status: 0 good, 1 warnings, 2 bad, 3 wrong usage." in ended.stdout
    assert terminal.events.all(kind="http") == []
    assert binary(terminal).name in ended.stdout
