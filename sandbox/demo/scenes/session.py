"""The agent reports the session."""

from __future__ import annotations

from sandbox.demo.scene import NOTHING_ASKED, Expectation, Scene, Step, from_agent, message_comes
from sandbox.machine.users import DOMAIN_USER as USER
from sandbox.periods import LONGEST_POLL, STATE_REPORT
from sandbox.terminal import Terminal

_MESSAGE = ("打印机", "三楼打印机已修好")

_IDENTITY = from_agent("the user's name and uid", "daemon", "UpdateUserInfo", USER.plain_name, USER.uid)
_PASSWORD_CHECK = from_agent("a request for the password tips", "platform", "tips")


def _status(code: int, words: str, within: int = 0) -> Expectation:
    words = f"status {code}: {words}"
    return from_agent(words, "daemon", "SendUserStatus", code, USER.plain_name, within=within)


def _start(terminal: Terminal) -> None:
    terminal.start_agent(ready=lambda: None)


def _walk_away(terminal: Terminal) -> None:
    terminal.platform.post_message(USER.plain_name, *_MESSAGE)
    terminal.screensaver.run()


def _unlock(terminal: Terminal) -> None:
    terminal.screensaver.run(False)
    terminal.session_manager.lock(False)


def _restart_daemon(terminal: Terminal) -> None:
    terminal.daemon.leave()
    terminal.daemon.appear(announce=True)


BEGIN = Scene(
    "The session begins",
    "The agent reports the user and the state of the session to the daemon, and asks the platform about the "
    "user's password.",
    (Step(_start, (_IDENTITY, _status(1, "active"), _PASSWORD_CHECK)),),
    beforehand=lambda terminal: terminal.daemon.uploads_to(terminal.platform),
)

STATES = Scene(
    "Locked, behind the screen saver, active again",
    "Every five minutes the agent reports the state of the screen. The platform's messages wait until the "
    "session is active again.",
    (
        Step(lambda terminal: terminal.session_manager.lock(), (_status(2, "locked", STATE_REPORT),)),
        # The session is inactive for longer than any poll interval.
        Step(_walk_away, (_status(3, "screen saver", STATE_REPORT), NOTHING_ASKED)),
        Step(
            _unlock,
            (_status(1, "active", STATE_REPORT), *message_comes(*_MESSAGE, within=LONGEST_POLL)),
        ),
    ),
)

DAEMON_RESTART = Scene(
    "The daemon restarts",
    "A new daemon knows no sessions and asks for them; the agent reports its session again.",
    (Step(_restart_daemon, (_IDENTITY, _status(1, "active"))),),
)
