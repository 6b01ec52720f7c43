"""Package tools that hang, crash, cannot be run or print something unexpected, and how they are called."""

from __future__ import annotations

from pathlib import Path

import pytest

from sandbox.machine.commands import Answer
from sandbox.terminal import Terminal
from tests.e2e.software import (
    EDITOR,
    PLAYER,
    TOOLS,
    announce,
    install,
    inventory_at_start,
    next_change,
    next_inventory,
    tool_calls,
)
from tests.e2e.wire import log_lines

TOOL_LIMIT = 30
# What a record says by a tool's answer, and what it says if the tool has been given up.
KEYS = {"dpkg": "package_name", "dpkg-query": "version", "dpkg-architecture": "arch"}
GIVEN_UP = {"dpkg": "", "dpkg-query": "failed", "dpkg-architecture": "failed"}


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


@pytest.mark.parametrize(
    ("tool", "printed", "value"),
    [
        ("dpkg", b"", ""),
        ("dpkg", b"player: /x\n", "player"),
        ("dpkg-query", b"", "failed"),
        ("dpkg-query", b"'1'", "failed"),
        ("dpkg-architecture", b"", "failed"),
        ("dpkg-architecture", b"slow\n", "failed"),
    ],
)
def test_hung_tool_is_given_up_after_its_limit_and_ended(
    stocked: Terminal, tool: str, printed: bytes, value: str
) -> None:
    """What it printed before counts for the package alone."""
    mark, process = start_with_hung(stocked, tool)
    stocked.tools.nudge(tool, printed)

    pass_time(stocked, tool, TOOL_LIMIT)

    assert is_given_up(stocked, tool)
    assert next_inventory(stocked, mark)[0][KEYS[tool]] == value
    stocked.sync()
    assert not is_running(process)


@pytest.mark.parametrize("tool", TOOLS)
def test_slow_tool_is_waited_for(stocked: Terminal, tool: str) -> None:
    answers = {"dpkg": b"editor: /x\n", "dpkg-query": b"'1'", "dpkg-architecture": b"slow\n"}
    stocked.tools.answer(tool, Answer(stdout=answers[tool]))
    mark, _ = start_with_hung(stocked, tool)

    pass_time(stocked, tool, TOOL_LIMIT - 10)
    stocked.tools.release(tool)

    assert next_inventory(stocked, mark)[0][KEYS[tool]] not in ("", GIVEN_UP[tool])


def test_each_call_has_the_whole_limit(terminal: Terminal) -> None:
    install(terminal, EDITOR, PLAYER)
    mark, _ = start_with_hung(terminal, "dpkg-query")

    for count in (1, 2):
        wait_for_call(terminal, "dpkg-query", mark, count)
        pass_time(terminal, "dpkg-query", TOOL_LIMIT)

    assert [record["version"] for record in next_inventory(terminal, mark)] == ["failed", "failed"]
    assert len(tool_calls(terminal, "dpkg-query", mark)) == 2


def test_what_was_sent_meanwhile_is_handled_afterwards(stocked: Terminal) -> None:
    stocked.start_agent()
    stocked.tools.hold("dpkg")
    mark = stocked.events.mark()
    stocked.launcher.announce("deleted", EDITOR)
    wait_for_call(stocked, "dpkg", mark)
    stocked.daemon.push_policy({"type": 5})

    stocked.tools.release("dpkg")
    stocked.events.wait_for(
        lambda event: '"type": 5' in event.args[0], target="policy_service", member="onPolicyMsg", after=mark
    )

    assert next_inventory(stocked, mark)


@pytest.mark.real_time
def test_limit_holds_by_the_clock_on_the_wall(stocked: Terminal) -> None:
    mark, process = start_with_hung(stocked, "dpkg-query")

    stocked.events.wait_for(member="onUploadFinished", after=mark, timeout=120)
    stocked.sync()

    assert next_inventory(stocked, mark)[0]["version"] == "failed"
    assert not is_running(process)


@pytest.mark.parametrize(
    ("tool", "printed", "value"),
    [
        ("dpkg", b"", ""),
        ("dpkg", b"editor", "editor"),
        ("dpkg", b"a: /x\nb: /y\n", "a"),
        ("dpkg", b"::a:b", "a"),
        ("dpkg", b" a : /x", " a "),
        ("dpkg", b"a\xff\xfeb", "a\ufffd\ufffdb"),
        ("dpkg-query", b"", ""),
        ("dpkg-query", b"'1'", "1"),
        ("dpkg-query", b"'", ""),
        ("dpkg-query", b"''", ""),
        ("dpkg-query", b"abc", "b"),
        ("dpkg-query", b"'1'\n", "1'"),
        ("dpkg-query", b"'" + b"9" * 1_000_000 + b"'", "9" * 1_000_000),
        ("dpkg-query", b"'a\xff\xfeb'", "a\ufffd\ufffdb"),
        ("dpkg-architecture", b"", ""),
        ("dpkg-architecture", b" \t one two \n\n", "one two"),
        ("dpkg-architecture", b"a\xff\xfeb", "a\ufffd\ufffdb"),
    ],
    ids=lambda value: repr(value)[:20],
)
@pytest.mark.parametrize(
    ("status", "complaint"),
    [(0, b""), (1, b"error: no\n"), (-11, b""), (0, b"warning: a lot\n" * 20_000)],
    ids=["well", "failing", "crashing", "complaining"],
)
def test_what_a_tool_prints_counts_however_it_ends(
    stocked: Terminal, tool: str, printed: bytes, value: str, status: int, complaint: bytes
) -> None:
    stocked.tools.answer(tool, Answer(status, printed, complaint))

    assert inventory_at_start(stocked)[0][KEYS[tool]] == value


def test_colons_alone_are_no_package_and_warned_of(terminal: Terminal) -> None:
    terminal.launcher.items = [EDITOR]
    terminal.tools.answer("dpkg", Answer(stdout=b"::"))

    assert inventory_at_start(terminal)[0]["package_name"] == ""
    assert f'get package name failed, desktop: "{EDITOR.path}" "::"' in log_lines(terminal, 0)


@pytest.mark.parametrize("tool", TOOLS)
def test_tool_that_cannot_be_run_is_given_up_at_once(stocked: Terminal, tool: str) -> None:
    stocked.tools.forbid(tool)

    assert inventory_at_start(stocked)[0][KEYS[tool]] == GIVEN_UP[tool]


def test_failed_version_is_reported_with_the_change(session: Terminal) -> None:
    session.packages.install("editor", "1")
    session.tools.forbid("dpkg-query")

    mark = announce(session, "created", EDITOR)

    assert next_change(session, mark)["software_version"] == "failed"


def languages(terminal: Terminal, tool: str) -> list[str | None]:
    """LC_ALL of each call of a recorded tool."""
    calls = terminal.events.all(kind="command", target=tool)
    return [call.detail["environment"].get("LC_ALL") for call in calls]


def start_recorded(terminal: Terminal, language: str | None = None) -> None:
    """Start the agent in a session of this language; each call of a tool is recorded."""
    for tool in TOOLS:
        terminal.tools.record(tool)
    terminal.start_agent(extra_env={"LC_ALL": language} if language else {})


@pytest.fixture
def two_items(terminal: Terminal) -> Terminal:
    """A terminal with two packages that the launcher lists."""
    install(terminal, EDITOR, PLAYER)
    return terminal


@pytest.mark.parametrize("language", [None, "zh_CN.UTF-8"])
def test_tools_speak_plainly_once_a_version_was_asked_for(two_items: Terminal, language: str | None) -> None:
    start_recorded(two_items, language)

    announce(two_items, "deleted", EDITOR)

    assert languages(two_items, "dpkg-architecture") == [language, "C"]
    assert languages(two_items, "dpkg") == [language, "C", "C", "C", "C"]
    assert languages(two_items, "dpkg-query") == [language, "C", "C", "C", "C"]


@pytest.mark.parametrize("language", [None, "zh_CN.UTF-8"])
def test_item_without_a_package_leaves_the_language_to_the_sessions(
    terminal: Terminal, language: str | None
) -> None:
    install(terminal, PLAYER)
    terminal.launcher.items = [EDITOR, PLAYER]
    start_recorded(terminal, language)

    assert languages(terminal, "dpkg") == [language] * 2
    assert languages(terminal, "dpkg-query") == [language]


def test_tools_are_called_in_the_order_of_the_items(two_items: Terminal) -> None:
    start_recorded(two_items)

    calls = [(event.target, *event.args) for event in two_items.events.all(kind="command")]
    assert calls == [
        ("dpkg-architecture", "-q", "DEB_HOST_ARCH_CPU"),
        ("dpkg", "-S", EDITOR.path),
        ("dpkg-query", "-W", "-f='${Version}'", "editor"),
        ("dpkg", "-S", PLAYER.path),
        ("dpkg-query", "-W", "-f='${Version}'", "player"),
    ]


def test_version_is_looked_up_before_the_change_is_reported(two_items: Terminal) -> None:
    start_recorded(two_items)
    mark = announce(two_items, "created", EDITOR)

    commands = two_items.events.all(kind="command", after=mark)
    asked = two_items.events.wait_for(member="GetMachineID", after=mark)
    assert [event.target for event in commands if event.time < asked.time] == ["dpkg", "dpkg-query"]
