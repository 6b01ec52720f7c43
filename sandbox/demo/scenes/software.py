"""The agent reports the terminal's software."""

from __future__ import annotations

from typing import Any

from sandbox.demo.scene import Expectation, Scene, Step, from_agent
from sandbox.fakes.launcher import LauncherItem
from sandbox.machine.packages import desktop_file
from sandbox.terminal import Terminal

_CHANGE_ADDRESS = "https://%1:%2/uim/v3/client/upinfo_log"
_INVENTORY_ADDRESS = "https://%1:%2/uim/v3/client/upload_info"
_EDITOR = LauncherItem(desktop_file("editor"), "编辑器")
_BROWSER = LauncherItem(desktop_file("browser"), "浏览器")


def _uploaded(words: str, route: str) -> Expectation:
    return Expectation(words, "daemon", "platform", route)


def _report(words: str, address: str) -> Expectation:
    return from_agent(words, "daemon", "onUploadFinished", address)


def _known(words: str, *state: Any) -> Expectation:
    return Expectation(words, "platform", "inbox", "software", state)


_CHANGE_AND_INVENTORY = (
    _report("a report of the change", _CHANGE_ADDRESS),
    _report("the whole inventory", _INVENTORY_ADDRESS),
)
_BOTH_UPLOADED = (
    _uploaded("the daemon uploads the change", "software_change"),
    _uploaded("the daemon uploads the inventory", "inventory"),
)


def _install_browser(terminal: Terminal) -> None:
    terminal.packages.install("browser", "118.0-1")
    terminal.launcher.items.append(_BROWSER)


def _install_editor(terminal: Terminal) -> None:
    terminal.packages.install("editor", "2.1-1")
    terminal.launcher.install(_EDITOR)


def _update_editor(terminal: Terminal) -> None:
    terminal.packages.install("editor", "2.2-1")
    terminal.launcher.update(_EDITOR)


def _look_at_platform(terminal: Terminal) -> None:
    known = tuple(f"{record['name']} {record['version']}" for record in terminal.platform.inventory or ())
    terminal.events.record("platform", "inbox", "inbox", "software", known)


SOFTWARE = Scene(
    "Software is installed and updated",
    "The agent asks the package tools for the application's package, and sends two reports to the daemon: "
    "the change and the whole inventory. The daemon uploads them.",
    (
        Step(_install_editor, _CHANGE_AND_INVENTORY, in_order=True),
        Step(None, _BOTH_UPLOADED, in_order=True),
        Step(_update_editor, _CHANGE_AND_INVENTORY, in_order=True),
        Step(None, _BOTH_UPLOADED, in_order=True),
        Step(_look_at_platform, (_known("the platform knows both", "浏览器 118.0-1", "编辑器 2.2-1"),)),
    ),
    beforehand=_install_browser,
)
