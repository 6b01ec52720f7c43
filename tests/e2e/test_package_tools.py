"""Package tools that hang, crash, cannot be run or print something unexpected."""

from __future__ import annotations

import json
from pathlib import Path

import pytest

from sandbox.machine.commands import Answer
from sandbox.terminal import Terminal
from tests.e2e.software import (
    CHANGE,
    EDITOR,
    PLAYER,
    TOOLS,
    announce,
    install,
    inventory_at_start,
    next_inventory,
    next_upload,
    tool_calls,
)
from tests.e2e.wire import log_lines

TOOL_LIMIT = 30
# What a record says when that tool failed, by the key that it is about.
WHEN_GIVEN_UP = {
    "dpkg": ("package_name", ""),
    "dpkg-query": ("version", "failed"),
    "dpkg-architecture": ("arch", "failed"),
}
WHEN_SILENT = {"dpkg": ("package_name", ""), "dpkg-query": ("version", ""), "dpkg-architecture": ("arch", "")}


def start_with_hung(terminal: Terminal, tool: str) -> tuple[int, int]:
    """Start the agent, which now waits for a tool; the mark before it, and the tool's process."""
    terminal.tools.hold(tool)
    mark = terminal.events.mark()
    terminal.start_agent(ready=lambda: wait_for_call(terminal, tool, mark))
    return mark, wait_for_call(terminal, tool, mark)


def wait_for_call(terminal: Terminal, tool: str, after: int, count: int = 1) -> int:
    """Wait for a call of a tool; its process."""
    call = terminal.events.wait_for(kind="command", target=tool, after=after, count=count)
    return int(call.detail["pid"])


def pass_time(terminal: Terminal, tool: str, seconds: int) -> None:
    """Move the agent's clock and let the agent, which waits for a tool, look at it."""
    terminal.jump(seconds)
    terminal.tools.nudge(tool)


def is_given_up(terminal: Terminal, tool: str) -> bool:
    """Whether the agent has looked at the clock and ended a tool that it waited for.

    It may find another nudge before it looks."""
    return any(terminal.tools.nudge(tool) == 0 for _ in range(5))


def is_running(process: int) -> bool:
    """Whether a process exists that has not ended."""
    try:
        return Path(f"/proc/{process}/stat").read_text().rpartition(")")[2].split()[0] != "Z"
    except FileNotFoundError:
        return False


@pytest.mark.parametrize("tool", TOOLS)
def test_hung_tool_is_given_up_after_its_limit(terminal: Terminal, tool: str) -> None:
    install(terminal, EDITOR)
    mark, _ = start_with_hung(terminal, tool)

    pass_time(terminal, tool, TOOL_LIMIT)

    assert is_given_up(terminal, tool)
    key, value = WHEN_GIVEN_UP[tool]
    assert next_inventory(terminal, mark)[0][key] == value


@pytest.mark.parametrize("tool", TOOLS)
def test_hung_tool_is_ended_once_it_is_given_up(terminal: Terminal, tool: str) -> None:
    install(terminal, EDITOR)
    mark, process = start_with_hung(terminal, tool)

    pass_time(terminal, tool, TOOL_LIMIT)
    next_inventory(terminal, mark)
    terminal.sync()

    assert not is_running(process)


@pytest.mark.parametrize(
    ("tool", "printed", "value"),
    [
        ("dpkg", b"player: /x\n", "player"),
        ("dpkg-query", b"'1'", "failed"),
        ("dpkg-architecture", b"slow\n", "failed"),
    ],
)
def test_what_a_tool_printed_before_it_hung_counts_for_the_package_alone(
    terminal: Terminal, tool: str, printed: bytes, value: str
) -> None:
    install(terminal, EDITOR)
    mark, _ = start_with_hung(terminal, tool)
    terminal.tools.nudge(tool, printed)

    pass_time(terminal, tool, TOOL_LIMIT)

    assert is_given_up(terminal, tool)
    assert next_inventory(terminal, mark)[0][WHEN_GIVEN_UP[tool][0]] == value


@pytest.mark.parametrize("tool", TOOLS)
def test_slow_tool_is_waited_for(terminal: Terminal, tool: str) -> None:
    install(terminal, EDITOR)
    answers = {"dpkg": b"editor: /x\n", "dpkg-query": b"'1'", "dpkg-architecture": b"slow\n"}
    terminal.tools.answer(tool, Answer(stdout=answers[tool]))
    mark, _ = start_with_hung(terminal, tool)

    pass_time(terminal, tool, TOOL_LIMIT - 10)
    terminal.tools.release(tool)

    record = next_inventory(terminal, mark)[0]
    key, value = WHEN_GIVEN_UP[tool]
    assert record[key] not in ("", value)


def test_each_call_has_the_whole_limit(terminal: Terminal) -> None:
    install(terminal, EDITOR, PLAYER)
    mark, _ = start_with_hung(terminal, "dpkg-query")

    for count in (1, 2):
        wait_for_call(terminal, "dpkg-query", mark, count)
        pass_time(terminal, "dpkg-query", TOOL_LIMIT)

    assert [record["version"] for record in next_inventory(terminal, mark)] == ["failed", "failed"]
    assert len(tool_calls(terminal, "dpkg-query", mark)) == 2


def test_what_was_sent_meanwhile_is_handled_afterwards(terminal: Terminal) -> None:
    install(terminal, EDITOR)
    terminal.start_agent()
    terminal.tools.hold("dpkg")
    mark = terminal.events.mark()
    terminal.launcher.announce("deleted", EDITOR)
    wait_for_call(terminal, "dpkg", mark)
    terminal.daemon.push_policy({"type": 5})

    terminal.tools.release("dpkg")
    terminal.events.wait_for(
        lambda event: '"type": 5' in event.args[0], target="policy_service", member="onPolicyMsg", after=mark
    )

    assert next_inventory(terminal, mark)


@pytest.mark.real_time
def test_limit_holds_by_the_clock_on_the_wall(terminal: Terminal) -> None:
    install(terminal, EDITOR)
    mark, process = start_with_hung(terminal, "dpkg-query")

    terminal.events.wait_for(member="onUploadFinished", after=mark, timeout=120)
    terminal.sync()

    assert next_inventory(terminal, mark)[0]["version"] == "failed"
    assert not is_running(process)


@pytest.mark.parametrize("tool", TOOLS)
@pytest.mark.parametrize(
    "answer", [Answer(), Answer(1), Answer(-11), Answer(2, b"", b"error: no\n")], ids=str
)
def test_tool_that_prints_nothing_gives_an_empty_text(terminal: Terminal, tool: str, answer: Answer) -> None:
    install(terminal, EDITOR)
    terminal.tools.answer(tool, answer)

    key, value = WHEN_SILENT[tool]
    assert inventory_at_start(terminal)[0][key] == value


@pytest.mark.parametrize(
    ("tool", "printed", "value"),
    [
        ("dpkg", b"editor", "editor"),
        ("dpkg", b"a: /x\nb: /y\n", "a"),
        ("dpkg", b"::a:b", "a"),
        ("dpkg", b" a : /x", " a "),
        ("dpkg-query", b"'1'", "1"),
        ("dpkg-query", b"'", ""),
        ("dpkg-query", b"''", ""),
        ("dpkg-query", b"abc", "b"),
        ("dpkg-query", b"'1'\n", "1'"),
        ("dpkg-query", b"'" + b"9" * 1_000_000 + b"'", "9" * 1_000_000),
        ("dpkg-architecture", b" \t one two \n\n", "one two"),
    ],
    ids=lambda value: repr(value)[:20],
)
@pytest.mark.parametrize("status", [0, 1, -11])
def test_what_a_tool_prints_counts_however_it_ends(
    terminal: Terminal, tool: str, printed: bytes, value: str, status: int
) -> None:
    install(terminal, EDITOR)
    terminal.tools.answer(tool, Answer(status, printed))

    assert inventory_at_start(terminal)[0][WHEN_SILENT[tool][0]] == value


def test_colons_alone_are_no_package_and_warned_of(terminal: Terminal) -> None:
    terminal.launcher.items = [EDITOR]
    terminal.tools.answer("dpkg", Answer(stdout=b"::"))

    assert inventory_at_start(terminal)[0]["package_name"] == ""
    assert f'get package name failed, desktop: "{EDITOR.path}" "::"' in log_lines(terminal, 0)


@pytest.mark.parametrize("tool", TOOLS)
def test_bytes_that_are_no_text_are_replaced(terminal: Terminal, tool: str) -> None:
    install(terminal, EDITOR)
    terminal.tools.answer(tool, Answer(stdout=b"'a\xff\xfeb'"))

    value = inventory_at_start(terminal)[0][WHEN_SILENT[tool][0]]
    assert value.strip("'") == "a\ufffd\ufffdb"


def test_complaints_are_no_part_of_the_answer(terminal: Terminal) -> None:
    install(terminal, EDITOR)
    terminal.tools.answer("dpkg-query", Answer(stdout=b"'3'", stderr=b"warning: a lot\n" * 20_000))

    assert inventory_at_start(terminal)[0]["version"] == "3"


@pytest.mark.parametrize("tool", TOOLS)
def test_tool_that_cannot_be_run_is_given_up_at_once(terminal: Terminal, tool: str) -> None:
    install(terminal, EDITOR)
    terminal.tools.forbid(tool)

    key, value = WHEN_GIVEN_UP[tool]
    assert inventory_at_start(terminal)[0][key] == value


def test_failed_version_is_reported_with_the_change(session: Terminal) -> None:
    session.packages.install("editor", "1")
    session.tools.forbid("dpkg-query")

    mark = announce(session, "created", EDITOR)

    assert json.loads(next_upload(session, CHANGE, mark))["payload"]["software_version"] == "failed"
