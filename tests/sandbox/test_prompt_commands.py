"""What the commands of the prompt do to the terminal, and how they are refused."""

from __future__ import annotations

import pytest

from sandbox.machine import layout
from sandbox.machine.users import DOMAIN_USER
from sandbox.periods import SURELY_NEXT_POLL
from sandbox.policies import POLICIES
from sandbox.prompt.context import CommandRefused
from sandbox.prompt.registry import COMMANDS
from tests.sandbox.recorded_context import RecordedContext

# The notice's timer is coarse: half a second more or less.
_PASSWORD_NOTICE_DELAY = 61


def test_a_policy_by_code_makes_the_agent_act(context: RecordedContext) -> None:
    context.terminal.start_agent()

    context.run("policy 1300")

    shown = context.terminal.events.wait_for(source="velks", member="Notify")
    assert shown.args[4] == POLICIES[1300].notice
    assert context.lines_with("agent → notifications") and context.lines_with("this terminal will shut down")


@pytest.mark.parametrize(
    ("line", "pushed"),
    [
        ("policy 1203 20001", ['{"type": 1203, "payload": {"uid": 20001}}']),
        ("""  policy {"type" :5,  "text":"it's 校园 }""", ["""{"type" :5,  "text":"it's 校园 }"""]),
        ("", []),
        ("   ", []),
        ("# policy 1200", []),
    ],
    ids=["code and account", "text unchanged", "empty", "blanks", "comment"],
)
def test_the_daemon_pushes_what_the_line_says(context: RecordedContext, line: str, pushed: list[str]) -> None:
    context.run(line)

    events = context.terminal.events.all(source="daemon", member="pushPolicyMsg")
    assert [event.args[1] for event in events] == pushed


@pytest.mark.parametrize(
    ("before", "status"),
    [([], 1), (["lock"], 2), (["lock", "saver on"], 3), (["lock", "saver on", "saver off", "unlock"], 1)],
)
def test_the_agent_reports_the_state_of_the_screen_that_was_set(
    context: RecordedContext, before: list[str], status: int
) -> None:
    context.terminal.start_agent()
    context.run(*before)

    context.run("online")

    report = context.terminal.events.wait_for(member="SendUserStatus", count=2)
    assert report.args == (status, DOMAIN_USER.plain_name)


def test_a_service_leaves_and_comes_back(context: RecordedContext) -> None:
    context.run("leave notifications")
    assert context.terminal.session_bus.owner("com.norix.kpx.Notification") is None

    context.run("appear notifications")
    assert context.terminal.session_bus.owner("com.norix.kpx.Notification")


def test_a_restarted_service_has_a_new_connection(context: RecordedContext) -> None:
    before = context.terminal.system_bus.owner("org.freedesktop.login1")

    context.run("restart logind")

    assert context.terminal.system_bus.owner("org.freedesktop.login1") not in (before, None)


@pytest.mark.parametrize(
    ("line", "manner"),
    [("hang identity", "hang"), ("slow identity 1.5", "slow (1.5 s)"), ("fail identity", "fail")],
)
def test_a_service_misbehaves_until_it_recovers(context: RecordedContext, line: str, manner: str) -> None:
    context.run(line, "state", "recover identity", "state")

    faulty, recovered = context.lines_with("com.norix.velk.iam")
    assert manner in faulty and " ok " in recovered


def test_the_state_shows_absent_services(context: RecordedContext) -> None:
    context.run("leave screensaver", "state")

    (line,) = context.lines_with("com.norix.ScreenSaver")
    assert " no " in line


def test_a_message_reaches_the_user_and_is_then_read(context: RecordedContext) -> None:
    context.terminal.start_agent()
    context.run("""message "停机, 今晚" 'save "all"' li.na""", "messages")
    context.terminal.advance(SURELY_NEXT_POLL)
    context.run("messages")

    shown = context.terminal.events.wait_for(source="velks", member="Notify")
    assert shown.args[3:5] == ("停机, 今晚", 'save "all"')
    (sent,) = context.terminal.platform.messages(DOMAIN_USER.plain_name)
    assert sent["send_uid"] == "li.na"
    unread, read = [line for line in context.lines_with("停机, 今晚") if line.startswith("│")]
    assert "not yet" in unread and read.count(sent["read_at"]) >= 1 and sent["created_at"] in read
    assert context.lines_with("agent → platform") and context.lines_with("200, 1 unread")


@pytest.mark.parametrize(("lines", "notices"), [(["tip 3天后过期"], ["3天后过期"]), (["tip x", "tip off"], [])])
def test_a_tip_is_shown_a_minute_after_the_next_login(
    context: RecordedContext, lines: list[str], notices: list[str]
) -> None:
    context.terminal.start_agent()
    context.run(*lines)
    mark = context.terminal.events.mark()

    context.run("login")

    context.terminal.events.wait_for(member="SendUserStatus", after=mark)
    context.terminal.advance(_PASSWORD_NOTICE_DELAY)
    shown = context.terminal.events.all(source="velks", member="Notify", after=mark)
    assert [notice.args[4] for notice in shown] == notices


@pytest.mark.parametrize(
    ("line", "manner", "status"),
    [
        ("platform error 503", "error 503", 503),
        ("platform garbage", "garbage", 200),
        ("platform cut", "cut", 200),
        ("platform up", "ok", 200),
    ],
)
def test_the_platform_misbehaves_on_request(
    context: RecordedContext, line: str, manner: str, status: int
) -> None:
    context.run(line)
    context.terminal.start_agent()
    context.run("state")

    (row,) = context.lines_with(f"{layout.PLATFORM_HOST}:{layout.PLATFORM_PORT}")
    assert " yes " in row and manner in row
    assert context.terminal.events.wait_for(kind="reply").args[1] == status


def test_a_platform_that_hangs_answers_once_it_is_up(context: RecordedContext) -> None:
    context.run("platform hang")
    context.terminal.start_agent(ready=lambda: context.terminal.events.wait_for(kind="http", member="tips"))
    assert not context.terminal.events.all(kind="reply")

    context.run("platform up")

    assert context.terminal.events.wait_for(kind="reply").args[:2] == ("tips", 200)


def test_a_platform_that_is_down_gets_no_request_until_it_is_up(context: RecordedContext) -> None:
    context.terminal.start_agent()
    mark = context.terminal.events.mark()
    context.run("platform down", "platform down", "state")
    context.terminal.advance(SURELY_NEXT_POLL)
    (row,) = context.lines_with(f"{layout.PLATFORM_HOST}:{layout.PLATFORM_PORT}")
    assert " no " in row
    assert not context.terminal.events.all(kind="http", after=mark)

    context.run("platform up")
    context.terminal.advance(SURELY_NEXT_POLL)

    assert context.terminal.events.wait_for(kind="http", after=mark).member == "list"


def test_help_knows_every_command(context: RecordedContext) -> None:
    context.run("help")

    assert all(context.lines_with(known.usage) for known in COMMANDS.values())


def test_the_agents_log_is_shown_while_it_is_on(context: RecordedContext) -> None:
    context.terminal.start_agent()
    for line in ("policy 1300", "log on", "policy 1301", "log off", "policy 1304"):
        context.run(line)
        context.terminal.sync()

    assert [
        code for code in ("1300", "1301", "1304") if context.lines_with(f'payload: "{{\\"type\\": {code}')
    ] == ["1301"]


def test_each_wait_continues_where_the_previous_one_ended(context: RecordedContext) -> None:
    context.run("online", "online")

    context.run("wait pushOnlineMsg", "wait pushOnlineMsg")
    with pytest.raises(CommandRefused, match="no pushOnlineMsg came within 0.01 s"):
        context.run("wait pushOnlineMsg 0.01")


def test_quit_ends_the_input(context: RecordedContext) -> None:
    with pytest.raises(EOFError):
        context.run("quit")
