"""What the prompt's commands for software do to the terminal, and how they are refused."""

from __future__ import annotations

import pytest

from sandbox.machine.packages import desktop_file
from sandbox.terminal import Terminal
from tests.sandbox.recorded_context import RecordedContext, installed_packages


@pytest.fixture
def context(terminal: Terminal) -> RecordedContext:
    """A context at a terminal with a platform, which the daemon uploads to; the agent is not started."""
    terminal.daemon.uploads_to(terminal.platform)
    return RecordedContext(terminal)


@pytest.mark.parametrize(
    ("lines", "versions", "actions"),
    [
        (["install editor 2.1"], {"editor": "2.1"}, ["created"]),
        (["install editor 2.1", "update editor 2.2"], {"editor": "2.2"}, ["created", "update"]),
        (
            ["install editor 2.1", "install mail 1", "uninstall editor"],
            {"mail": "1"},
            ["created"] * 2 + ["deleted"],
        ),
    ],
    ids=str,
)
def test_packages_and_launcher_follow_the_commands(
    context: RecordedContext, lines: list[str], versions: dict[str, str], actions: list[str]
) -> None:
    context.run(*lines)

    assert installed_packages() == versions
    assert [item.path for item in context.terminal.launcher.items] == [
        desktop_file(name) for name in versions
    ]
    changes = context.terminal.events.all(source="launcher", member="ItemChanged")
    assert [change.args[0] for change in changes] == actions


def test_an_installation_reaches_the_platform(context: RecordedContext) -> None:
    context.terminal.start_agent()
    mark = context.terminal.events.mark()

    context.run("install editor 2.1")
    context.terminal.events.wait_for(kind="reply", target="daemon", after=mark, count=2)
    context.run("software")

    (change,) = context.terminal.platform.software_changes
    assert (change["software_name"], change["software_version"]) == ("editor", "2.1")
    (row,) = [line for line in context.lines_with("editor") if line.startswith("│")]
    assert "2.1" in row


def test_what_the_agent_reports_has_a_meaning(context: RecordedContext) -> None:
    context.terminal.start_agent()

    context.run("install editor 2.1")
    context.terminal.events.wait_for(kind="reply", target="daemon", count=2)

    for meaning in (
        "an application was installed",
        "which software was installed or updated",
        "all software of the",
    ):
        assert context.lines_with(meaning), meaning
