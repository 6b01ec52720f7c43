"""Software on the terminal, and what the agent reports of it to the daemon."""

from __future__ import annotations

import json
from typing import Any

from sandbox.fakes.launcher import LauncherItem
from sandbox.machine import layout
from sandbox.machine.packages import desktop_file
from sandbox.terminal import Terminal
from tests.e2e.wire import start_agent

INVENTORY = "https://%1:%2/uim/v3/client/upload_info"
CHANGE = "https://%1:%2/uim/v3/client/upinfo_log"

# What the agent logs last before it reports an inventory, with the number of records.
LISTED = "SoftwareGuard::getSoftwareList()--- "

EDITOR = LauncherItem(desktop_file("editor"), "Editor")
PLAYER = LauncherItem(desktop_file("player"), "播放器")
TOOLS = ["dpkg", "dpkg-query", "dpkg-architecture"]


def install(terminal: Terminal, *items: LauncherItem) -> None:
    """Install a package for each item, named like its desktop file, in version 1, 2 and so on; the launcher
    lists them."""
    for number, item in enumerate(items, 1):
        name = item.path.rpartition("/")[2].removesuffix(".desktop")
        terminal.packages.install(name, str(number))
    terminal.launcher.items = list(items)


def uploads(terminal: Terminal, after: int = 0) -> list[tuple[str, str]]:
    """Address and text of each report since a mark."""
    events = terminal.events.all(member="onUploadFinished", after=after)
    return [(str(url), str(text)) for url, text in (event.args for event in events)]


def next_upload(terminal: Terminal, url: str, after: int = 0, count: int = 1) -> str:
    """Text of the `count`th report to an address since a mark; waits for it."""
    return terminal.events.wait_for(
        lambda event: event.args[0] == url,
        source="velks",
        target="daemon",
        member="onUploadFinished",
        after=after,
        count=count,
    ).args[1]


def next_inventory(terminal: Terminal, after: int = 0, count: int = 1) -> list[dict[str, Any]]:
    """Records of the `count`th inventory since a mark; waits for it."""
    return json.loads(next_upload(terminal, INVENTORY, after, count))["payload"]["list"]


def next_change(terminal: Terminal, after: int = 0, count: int = 1) -> dict[str, Any]:
    """What the `count`th single change since a mark says; waits for it."""
    return json.loads(next_upload(terminal, CHANGE, after, count))["payload"]


def inventory_at_start(terminal: Terminal) -> list[dict[str, Any]]:
    """Start the agent; the records of its first inventory."""
    mark = start_agent(terminal)
    return next_inventory(terminal, mark)


def announce(terminal: Terminal, action: str, item: LauncherItem) -> int:
    """Let the launcher announce a change and wait until the agent has dealt with it; the mark before it."""
    mark = terminal.events.mark()
    terminal.launcher.announce(action, item)
    terminal.events.wait_for(lambda event: event.args[0].startswith(LISTED), kind="log", after=mark)
    terminal.sync()
    return mark


def tool_calls(terminal: Terminal, name: str, after: int = 0) -> list[tuple[str, ...]]:
    """Arguments of each call of a recorded package tool since a mark."""
    return [event.args for event in terminal.events.all(kind="command", target=name, after=after)]


def now() -> str:
    """The agent's time, as reports show it."""
    return layout.CLOCK.read_text().strip()
