"""The agent reports the user's applications."""

from __future__ import annotations

from typing import Callable

from sandbox.demo.scene import Expectation, Scene, Step, from_agent
from sandbox.fakes.dock import Dock
from sandbox.terminal import Terminal

_OPENED, _CLOSED = 1, 2
_EDITOR, _BROWSER = "编辑器", "浏览器"
_EDITOR_WITH_FILE = "说明 - 编辑器"


def _on_dock(change: Callable[[Dock], object], then: Expectation) -> Step:
    return Step(lambda terminal: change(terminal.dock), (then,))


def _reported(state: int, name: str, words: str) -> Expectation:
    return from_agent(f"state {state}, “{name}”: {words}", "daemon", "sendAppOpenState", state, name)


def _close_renamed(dock: Dock) -> None:
    dock.rename("editor", _EDITOR_WITH_FILE)
    dock.close_app("editor")


def _keep_browser(terminal: Terminal) -> None:
    terminal.dock.open_app("browser", _BROWSER, docked=True, windows=0)


APPLICATIONS = Scene(
    "Applications open and close",
    "The agent watches the desktop's dock. It reports the browser, which the user keeps there, when its "
    "first window opens, and the editor when it appears on the dock.",
    (
        _on_dock(lambda dock: dock.open_app("editor", _EDITOR), _reported(_OPENED, _EDITOR, "opened")),
        _on_dock(lambda dock: dock.set_windows("browser", 1), _reported(_OPENED, _BROWSER, "opened")),
        _on_dock(
            lambda dock: dock.set_windows("browser", 2), _reported(_OPENED, _BROWSER, "a further window")
        ),
        _on_dock(_close_renamed, _reported(_CLOSED, _EDITOR_WITH_FILE, "closed under its last name")),
        _on_dock(lambda dock: dock.set_windows("browser", 0), _reported(_CLOSED, _BROWSER, "closed")),
    ),
    beforehand=_keep_browser,
)
