"""The prompt's commands about installed software."""

from __future__ import annotations

from rich.table import Table
from rich.text import Text

from sandbox.fakes.launcher import LauncherItem
from sandbox.machine.packages import desktop_file
from sandbox.prompt.context import Context, CommandRefused
from sandbox.prompt.registry import command


@command("install", "PACKAGE VERSION", "a package with an application is installed")
def install(context: Context, package: str, version: str) -> str:
    """The launcher then lists the application under the package's name."""
    if _item(package) in context.terminal.launcher.items:
        raise CommandRefused(
            f"{package} is installed already; install a new version with: update {package} VERSION"
        )
    _put_in_place(context, package, version)
    context.terminal.launcher.install(_item(package))
    return f"{package} {version} is installed."


@command("update", "PACKAGE VERSION", "a package is updated")
def update(context: Context, package: str, version: str) -> str:
    """The package must be installed."""
    _require_installed(context, package)
    _put_in_place(context, package, version)
    context.terminal.launcher.update(_item(package))
    return f"{package} is {version} now."


@command("uninstall", "PACKAGE", "a package is removed, and its application with it")
def uninstall(context: Context, package: str) -> str:
    """The package must be installed."""
    _require_installed(context, package)
    context.terminal.packages.remove(package)
    context.terminal.launcher.remove(_item(package))
    return f"{package} is removed."


@command("software", "", "the terminal's software as the platform knows it")
def software(context: Context) -> None:
    """The table shows the last inventory."""
    table = Table("Application", "Package", "Version", "Architecture")
    for known in context.terminal.platform.inventory or ():
        table.add_row(*(Text(known[key]) for key in ("name", "package_name", "version", "arch")))
    context.show(table)


def _item(package: str) -> LauncherItem:
    return LauncherItem(desktop_file(package), package)


def _require_installed(context: Context, package: str) -> None:
    if _item(package) not in context.terminal.launcher.items:
        raise CommandRefused(f"{package} is not installed; install it with: install {package} VERSION")


def _put_in_place(context: Context, package: str, version: str) -> None:
    try:
        context.terminal.packages.install(package, version)
    except ValueError as error:
        raise CommandRefused(str(error)) from None
