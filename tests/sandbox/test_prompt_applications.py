"""What the prompt's commands for applications do to the dock, and how they are refused."""

from __future__ import annotations

import pytest

from tests.sandbox.recorded_context import RecordedContext


def on_dock(context: RecordedContext) -> dict[str, tuple[int, bool]]:
    """The number of windows of each application, and whether it is kept on the dock."""
    dock = context.terminal.dock
    return {app: (dock.windows(app), dock.is_docked(app)) for app in dock.apps}


@pytest.mark.parametrize(
    ("lines", "expected"),
    [
        (["open 编辑器"], {"编辑器": (1, False)}),
        (["open a", "open a"], {"a": (2, False)}),
        (["open a", "close a"], {}),
        (["dock a"], {"a": (0, True)}),
        (["dock a", "open a"], {"a": (1, True)}),
        (["dock a", "open a", "close a"], {"a": (0, True)}),
        (["open a", "dock a"], {"a": (1, True)}),
        (["open a", "windows a 3"], {"a": (3, False)}),
        (["open a", "windows a 0"], {}),
        (["dock a", "undock a"], {}),
        (["dock a", "open a", "undock a"], {"a": (1, False)}),
        (["open 'text editor'", "open mail"], {"text editor": (1, False), "mail": (1, False)}),
    ],
    ids=str,
)
def test_the_dock_is_as_the_user_left_it(
    context: RecordedContext, lines: list[str], expected: dict[str, tuple[int, bool]]
) -> None:
    context.run(*lines)

    assert on_dock(context) == expected


def test_the_applications_are_listed(context: RecordedContext) -> None:
    context.run("dock mail", "open editor", "windows editor 4", "apps")

    mail, editor = [line for line in context.lines_with("│") if "mail" in line or "editor" in line]
    assert ("0" in mail, "yes" in mail, "4" in editor, "no" in editor) == (True, True, True, True)


def test_what_the_dock_announces_has_a_meaning(context: RecordedContext) -> None:
    context.run("open editor", "windows editor 2", "dock editor", "undock editor", "close editor")

    for meaning in (
        "an application was added to the dock",
        "2 windows",
        "kept on the dock from now on",
        "no longer kept on the dock",
        "an application was removed from the dock",
    ):
        assert context.lines_with(meaning), meaning


def test_an_entry_that_announces_no_values_shows_what_has_changed(context: RecordedContext) -> None:
    context.terminal.dock.announces = ("invalidated",)
    context.run("open editor", "windows editor 2")

    assert context.lines_with("WindowInfos has changed")
