"""velks-check says in plain words whether the session's agent can work, and changes nothing."""

from __future__ import annotations

import json
import os
import shutil
import subprocess
from pathlib import Path

import pytest

from sandbox.machine import layout
from sandbox.machine.commands import Answer
from sandbox.machine.files import DEFAULT_USERINFO
from sandbox.terminal import Terminal
from tests.e2e.checkreport import Line, binary, make_all_well, report, run


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
    assert ended.stdout.splitlines()[-1].endswith("but not all of its work; see the warnings.")


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


def test_information_file_that_nobody_may_read_is_bad(terminal: Terminal) -> None:
    layout.USERINFO.chmod(0)
    assert report(terminal).line("information file", "Permission denied").result == "bad"


def test_address_of_the_platform_is_needed(terminal: Terminal) -> None:
    found = report(terminal)  # the default file names none
    assert found.line("platform address", "names no server_host").result == "bad"
    assert found.line("platform", "address is not known").result == "bad"


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


@pytest.mark.parametrize(
    ("fake", "result"),
    [
        ("daemon", "bad"),
        ("logind", "bad"),
        ("identity", "warning"),
        ("policy_service", "warning"),
        ("notifications", "bad"),
        ("screensaver", "warning"),
        ("session_manager", "warning"),
        ("dock", "warning"),
        ("launcher", "warning"),
    ],
)
def test_service_that_is_absent_is_named_with_what_follows(
    terminal: Terminal, fake: str, result: str
) -> None:
    terminal.fakes[fake].leave()
    found = report(terminal)
    line = found.line("service", "is not there: ")
    assert (line.result, line.text.split()[0]) == (result, terminal.fakes[fake].bus_name)
    assert len([name for name, _ in found.lines if name == "service"]) == len(terminal.fakes)


@pytest.mark.parametrize("kind", ["system", "session"])
def test_bus_that_cannot_be_reached_is_one_bad_line(terminal: Terminal, kind: str) -> None:
    found = report(terminal, env={f"DBUS_{kind.upper()}_BUS_ADDRESS": "unix:path=/nowhere"})
    assert found.line(f"{kind} bus", "cannot be reached: ").result == "bad"
    assert found.status == 2


@pytest.mark.parametrize("tool", ["dpkg", "dpkg-query", "dpkg-architecture"])
def test_package_tool_that_does_not_run_is_a_warning(terminal: Terminal, tool: str) -> None:
    terminal.tools.forbid(tool)
    lines = [line for subject, line in report(terminal).lines if subject == "package tool"]
    broken = [line.text for line in lines if line.result == "warning"]
    assert len(lines) == 3
    assert [text.split()[0].rpartition("/")[2] for text in broken] == [tool]


@pytest.mark.parametrize(
    ("answer", "result", "text"),
    [
        (Answer(3, b"failed\n"), "bad", "velks.service has failed; see journalctl --user -u velks"),
        (
            Answer(3, b"inactive\n"),
            "warning",
            "velks.service is inactive; start it with systemctl --user start velks",
        ),
        (Answer(1), "warning", "there is no user service manager to ask"),
    ],
)
def test_unit_that_is_not_active(terminal: Terminal, answer: Answer, result: str, text: str) -> None:
    terminal.commands.answer("systemctl", answer)
    line = report(terminal).line("unit")
    assert (line.result, line.text) == (result, text)
    calls = terminal.events.all(kind="command", member="systemctl")
    assert [call.args for call in calls] == [("--user", "is-active", "velks.service")]


def test_agent_that_does_not_run_is_bad(terminal: Terminal) -> None:
    assert report(terminal).line("agent").text == "does not run"
    assert report(terminal).line("agent").result == "bad"


def test_second_agent_is_bad(terminal: Terminal) -> None:
    make_all_well(terminal)
    with subprocess.Popen([terminal.agent.binary], stderr=subprocess.DEVNULL) as second:
        line = report(terminal).line("agent")
        second.terminate()
    assert (line.result, line.text) == ("bad", "runs 2 times; there must be one")


def test_agent_whose_program_was_replaced_is_a_warning(terminal: Terminal, tmp_path: Path) -> None:
    installed = terminal.agent.binary
    terminal.agent.binary = Path(shutil.copy(installed, tmp_path / "velks"))
    terminal.start_agent()
    assert agent_line(terminal, installed).text == "runs"
    os.replace(shutil.copy(installed, tmp_path / "newer"), tmp_path / "velks")
    line = agent_line(terminal, installed)
    assert line.result == "warning"
    assert line.text.startswith(
        "runs an older program than the one installed; systemctl --user restart velks"
    )


def agent_line(terminal: Terminal, installed: Path) -> Line:
    """What the installed check program says of an agent that was started elsewhere."""
    started, terminal.agent.binary = terminal.agent.binary, installed
    found = report(terminal).line("agent")
    terminal.agent.binary = started
    return found


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
    assert terminal.events.all(kind="call", after=mark) == []
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
