"""What a person can do with installed software at the prompt."""

from __future__ import annotations

from rich.table import Table
from rich.text import Text

from sandbox.fakes.launcher import LauncherItem
from sandbox.machine.packages import desktop_file
from sandbox.prompt.desk import Desk, Refused
from sandbox.prompt.registry import command


@command("install", "PACKAGE VERSION", "a package with an application is installed")
def install(desk: Desk, package: str, version: str) -> str:
    """The launcher then lists the application under the package's name."""
    if _item(package) in desk.terminal.launcher.items:
        raise Refused(f"{package} is installed already; a new version comes with: update {package} VERSION")
    _put_in_place(desk, package, version)
    desk.terminal.launcher.install(_item(package))
    return f"{package} {version} is installed."


@command("update", "PACKAGE VERSION", "a package is updated")
def update(desk: Desk, package: str, version: str) -> str:
    """It must be installed."""
    _require_installed(desk, package)
    _put_in_place(desk, package, version)
    desk.terminal.launcher.update(_item(package))
    return f"{package} is {version} now."


@command("uninstall", "PACKAGE", "a package is removed, and its application with it")
def uninstall(desk: Desk, package: str) -> str:
    """It must be installed."""
    _require_installed(desk, package)
    desk.terminal.packages.remove(package)
    desk.terminal.launcher.remove(_item(package))
    return f"{package} is removed."


@command("software", "", "the terminal's software as the platform knows it")
def software(desk: Desk) -> None:
    """From the inventory that came last."""
    table = Table("Application", "Package", "Version", "Architecture")
    for known in desk.terminal.platform.inventory() or ():
        table.add_row(*(Text(known[key]) for key in ("name", "package_name", "version", "arch")))
    desk.show(table)


def _item(package: str) -> LauncherItem:
    return LauncherItem(desktop_file(package), package)


def _require_installed(desk: Desk, package: str) -> None:
    if _item(package) not in desk.terminal.launcher.items:
        raise Refused(f"{package} is not installed; do it with: install {package} VERSION")


def _put_in_place(desk: Desk, package: str, version: str) -> None:
    try:
        desk.terminal.packages.install(package, version)
    except AssertionError as error:
        raise Refused(str(error)) from None
