"""How the package tools are called: in which language, and in which order."""

from __future__ import annotations

from typing import Any

import pytest

from sandbox.terminal import Terminal
from tests.e2e.software import EDITOR, PLAYER, TOOLS, announce, install


def languages(terminal: Terminal, tool: str) -> list[str | None]:
    """LC_ALL of each call of a recorded tool."""
    calls = terminal.events.all(kind="command", target=tool)
    return [call.detail["environment"].get("LC_ALL") for call in calls]


def start_recorded(terminal: Terminal, **environment: Any) -> None:
    """Start the agent with two items; each call of a tool is recorded."""
    install(terminal, EDITOR, PLAYER)
    record_and_start(terminal, environment)


def record_and_start(terminal: Terminal, environment: dict[str, str]) -> None:
    """Start the agent with these variables; each call of a tool is recorded."""
    for tool in TOOLS:
        terminal.tools.record(tool)
    terminal.start_agent(extra_env=environment)


def test_every_version_but_the_first_is_asked_for_in_plain_language(terminal: Terminal) -> None:
    start_recorded(terminal)

    announce(terminal, "deleted", EDITOR)

    assert languages(terminal, "dpkg-query") == [None, "C", "C", "C", "C"]


def test_first_version_is_asked_for_in_the_sessions_language(terminal: Terminal) -> None:
    start_recorded(terminal, LC_ALL="zh_CN.UTF-8")

    assert languages(terminal, "dpkg-query") == ["zh_CN.UTF-8", "C"]


@pytest.mark.parametrize("environment", [{}, {"LC_ALL": "zh_CN.UTF-8"}], ids=["none", "Chinese"])
def test_item_without_a_package_leaves_the_language_to_the_sessions(
    terminal: Terminal, environment: dict[str, str]
) -> None:
    install(terminal, PLAYER)
    terminal.launcher.items = [EDITOR, PLAYER]
    record_and_start(terminal, environment)

    assert languages(terminal, "dpkg") == [environment.get("LC_ALL")] * 2
    assert languages(terminal, "dpkg-query") == [environment.get("LC_ALL")]


def test_other_tools_speak_plainly_once_a_version_was_asked_for(terminal: Terminal) -> None:
    start_recorded(terminal)

    assert languages(terminal, "dpkg") == [None, "C"]
    assert languages(terminal, "dpkg-architecture") == [None]


def test_tools_are_called_in_the_order_of_the_items(terminal: Terminal) -> None:
    start_recorded(terminal)

    calls = [(event.target, *event.args) for event in terminal.events.all(kind="command")]
    assert calls == [
        ("dpkg-architecture", "-q", "DEB_HOST_ARCH_CPU"),
        ("dpkg", "-S", EDITOR.path),
        ("dpkg-query", "-W", "-f='${Version}'", "editor"),
        ("dpkg", "-S", PLAYER.path),
        ("dpkg-query", "-W", "-f='${Version}'", "player"),
    ]


def test_version_is_looked_up_before_the_change_is_reported(terminal: Terminal) -> None:
    start_recorded(terminal)
    mark = announce(terminal, "created", EDITOR)

    commands = terminal.events.all(kind="command", after=mark)
    asked = terminal.events.wait_for(member="GetMachineID", after=mark)
    assert [event.target for event in commands if event.time < asked.time] == ["dpkg", "dpkg-query"]
