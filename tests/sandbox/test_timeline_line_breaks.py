"""Long values go on in the next line between their parts."""

from __future__ import annotations

import io

import pytest
from rich.cells import cell_len
from rich.console import Console

from sandbox.terminal import Terminal
from sandbox.timeline.agent_time import AgentTime
from sandbox.timeline.line_breaks import breakable
from sandbox.timeline.timeline import Timeline


@pytest.mark.parametrize(
    ("text", "shown"),
    [
        ("short words stay", "short words stay"),
        ("EntryAdded /com/norix/Dock/entries/e1", "EntryAdded /com/norix/Dock/\nentries/e1"),
        ("com.norix.kpx.Notification", "com.norix.kpx.\nNotification"),
        ("withoutanypartsatall", "withoutanypartsa\ntall"),
        ("a关机重启注销锁屏解锁", "a关机重启注销锁\n屏解锁"),
        ("关机/重启/注销/锁屏/解锁", "关机/重启/注销/\n锁屏/解锁"),
    ],
)
def test_a_word_that_is_too_wide_is_broken_between_its_parts(text: str, shown: str) -> None:
    assert breakable(text, 16) == shown


@pytest.mark.parametrize("width", [80, 120])
@pytest.mark.parametrize(
    "value",
    ["withoutanyblank" * 8, "关机重启注销锁屏解锁" * 8, "a/关机_重启." * 12],
    ids=["narrow", "wide", "mixed"],
)
def test_a_value_without_blanks_is_shown_whole_and_keeps_to_its_column(
    terminal: Terminal, width: int, value: str
) -> None:
    shown = io.StringIO()
    Timeline(terminal.events, AgentTime(0), [Console(file=shown, width=width)])

    terminal.events.record("daemon", "velks", "signal", "Said", (value,))

    lines = shown.getvalue().splitlines()
    assert max(cell_len(line) for line in lines) <= width
    assert {line[:36].strip() for line in lines[1:]} == {""}
    assert value in "".join(line[36:].strip() for line in lines)
