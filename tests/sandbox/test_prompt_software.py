"""What the prompt's commands for software do to the terminal, and how they are refused."""

from __future__ import annotations

import subprocess

import pytest

from sandbox.machine.packages import desktop_file
from sandbox.prompt.registry import run_line
from sandbox.terminal import Terminal
from tests.sandbox.recorded_context import RecordedContext


@pytest.fixture
def context(terminal: Terminal) -> RecordedContext:
    """A context at a terminal with a platform, which the daemon uploads to; the agent is not started."""
    terminal.daemon.uploads_to(terminal.platform)
    return RecordedContext(terminal)


def installed() -> dict[str, str]:
    """Versions of the packages as the package tools know them."""
    shown = subprocess.run(["dpkg-query", "-W"], capture_output=True, text=True).stdout
    return dict(line.split("\t", 1) for line in shown.splitlines())


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
    for line in lines:
        run_line(context, line)

    assert installed() == versions
    assert [item.path for item in context.terminal.launcher.items] == [
        desktop_file(name) for name in versions
    ]
    changes = context.terminal.events.all(source="launcher", member="ItemChanged")
    assert [change.args[0] for change in changes] == actions


def test_an_installation_reaches_the_platform(context: RecordedContext) -> None:
    context.terminal.start_agent()
    mark = context.terminal.events.mark()

    run_line(context, "install editor 2.1")
    context.terminal.events.wait_for(kind="reply", target="daemon", after=mark, count=2)
    run_line(context, "software")

    (change,) = context.terminal.platform.software_changes()
    assert (change["software_name"], change["software_version"]) == ("editor", "2.1")
    (row,) = [line for line in context.lines_with("editor") if line.startswith("│")]
    assert "2.1" in row


def test_what_the_agent_reports_has_a_meaning(context: RecordedContext) -> None:
    context.terminal.start_agent()

    run_line(context, "install editor 2.1")
    context.terminal.events.wait_for(kind="reply", target="daemon", count=2)

    for meaning in (
        "an application was installed",
        "which software was installed or updated",
        "all software of the",
    ):
        assert context.lines_with(meaning), meaning


@pytest.mark.parametrize(
    ("line", "reason"),
    [
        (
            "install editor 3",
            "editor is installed already; install a new version with: update editor VERSION",
        ),
        ("update mail 1", "mail is not installed; install it with: install mail VERSION"),
        ("uninstall mail", "mail is not installed"),
        ("install Editor 1", "no package can be called 'Editor'"),
        ("install mail", "usage: install PACKAGE VERSION"),
    ],
)
def test_what_cannot_be_done_is_refused_with_a_reason(
    context: RecordedContext, line: str, reason: str
) -> None:
    run_line(context, "install editor 2.1")

    assert reason in context.refusal(line)
    assert installed() == {"editor": "2.1"}
