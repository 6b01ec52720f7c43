"""What the prompt prints: a result for every command, help, and completions for Tab."""

from __future__ import annotations

import pytest
from prompt_toolkit.completion import CompleteEvent
from prompt_toolkit.document import Document

from sandbox.policies import POLICIES
from sandbox.prompt import help_page
from sandbox.prompt.completion import CommandCompleter
from sandbox.prompt.registry import COMMANDS
from sandbox.prompt.session import show_ends
from tests.sandbox.recorded_context import RecordedContext

_SHOW_SOMETHING_ELSE = {"apps", "messages", "software", "state", "help", "wait", "quit"}


_ANSWERS = {
    "policy 1300": "The daemon has pushed it.",
    "online": "The daemon has asked the sessions to report themselves.",
    "lock": "The screen is locked",
    "unlock": "The screen is unlocked",
    "saver on": "The screen saver is on",
    "leave logind": "logind has left its bus; it comes back with: appear logind",
    "restart logind": "logind has a new connection now.",
    "hang logind": "logind no longer answers; it does again with: recover logind",
    "slow logind 2": "logind answers 2 s late",
    "fail logind": "logind answers with errors",
    "recover logind": "logind works normally.",
    "log on": "The agent's log lines are shown.",
    "open editor": "editor has 1 window.",
    "dock editor": "editor is kept on the dock.",
    "install editor 1": "editor 1 is installed.",
    "message Title Text": "The platform has the message",
    "tip off": "There is no tip now.",
    "platform hang": "The platform never answers.",
    "platform error 503": "The platform answers with this status: 503.",
    "leave logind; appear logind": "logind is on its bus.",
    "open editor; windows editor 2": "editor has 2 windows.",
    "dock editor; undock editor": "editor is no longer kept on the dock.",
    "open editor; close editor": "editor is closed.",
    "install editor 1; update editor 2": "editor is 2 now.",
    "install editor 1; uninstall editor": "editor is removed.",
}


@pytest.mark.parametrize("lines", _ANSWERS)
def test_a_command_is_answered_with_a_line(context: RecordedContext, lines: str) -> None:
    context.run(*lines.split("; "))

    assert context.lines_with(_ANSWERS[lines])


def test_no_command_is_left_without_an_answer() -> None:
    answered = {lines.split("; ")[-1].split()[0] for lines in _ANSWERS}

    assert COMMANDS.keys() - answered == {"advance", "login", *_SHOW_SOMETHING_ELSE}


def test_time_passes_at_once_and_the_end_of_the_session_is_shown(context: RecordedContext) -> None:
    show_ends(context)
    context.terminal.start_agent()
    context.run("policy 1201")
    context.terminal.sync()

    context.run("advance 60")

    assert context.terminal.events.wait_for(source="velks", member="Terminate")
    context.terminal.sync()
    assert context.lines_with("The agent's clock is 60 s ahead.")
    assert context.lines_with("The session would end here. The next one begins with: login")
    (ended,) = context.lines_with("Terminate()")
    assert ended.startswith("01:00")


def test_timers_that_come_again_keep_their_turns(context: RecordedContext) -> None:
    context.terminal.start_agent()
    mark = context.terminal.events.mark()

    context.run("advance 900")

    assert context.terminal.events.wait_for(member="SendUserStatus", after=mark, count=3)


@pytest.mark.parametrize("lines", [["leave daemon", "appear daemon"], ["restart daemon"]])
def test_a_new_daemon_asks_for_the_sessions(context: RecordedContext, lines: list[str]) -> None:
    context.run(*lines)

    assert context.terminal.events.wait_for(source="daemon", member="pushOnlineMsg")


def test_each_command_stands_in_one_group() -> None:
    listed = [name for names in help_page.GROUPS.values() for name in names]

    assert sorted(listed) == sorted(COMMANDS)


def test_help_for_a_command_lists_its_possible_arguments(context: RecordedContext) -> None:
    context.run("help policy")

    assert context.lines_with("policy CODE [UID] | {JSON}")
    for policy in POLICIES.values():
        (line,) = context.lines_with(f"{policy.code} ")
        assert policy.meaning in line


@pytest.mark.parametrize(
    ("typed", "offered"),
    [
        ("pol", {"policy": COMMANDS["policy"].help}),
        ("policy 130", {str(code): POLICIES[code].meaning for code in POLICIES if 1300 <= code < 1310}),
        ("policy 1300 ", {}),
        ("hang d", {"daemon": "com.norix.velk.velkg", "dock": "com.norix.kpx.daemon.Dock"}),
        ("sing ", {}),
    ],
)
def test_tab_offers_words_with_their_meaning(
    context: RecordedContext, typed: str, offered: dict[str, str]
) -> None:
    found = CommandCompleter(context).get_completions(Document(typed), CompleteEvent())

    assert {each.text: each.display_meta_text for each in found} == offered
