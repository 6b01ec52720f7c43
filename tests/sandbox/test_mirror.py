"""Notifications find their way from the box to the person's own desktop."""

from __future__ import annotations

import io
import json
import os
import queue
import subprocess
from pathlib import Path
from typing import Any, Iterator, Sequence

import dbus.bus
import dbus.service
import pytest

from sandbox.bus.mainloop import MainLoop
from sandbox.policies import POLICIES
from sandbox.prompt.mirror import Mirror
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

    def __init__(self, address: str, capabilities: Sequence[str]) -> None:
        self.shown: queue.Queue[tuple[Any, ...]] = queue.Queue()
        self._capabilities = dbus.Array(capabilities, signature="s")
        connection = dbus.bus.BusConnection(address, mainloop=MainLoop.bus_loop)
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


@pytest.fixture
def session_bus(tmp_path: Path) -> Iterator[str]:
    """Address of a fresh bus, which stands for the person's own."""
    address = f"unix:path={tmp_path}/bus"
    command = ["dbus-daemon", "--session", "--nofork", f"--address={address}", "--print-address"]
    with subprocess.Popen(command, stdout=subprocess.PIPE) as daemon:
        assert daemon.stdout
        daemon.stdout.readline()
        yield address
        daemon.terminate()


def _relay(address: str, *notifications: dict[str, Any]) -> subprocess.CompletedProcess[str]:
    lines = "".join(json.dumps(notification) + "\n" for notification in notifications)
    env = {**os.environ, "DBUS_SESSION_BUS_ADDRESS": address}
    command = ["/usr/bin/python3", "-P", "-c", _RELAY]
    return subprocess.run(command, env=env, input=lines, capture_output=True, text=True)


def _notification(body: str) -> dict[str, Any]:
    return {"app_name": "app", "summary": "summary", "body": body, "timeout": 5}


def test_a_notification_leaves_the_box_as_a_line(terminal: Terminal) -> None:
    stream = io.BytesIO()
    Mirror(terminal.events, stream)
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


def test_a_line_becomes_a_notification_on_the_desktop(session_bus: str) -> None:
    desktop = MainLoop.call(FakeDesktop, session_bus, [])

    ended = _relay(session_bus, _notification("终端 <1> & 2"))

    assert (ended.returncode, ended.stderr) == (0, "")
    app_name, replaces, _, summary, body, actions, hints, timeout = desktop.shown.get(timeout=_SECONDS)
    assert (app_name, replaces, summary, body, timeout) == ("app", 0, "summary", "终端 <1> & 2", 5)
    assert (list(actions), dict(hints)) == ([], {})


def test_a_desktop_that_reads_markup_is_given_none(session_bus: str) -> None:
    desktop = MainLoop.call(FakeDesktop, session_bus, ["body", "body-markup"])

    _relay(session_bus, _notification("终端 <1> & 2"))

    assert desktop.shown.get(timeout=_SECONDS)[4] == "终端 &lt;1&gt; &amp; 2"


def test_a_session_bus_without_the_service_is_one_line(session_bus: str) -> None:
    ended = _relay(session_bus, _notification("text"))

    assert ended.returncode == 0
    assert ended.stderr.startswith(f"box: cannot reach {_NAME} on your session bus: ")
    assert ended.stderr.endswith("the box goes on without your desktop\n") and ended.stderr.count("\n") == 1


def test_a_missing_session_bus_is_one_line(tmp_path: Path) -> None:
    ended = _relay(f"unix:path={tmp_path}/nothing")

    assert ended.returncode == 0
    assert ended.stderr.startswith(f"box: cannot reach {_NAME} on your session bus: ")
    assert ended.stderr.endswith("the box goes on without your desktop\n") and ended.stderr.count("\n") == 1
