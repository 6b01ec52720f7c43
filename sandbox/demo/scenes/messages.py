"""The platform's messages for the user."""

from __future__ import annotations

from sandbox.demo.scene import Expectation, Scene, Step, message_comes, notice
from sandbox.machine.users import DOMAIN_USER as USER
from sandbox.periods import LONGEST_FIRST_POLL
from sandbox.terminal import Terminal

_NOTICE_DELAY = 60
_TIP = "您的密码将在3天后过期，请及时修改"
_MESSAGES = (
    ("停机维护", "今晚22:00停机，请保存文件"),
    ("须知, 第2版", '请读 "须知", 周五前回复'),
    ("图书馆", "图书馆本周六闭馆"),
)


def _warn_of_password(terminal: Terminal) -> None:
    terminal.platform.password_tip(USER.plain_name, _TIP)


def _post_messages(terminal: Terminal) -> None:
    for title, content in _MESSAGES:
        terminal.platform.post_message(USER.plain_name, title, content)


def _look_at_inbox(terminal: Terminal) -> None:
    for message in terminal.platform.messages(USER.plain_name):
        state = "read" if message["read_at"] else "unread"
        terminal.events.record("platform", "inbox", "inbox", message["title"], (state,))


_ONE_AFTER_THE_OTHER = tuple(
    expectation for message in _MESSAGES for expectation in message_comes(*message, within=LONGEST_FIRST_POLL)
)
_ALL_READ = tuple(
    Expectation(f"“{title}” is read on the platform", "platform", "inbox", title, ("read",))
    for title, _ in _MESSAGES
)

PASSWORD_EXPIRES = Scene(
    "The password is about to expire",
    "The platform said so at the start; a minute later the agent notifies the user.",
    (Step(None, (notice(_TIP, within=_NOTICE_DELAY),)),),
    beforehand=_warn_of_password,
)

WAITING = Scene(
    "Messages wait on the platform",
    "One or two minutes after the start the agent requests messages. It marks each one read and shows it "
    "before it requests the next one.",
    (Step(None, _ONE_AFTER_THE_OTHER, in_order=True), Step(_look_at_inbox, _ALL_READ)),
    "From now on it polls every one to three minutes.",
    beforehand=_post_messages,
)
