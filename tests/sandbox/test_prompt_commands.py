"""What the commands of the prompt do to the terminal, and how they are refused."""

from __future__ import annotations

import json

import pytest

from sandbox.machine import layout
from sandbox.machine.users import DOMAIN_USER
from sandbox.periods import SURELY_NEXT_POLL
from sandbox.policies import POLICIES
from sandbox.prompt.context import Context, CommandRefused
from sandbox.prompt.registry import COMMANDS, run_line
from tests.sandbox.recorded_context import RecordedContext

# The notice's timer is coarse: half a second more or less.
_PASSWORD_NOTICE_DELAY = 61


def _pushed(context: Context) -> list[str]:
    events = context.terminal.events.all(source="daemon", member="pushPolicyMsg")
    return [event.args[1] for event in events]


def test_a_policy_by_code_makes_the_agent_act(context: RecordedContext) -> None:
    context.terminal.start_agent()

    run_line(context, "policy 1300")

    shown = context.terminal.events.wait_for(source="velks", member="Notify")
    assert shown.args[4] == POLICIES[1300].notice
    assert context.lines_with("agent → notifications") and context.lines_with("this terminal will shut down")


def test_a_policy_by_code_and_uid_names_the_account(context: RecordedContext) -> None:
    run_line(context, "policy 1203 20001")

    assert [json.loads(text) for text in _pushed(context)] == [{"type": 1203, "payload": {"uid": 20001}}]


def test_a_policy_in_braces_is_pushed_unchanged(context: RecordedContext) -> None:
    run_line(context, """  policy {"type" :5,  "text":"it's 校园 }""")

    assert _pushed(context) == ["""{"type" :5,  "text":"it's 校园 }"""]


@pytest.mark.parametrize(
    ("before", "status"),
    [([], 1), (["lock"], 2), (["lock", "saver on"], 3), (["lock", "saver on", "saver off", "unlock"], 1)],
)
def test_the_agent_reports_the_state_of_the_screen_that_was_set(
    context: RecordedContext, before: list[str], status: int
) -> None:
    context.terminal.start_agent()
    for line in before:
        run_line(context, line)

    run_line(context, "online")

    report = context.terminal.events.wait_for(member="SendUserStatus", count=2)
    assert report.args == (status, DOMAIN_USER.plain_name)


def test_a_service_leaves_and_comes_back(context: RecordedContext) -> None:
    run_line(context, "leave notifications")
    assert context.terminal.session_bus.owner("com.norix.kpx.Notification") is None

    run_line(context, "appear notifications")
    assert context.terminal.session_bus.owner("com.norix.kpx.Notification")


def test_a_restarted_service_has_a_new_connection(context: RecordedContext) -> None:
    before = context.terminal.system_bus.owner("org.freedesktop.login1")

    run_line(context, "restart logind")

    assert context.terminal.system_bus.owner("org.freedesktop.login1") not in (before, None)


@pytest.mark.parametrize(
    ("line", "manner"),
    [("hang identity", "hang"), ("slow identity 1.5", "slow (1.5 s)"), ("fail identity", "fail")],
)
def test_a_service_misbehaves_until_it_recovers(context: RecordedContext, line: str, manner: str) -> None:
    run_line(context, line)
    run_line(context, "state")
    run_line(context, "recover identity")
    run_line(context, "state")

    faulty, recovered = context.lines_with("com.norix.velk.iam")
    assert manner in faulty and " ok " in recovered


def test_the_state_shows_absent_services(context: RecordedContext) -> None:
    run_line(context, "leave screensaver")

    run_line(context, "state")

    (line,) = context.lines_with("com.norix.ScreenSaver")
    assert " no " in line


def test_a_message_reaches_the_user_and_is_then_read(context: RecordedContext) -> None:
    context.terminal.start_agent()
    run_line(context, """message "停机, 今晚" 'save "all"' li.na""")
    run_line(context, "messages")
    context.terminal.advance(SURELY_NEXT_POLL)
    run_line(context, "messages")

    shown = context.terminal.events.wait_for(source="velks", member="Notify")
    assert shown.args[3:5] == ("停机, 今晚", 'save "all"')
    (sent,) = context.terminal.platform.messages(DOMAIN_USER.plain_name)
    assert sent["send_uid"] == "li.na"
    unread, read = [line for line in context.lines_with("停机, 今晚") if line.startswith("│")]
    assert "not yet" in unread and read.count(sent["read_at"]) >= 1 and sent["created_at"] in read
    assert context.lines_with("agent → platform") and context.lines_with("200, 1 unread")


@pytest.mark.parametrize(
    ("lines", "notices"),
    [
        (["tip 3天后过期"], ["3天后过期"]),
        (["tip x", "tip off"], []),
    ],
)
def test_a_tip_is_shown_a_minute_after_the_next_login(
    context: RecordedContext, lines: list[str], notices: list[str]
) -> None:
    context.terminal.start_agent()
    for line in lines:
        run_line(context, line)
    mark = context.terminal.events.mark()

    run_line(context, "login")

    context.terminal.events.wait_for(member="SendUserStatus", after=mark)
    context.terminal.advance(_PASSWORD_NOTICE_DELAY)
    shown = context.terminal.events.all(source="velks", member="Notify", after=mark)
    assert [notice.args[4] for notice in shown] == notices


@pytest.mark.parametrize(
    ("line", "manner", "reply"),
    [
        ("platform error 503", "error 503", b"503"),
        ("platform garbage", "garbage", b"200"),
        ("platform cut", "cut", b"200"),
        ("platform up", "ok", b"200"),
    ],
)
def test_the_platform_misbehaves_on_request(
    context: RecordedContext, line: str, manner: str, reply: bytes
) -> None:
    run_line(context, line)
    context.terminal.start_agent()
    run_line(context, "state")

    (row,) = context.lines_with(f"{layout.PLATFORM_HOST}:{layout.PLATFORM_PORT}")
    assert " yes " in row and manner in row
    assert context.terminal.events.wait_for(kind="reply").args[1] == int(reply)


def test_a_platform_that_hangs_answers_once_it_is_up(context: RecordedContext) -> None:
    run_line(context, "platform hang")
    context.terminal.start_agent(ready=lambda: context.terminal.events.wait_for(kind="http", member="tips"))
    assert not context.terminal.events.all(kind="reply")

    run_line(context, "platform up")

    assert context.terminal.events.wait_for(kind="reply").args[:2] == ("tips", 200)


def test_a_platform_that_is_down_gets_no_request_until_it_is_up(context: RecordedContext) -> None:
    context.terminal.start_agent()
    mark = context.terminal.events.mark()
    for _ in range(2):
        run_line(context, "platform down")
    run_line(context, "state")
    context.terminal.advance(SURELY_NEXT_POLL)
    (row,) = context.lines_with(f"{layout.PLATFORM_HOST}:{layout.PLATFORM_PORT}")
    assert " no " in row
    assert not context.terminal.events.all(kind="http", after=mark)

    run_line(context, "platform up")
    context.terminal.advance(SURELY_NEXT_POLL)

    assert context.terminal.events.wait_for(kind="http", after=mark).member == "list"


def test_help_knows_every_command(context: RecordedContext) -> None:
    run_line(context, "help")

    assert all(context.lines_with(known.usage) for known in COMMANDS.values())


def test_the_agents_log_is_shown_while_it_is_on(context: RecordedContext) -> None:
    context.terminal.start_agent()
    for line in ("policy 1300", "log on", "policy 1301", "log off", "policy 1304"):
        run_line(context, line)
        context.terminal.sync()

    assert [
        code for code in ("1300", "1301", "1304") if context.lines_with(f'payload: "{{\\"type\\": {code}')
    ] == ["1301"]


def test_each_wait_continues_where_the_previous_one_ended(context: RecordedContext) -> None:
    for _ in range(2):
        run_line(context, "online")

    run_line(context, "wait pushOnlineMsg")
    run_line(context, "wait pushOnlineMsg")
    with pytest.raises(CommandRefused, match="no pushOnlineMsg came within 0.01 s"):
        run_line(context, "wait pushOnlineMsg 0.01")


def test_quit_ends_the_input(context: RecordedContext) -> None:
    with pytest.raises(EOFError):
        run_line(context, "quit")


@pytest.mark.parametrize("line", ["", "   ", "# policy 1200"])
def test_empty_lines_and_comments_do_nothing(context: RecordedContext, line: str) -> None:
    run_line(context, line)

    assert not _pushed(context)


@pytest.mark.parametrize(
    ("line", "reason"),
    [
        ("reboot", "there is no command 'reboot'"),
        ("policy", "usage: policy CODE"),
        ("policy 1203 20001 more", "usage: policy CODE"),
        ("policy soon", "'soon' is not a number"),
        ("policy 1203 zhang.wei", "'zhang.wei' is not a number"),
        ('policy "1203', "No closing quotation"),
        ("lock now", "usage: lock"),
        ("saver maybe", "'maybe' is neither on nor off"),
        ("hang printer", "there is no service 'printer'; there are: daemon, "),
        ("slow daemon", "usage: slow SERVICE SECONDS"),
        ("slow daemon long", "'long' is not a number"),
        ("appear daemon", "daemon is on the bus already"),
        ("message title", "usage: message TITLE CONTENT [SENDER]"),
        ("tip", "usage: tip TEXT|off"),
        ("platform", "usage: platform up|down|"),
        ("platform ill", "usage: platform up|down|"),
        ("platform error", "usage: platform up|down|"),
        ("platform up 503", "usage: platform up|down|"),
        ("platform error soon", "'soon' is not a number"),
        ("platform error 200", "200 is not an error status (400 to 599)"),
    ],
)
def test_what_cannot_be_done_is_refused_with_a_reason(
    context: RecordedContext, line: str, reason: str
) -> None:
    assert reason in context.refusal(line)


@pytest.mark.parametrize("line", ["policy 1300", "online", "leave daemon", "restart daemon"])
def test_a_daemon_that_is_away_cannot_be_used(context: RecordedContext, line: str) -> None:
    run_line(context, "leave daemon")

    assert context.refusal(line) == "daemon is not on the bus; bring it back with: appear daemon"
