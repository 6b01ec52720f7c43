"""What the agent reports of the session."""

from __future__ import annotations

from sandbox.demo.scene import Expectation, Scene, Step, from_agent
from sandbox.terminal import Terminal
from sandbox.users import DOMAIN_USER as USER

_REPORT_PERIOD = 300

_IDENTITY = from_agent("the user's name and uid", "daemon", "UpdateUserInfo", USER.plain_name, USER.uid)


def _status(code: int, words: str, within: int = 0) -> Expectation:
    words = f"status {code}: {words}"
    return from_agent(words, "daemon", "SendUserStatus", code, USER.plain_name, within=within)


def _start(terminal: Terminal) -> None:
    terminal.start_agent(ready=lambda: None)


def _unlock(terminal: Terminal) -> None:
    terminal.screensaver.run(False)
    terminal.session_manager.lock(False)


def _restart_daemon(terminal: Terminal) -> None:
    terminal.daemon.leave()
    terminal.daemon.appear(announce=True)


BEGIN = Scene(
    "The session begins",
    "The agent tells the daemon whose session this is, and that the user is active.",
    (Step(_start, (_IDENTITY, _status(1, "active"))),),
)

STATES = Scene(
    "Locked, behind the screen saver, active again",
    "Every five minutes the agent looks at the screen and reports what it finds.",
    (
        Step(lambda terminal: terminal.session_manager.lock(), (_status(2, "locked", _REPORT_PERIOD),)),
        Step(lambda terminal: terminal.screensaver.run(), (_status(3, "screen saver", _REPORT_PERIOD),)),
        Step(_unlock, (_status(1, "active", _REPORT_PERIOD),)),
    ),
)

DAEMON_RESTART = Scene(
    "The daemon restarts",
    "A fresh daemon knows nobody and asks; the session announces itself again.",
    (Step(_restart_daemon, (_IDENTITY, _status(1, "active"))),),
)
