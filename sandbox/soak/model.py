"""A session as plain values: what is possible in it, and what the agent owes because of what happens."""

from __future__ import annotations

import json

from sandbox import policies
from sandbox.machine.users import User
from sandbox.soak import accounting as kinds
from sandbox.soak.accounting import Accounting

PASSWORD_TIP = "your password will expire in 3 days"
KEPT_ON_DOCK = {"files": "Files", "browser": "浏览器", "terminal": "Terminal"}
MOST_PACKAGES = 8
SURELY_ALL_POLLED = 10  # minutes; each poll reads all that wait

_OTHERS = ("Mail", "Editor", "Calculator", "播放器", "Viewer", "Calendar", "Notes", "Chat")
_FIRST_PACKAGES = ("editor", "mail", "player")
_OPENED, _CLOSED = 1, 2
_ACTIVE, _LOCKED, _BEHIND_SCREEN_SAVER = 1, 2, 3
_CREATED, _UPDATED = 1, 2
_STATE_PERIOD = 300  # seconds between two reports of the session's state
_SCREEN_SAVER_AFTER = 5  # minutes of absence


class Model:
    """Notes in the accounting what must arrive. Each method is called before what it describes happens."""

    def __init__(self, user: User, accounting: Accounting) -> None:
        self.user = user
        self.served = user.is_domain_user  # by the platform, which local users have none of
        self.present = True
        self.packages: dict[str, int] = {}  # with their versions
        self.elapsed = 0  # seconds
        self.windows = dict.fromkeys(KEPT_ON_DOCK, 0)
        self._absence = 0  # minutes
        self._undisturbed = 0  # minutes in which the agent could ask for messages
        self._number = 0
        self._logout_due = False
        self._expect = accounting.expect

    def log_in(self) -> None:
        """The agent starts, and announces all that it finds."""
        if self.user.is_domain_user:
            self._expect(kinds.NOTICES, PASSWORD_TIP)
        self.packages = dict.fromkeys(_FIRST_PACKAGES, 1)
        self._expect_inventory()
        self.announce()

    def announce(self) -> None:
        """The agent introduces itself to a daemon."""
        self._expect(kinds.USERS, self.user.plain_name, self.user.uid)
        self._expect_status()

    def pass_time(self, seconds: int) -> None:
        """What is due in that time; a policy's log-out is due with the next whole minute."""
        periods = self.elapsed // _STATE_PERIOD
        self.elapsed += seconds
        if self.elapsed // _STATE_PERIOD > periods:
            self._expect_status()

    def pass_minute(self) -> bool:
        """The same of a minute; whether the screen saver starts in it."""
        starts = not self.present and self._absence == _SCREEN_SAVER_AFTER
        self._absence += not self.present
        if self._logout_due:
            self._expect(kinds.LOGOUTS)
            self._logout_due = False
        self._undisturbed += self.served and self.present
        self.pass_time(60)
        return starts

    def leave(self) -> None:
        """The user goes away, and the agent does not ask for messages."""
        self.present, self._undisturbed = False, 0

    def come_back(self) -> None:
        """The user is there again."""
        self.present, self._absence = True, 0

    def serve(self, served: bool) -> None:
        """The platform starts or ends."""
        self.served, self._undisturbed = served, 0

    def due(self) -> list[str]:
        """The kinds of which all must have arrived by now."""
        if self._undisturbed >= SURELY_ALL_POLLED:
            return list(kinds.KINDS)
        return [kind for kind in kinds.KINDS if kind not in (kinds.MESSAGES, kinds.RECEIPTS)]

    def message(self) -> tuple[str, str]:
        """Title and content of the next message, which a poll will bring."""
        self._undisturbed = 0
        number = self.next()
        title, content = f"message {number}", "长" * 500 if number % 2 else "short"
        self._expect(kinds.MESSAGES, title, content)
        return title, content

    def receipt(self, uuid: str) -> None:
        """The platform knows a message by this name."""
        self._expect(kinds.RECEIPTS, uuid)

    def forwarded(self) -> dict[str, object]:
        """The next policy that is not the agent's own."""
        number = self.next()
        code = policies.FORWARDED_CODES[number % len(policies.FORWARDED_CODES)]
        policy = {"type": code, "number": number, "text": "终端"}
        self._expect(kinds.FORWARDED, json.dumps(policy, ensure_ascii=False))
        return policy

    def policy(self, policy: policies.Policy) -> None:
        """One of the agent's own for this user comes."""
        if self.user.is_domain_user or policy not in policies.for_domain_users():
            self._expect(kinds.NOTICES, policy.notice)
            self._logout_due |= policy.action == "WarnThenLogOut"

    def closed_applications(self) -> list[str]:
        """Those that can be opened."""
        return [name for name in _OTHERS if name not in self.windows]

    def open_applications(self) -> list[str]:
        """Those that are not kept on the dock."""
        return [name for name in self.windows if name not in KEPT_ON_DOCK]

    def open(self, name: str) -> None:
        """An application starts with a window."""
        self.windows[name] = 1
        self._expect(kinds.APPLICATIONS, _OPENED, name)

    def close(self, name: str) -> None:
        """An application ends."""
        del self.windows[name]
        self._expect(kinds.APPLICATIONS, _CLOSED, name)

    def change_windows(self, name: str) -> int:
        """A window more or less; how many there are then."""
        before = self.windows[name]
        fewest = 0 if name in KEPT_ON_DOCK else 1
        self.windows[name] = before + 1 if before == fewest else fewest
        change = _OPENED if self.windows[name] > before else _CLOSED
        self._expect(kinds.APPLICATIONS, change, KEPT_ON_DOCK.get(name, name))
        return self.windows[name]

    def install(self) -> str:
        """A new package comes, with this name."""
        name = f"package-{self.next()}"
        self._put(name, 1, _CREATED)
        return name

    def update(self, name: str) -> None:
        """A package gets its next version."""
        self._put(name, self.packages[name] + 1, _UPDATED)

    def remove(self, name: str) -> None:
        """A package goes."""
        del self.packages[name]
        self._expect_inventory()

    def next(self) -> int:
        """Another number."""
        self._number += 1
        return self._number

    def _put(self, name: str, version: int, change: int) -> None:
        self.packages[name] = version
        self._expect(kinds.CHANGES, change, name.title(), str(version))
        self._expect_inventory()

    def _expect_inventory(self) -> None:
        software = [(name.title(), str(version)) for name, version in self.packages.items()]
        self._expect(kinds.INVENTORIES, *software)

    def _expect_status(self) -> None:
        absent = _BEHIND_SCREEN_SAVER if self._absence > _SCREEN_SAVER_AFTER else _LOCKED
        self._expect(kinds.STATUSES, _ACTIVE if self.present else absent, self.user.plain_name)
