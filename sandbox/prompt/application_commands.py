"""The prompt's commands about applications."""

from __future__ import annotations

from rich.table import Table
from rich.text import Text

from sandbox.fakes.dock import Dock
from sandbox.prompt.context import Context, CommandRefused
from sandbox.prompt.registry import command, number


@command("open", "APPLICATION", "the user opens an application, or one more window of it")
def open_application(context: Context, app: str) -> str:
    """The agent notices only if the dock is on the bus."""
    dock = context.terminal.dock
    if app in dock.apps:
        dock.set_windows(app, dock.windows(app) + 1)
    else:
        dock.open_app(app, app)
    return f"{app} has {_count(dock, app)}."


@command("close", "APPLICATION", "the user closes an application with all its windows")
def close_application(context: Context, app: str) -> str:
    """The application must be on the dock."""
    _have_windows(_dock_with(context, app), app, 0)
    return f"{app} is closed."


@command("windows", "APPLICATION COUNT", "the user opens or closes windows until the application has COUNT")
def windows(context: Context, app: str, count: str) -> str:
    """The application must be on the dock."""
    wanted = int(number(count, int))
    if wanted < 0:
        raise CommandRefused(f"an application cannot have {wanted} windows")
    dock = _dock_with(context, app)
    _have_windows(dock, app, wanted)
    return f"{app} has {_count(dock, app)}."


@command("dock", "APPLICATION", "the user keeps an application on the dock, whether or not it runs")
def dock_application(context: Context, app: str) -> str:
    """An application that is not on the dock yet is added without a window."""
    dock = context.terminal.dock
    if app in dock.apps:
        dock.pin(app)
    else:
        dock.open_app(app, app, docked=True, windows=0)
    return f"{app} is kept on the dock."


@command("undock", "APPLICATION", "the user takes an application off the dock, where it stays while it runs")
def undock_application(context: Context, app: str) -> str:
    """The application must be on the dock."""
    dock = _dock_with(context, app)
    dock.pin(app, False)
    if not dock.windows(app):
        dock.close_app(app)
    return f"{app} is no longer kept on the dock."


@command("apps", "", "the applications on the dock")
def applications(context: Context) -> None:
    """The table is in the dock's order."""
    dock = context.terminal.dock
    table = Table("Application", "Windows", "Kept on the dock")
    for app in dock.apps:
        table.add_row(Text(app), str(dock.windows(app)), "yes" if dock.is_docked(app) else "no")
    context.show(table)


def _dock_with(context: Context, app: str) -> Dock:
    dock = context.terminal.dock
    if app not in dock.apps:
        raise CommandRefused(f"there is no application '{app}' on the dock; see: apps")
    return dock


def _count(dock: Dock, app: str) -> str:
    number = dock.windows(app) if app in dock.apps else 0
    return "1 window" if number == 1 else f"{number} windows"


def _have_windows(dock: Dock, app: str, number: int) -> None:
    """An application without windows stays on the dock only if it is kept there."""
    if number or dock.is_docked(app):
        dock.set_windows(app, number)
    else:
        dock.close_app(app)
