"""Notifications find their way from the box to the person's own desktop."""

from __future__ import annotations

import io
import json
import os
import queue
import subprocess
from typing import Any, Sequence

import dbus
import dbus.service
import pytest

from sandbox.bus.mainloop import MainLoop
from sandbox.policies import POLICIES
from sandbox.prompt.session import mirror
from sandbox.terminal import Terminal

_NAME = "org.freedesktop.Notifications"
_RELAY = """
import sys
from sandbox.prompt.main import desktop_relay
relay = desktop_relay()
relay and relay(sys.stdin.buffer)
"""
_SECONDS = 20


class FakeDesktop(dbus.service.Object):
    """A desktop's notification service that keeps what it was asked to show."""

    def __init__(self, connection: Any, capabilities: Sequence[str]) -> None:
        self.shown: queue.Queue[tuple[Any, ...]] = queue.Queue()
        self._capabilities = dbus.Array(capabilities, signature="s")
        super().__init__(connection, "/org/freedesktop/Notifications")
        connection.request_name(_NAME)

    @dbus.service.method(_NAME, in_signature="", out_signature="as")
    def GetCapabilities(self) -> Any:
        """As set."""
        return self._capabilities

    @dbus.service.method(_NAME, in_signature="susssasa{sv}i", out_signature="u")
    def Notify(
        self,
        app_name: str,
        replaces: int,
        icon: str,
        summary: str,
        body: str,
        actions: list[str],
        hints: dict[str, Any],
        timeout: int,
    ) -> int:
        """Keep it."""
        self.shown.put((app_name, replaces, icon, summary, body, actions, hints, timeout))
        return 1


def _relay(address: str, body: str) -> subprocess.CompletedProcess[str]:
    """Relay a notification to a person's own session bus, here the terminal's."""
    line = json.dumps({"app_name": "app", "summary": "summary", "body": body, "timeout": 5}) + "\n"
    env = {**os.environ, "DBUS_SESSION_BUS_ADDRESS": address}
    command = ["/usr/bin/python3", "-P", "-c", _RELAY]
    return subprocess.run(command, env=env, input=line, capture_output=True, text=True)


def test_a_notification_leaves_the_box_as_a_line(terminal: Terminal) -> None:
    stream = io.BytesIO()
    mirror(terminal, stream)
    terminal.start_agent()

    terminal.daemon.push_policy({"type": 1300})
    terminal.sync()

    (line,) = stream.getvalue().splitlines()
    assert json.loads(line) == {
        "app_name": "提醒",
        "summary": "提醒",
        "body": POLICIES[1300].notice,
        "timeout": 0,
    }


@pytest.mark.parametrize(
    ("capabilities", "shown"),
    [([], "终端 <1> & 2"), (["body", "body-markup"], "终端 &lt;1&gt; &amp; 2")],
    ids=["plain text", "markup"],
)
def test_a_line_becomes_a_notification_on_the_desktop_without_markup(
    terminal: Terminal, capabilities: list[str], shown: str
) -> None:
    desktop = MainLoop.call(FakeDesktop, terminal.session_bus.connect(), capabilities)

    ended = _relay(terminal.session_bus.address, "终端 <1> & 2")

    assert (ended.returncode, ended.stderr) == (0, "")
    app_name, replaces, _, summary, body, actions, hints, timeout = desktop.shown.get(timeout=_SECONDS)
    assert (app_name, replaces, summary, body, timeout) == ("app", 0, "summary", shown, 5)
    assert (list(actions), dict(hints)) == ([], {})


@pytest.mark.parametrize("bus_runs", [True, False])
def test_a_bus_that_is_missing_or_without_the_service_is_one_line(terminal: Terminal, bus_runs: bool) -> None:
    ended = _relay(terminal.session_bus.address if bus_runs else "unix:path=/nothing", "text")

    (line,) = ended.stderr.splitlines()
    assert ended.returncode == 0
    assert line.startswith(f"box: cannot reach {_NAME} on your session bus: ")
    assert line.endswith("the box goes on without your desktop")
