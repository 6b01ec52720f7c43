"""What people and services do on a terminal, each activity with what must arrive because of it."""

from __future__ import annotations

import json
from random import Random

from sandbox import policies
from sandbox.fakes.launcher import LauncherItem
from sandbox.machine.packages import desktop_file
from sandbox.soak import accounting as kinds
from sandbox.soak.accounting import Accounting
from sandbox.terminal import Terminal

_OPENED, _CLOSED = 1, 2
_ACTIVE, _LOCKED, _BEHIND_SCREEN_SAVER = 1, 2, 3
_CREATED, _UPDATED = 1, 2

_KEPT_ON_DOCK = {"files": "Files", "browser": "浏览器", "terminal": "Terminal"}
_OTHERS = ("Mail", "Editor", "Calculator", "播放器", "Viewer", "Calendar", "Notes", "Chat")
_FIRST_PACKAGES = ("editor", "mail", "player")
_MOST_PACKAGES = 8
_NOTICES = policies.with_action("Notify", "RequestPasswordChange")
_LOGOUTS = policies.with_action("WarnThenLogOut")
_FOR_ONE_ACCOUNT = policies.for_one_account()
_PASSWORD_TIP = "your password will expire in 3 days"
_RESTARTED = ("logind", "identity", "policy_service", "notifications", "screensaver", "session_manager")


class Activities:
    """What users and services do. An activity returns once what it leads to at once has arrived."""

    def __init__(self, terminal: Terminal, accounting: Accounting, random: Random) -> None:
        self._terminal = terminal
        self._accounting = accounting
        self._random = random
        self._packages: dict[LauncherItem, int] = {}  # the launcher's items with their packages' versions
        self._number = 0
        self._logout_due = False

    def log_in(self) -> None:
        """Fill the terminal and start the agent, which announces all that it finds."""
        terminal = self._terminal
        terminal.platform.password_tip(terminal.user.plain_name, _PASSWORD_TIP)
        self._accounting.expect(kinds.NOTICES, _PASSWORD_TIP)
        for app, name in _KEPT_ON_DOCK.items():
            terminal.dock.open_app(app, name, docked=True, windows=0)
        for package in _FIRST_PACKAGES:
            self._put(LauncherItem(desktop_file(package), package.title()), 1)
        terminal.launcher.items = list(self._packages)
        self._expect_inventory()
        self._expect_user()
        self.expect_status()
        terminal.start_agent()

    def expect_status(self) -> None:
        """Note that the session's state will be reported as it is now."""
        status = _LOCKED if self._terminal.session_manager.value("Locked") else _ACTIVE
        if self._terminal.screensaver.value("isRunning"):
            status = _BEHIND_SCREEN_SAVER
        self._accounting.expect(kinds.STATUSES, status, self._terminal.user.plain_name)

    def expect_forced_logout(self) -> None:
        """Note the log-out that a policy of the last minute leads to, if there was one."""
        if self._logout_due:
            self._accounting.expect(kinds.LOGOUTS)
        self._logout_due = False

    def lock(self, locked: bool) -> None:
        """Lock the session, or unlock it and end the screen saver."""
        self._terminal.session_manager.lock(locked)
        if not locked:
            self._terminal.screensaver.run(False)

    def start_screen_saver(self) -> None:
        """Nobody has touched the terminal for a while."""
        self._terminal.screensaver.run()

    def post_messages(self) -> None:
        """Somebody writes to the user; the messages arrive with the next polls."""
        user = self._terminal.user.plain_name
        for _ in range(self._random.randint(1, 5)):
            title, content = f"message {self._next()}", self._random.choice(("short", "长" * 500))
            uuid = self._terminal.platform.post_message(user, title, content)
            self._accounting.expect(kinds.MESSAGES, title, content)
            self._accounting.expect(kinds.RECEIPTS, uuid)

    def push_forwarded_policies(self) -> None:
        """The platform sets a few policies that are not the agent's own."""
        for _ in range(self._random.randint(1, 8)):
            policy = {
                "type": self._random.choice(policies.FORWARDED_CODES),
                "number": self._next(),
                "text": "终端",
            }
            self._accounting.expect(kinds.FORWARDED, json.dumps(policy, ensure_ascii=False))
            self._terminal.daemon.push_policy(policy)
        self._terminal.sync()

    def push_notice(self) -> None:
        """The platform wants the user to know something."""
        policy = self._random.choice(_NOTICES)
        self._accounting.expect(kinds.NOTICES, policy.notice)
        self._push(policy.code)

    def push_logout(self) -> None:
        """The platform ends the session, of which the box's login manager only takes note."""
        policy = self._random.choice(_LOGOUTS)
        self._accounting.expect(kinds.NOTICES, policy.notice)
        self._push(policy.code)
        self._logout_due = True

    def push_for_somebody_else(self) -> None:
        """The platform ends the session of another user."""
        self._push(self._random.choice(_FOR_ONE_ACCOUNT).code, self._terminal.user.uid + 1)

    def use_kept_application(self) -> None:
        """Open a window of an application that is kept on the dock, or close all."""
        app = self._random.choice(list(_KEPT_ON_DOCK))
        opens = not self._terminal.dock.windows(app)
        self._accounting.expect(kinds.APPLICATIONS, _OPENED if opens else _CLOSED, _KEPT_ON_DOCK[app])
        self._terminal.dock.set_windows(app, 1 if opens else 0)
        self._wait_for_dock()

    def open_application(self) -> None:
        """Start one that is not open yet."""
        closed = [name for name in _OTHERS if name not in self._terminal.dock.apps]
        if closed:
            name = self._random.choice(closed)
            self._accounting.expect(kinds.APPLICATIONS, _OPENED, name)
            self._terminal.dock.open_app(name, name)
            self._wait_for_dock()

    def change_windows(self) -> None:
        """One window more of an open application, or one less."""
        name = self._open_application()
        if name:
            windows = self._terminal.dock.windows(name)
            wanted = 1 if windows > 1 else windows + 1
            self._accounting.expect(kinds.APPLICATIONS, _OPENED if wanted > windows else _CLOSED, name)
            self._terminal.dock.set_windows(name, wanted)
            self._wait_for_dock()

    def close_application(self) -> None:
        """End an open one with all its windows."""
        name = self._open_application()
        if name:
            self._accounting.expect(kinds.APPLICATIONS, _CLOSED, name)
            self._terminal.dock.close_app(name)
            self._wait_for_dock()

    def change_packages(self) -> None:
        """Install a package, or update or remove one that is installed."""
        choices = ["update"]
        if len(self._packages) < _MOST_PACKAGES:
            choices.append("install")
        if len(self._packages) > 1:
            choices.append("remove")
        match self._random.choice(choices):
            case "install":
                self._install()
            case "update":
                self._update()
            case _:
                self._remove()
        self._accounting.wait(kinds.CHANGES, kinds.INVENTORIES)

    def restart_daemon(self) -> None:
        """The daemon is updated: it ends, starts and asks the sessions to announce themselves."""
        self._terminal.sync()
        self._terminal.daemon.leave()
        self._expect_user()
        self.expect_status()
        self._terminal.daemon.appear(announce=True)
        self._terminal.sync()

    def restart_desktop(self) -> None:
        """Dock and launcher start again; the applications go on."""
        self._terminal.sync()
        self._terminal.dock.restart()
        self._terminal.launcher.restart()
        self._terminal.receive_all()

    def restart_service(self) -> None:
        """One of the other services starts again."""
        self._terminal.sync()
        self._terminal.fakes[self._random.choice(_RESTARTED)].restart()
        self._terminal.receive_all()

    def stop_platform(self) -> None:
        """Nothing is to be had of the platform until it starts again."""
        self._terminal.platform.leave()

    def start_platform(self) -> None:
        """The platform serves again."""
        if not self._terminal.platform.present:
            self._terminal.platform.appear()

    def _push(self, code: int, uid: int | None = None) -> None:
        self._terminal.daemon.push_policy(
            {"type": code, "payload": {"uid": uid or self._terminal.user.uid}, "number": self._next()}
        )
        self._terminal.sync()

    def _install(self) -> None:
        package = f"package-{self._next()}"
        item = LauncherItem(desktop_file(package), package.title())
        self._put(item, 1)
        self._accounting.expect(kinds.CHANGES, _CREATED, item.name, "1")
        self._expect_inventory()
        self._terminal.launcher.install(item)

    def _update(self) -> None:
        item = self._random.choice(list(self._packages))
        self._put(item, self._packages[item] + 1)
        self._accounting.expect(kinds.CHANGES, _UPDATED, item.name, str(self._packages[item]))
        self._expect_inventory()
        self._terminal.launcher.update(item)

    def _remove(self) -> None:
        item = self._random.choice(list(self._packages))
        self._terminal.packages.remove(_package(item))
        del self._packages[item]
        self._expect_inventory()
        self._terminal.launcher.remove(item)

    def _put(self, item: LauncherItem, version: int) -> None:
        self._packages[item] = version
        self._terminal.packages.install(_package(item), str(version))

    def _expect_inventory(self) -> None:
        software = [(item.name, str(version)) for item, version in self._packages.items()]
        self._accounting.expect(kinds.INVENTORIES, *software)

    def _expect_user(self) -> None:
        self._accounting.expect(kinds.USERS, self._terminal.user.plain_name, self._terminal.user.uid)

    def _open_application(self) -> str | None:
        names = [name for name in self._terminal.dock.apps if name not in _KEPT_ON_DOCK]
        return self._random.choice(names) if names else None

    def _wait_for_dock(self) -> None:
        self._accounting.wait(kinds.APPLICATIONS)
        self._terminal.receive_all()

    def _next(self) -> int:
        self._number += 1
        return self._number


def _package(item: LauncherItem) -> str:
    return item.path.rpartition("/")[2].removesuffix(".desktop")
