"""A terminal that really boots: systemd as its first process, real log-ins, login manager and buses.

What is ours on it besides the installed package: the users of a fleet, root's daemon and identity service,
and the desktop's services (guest/).
"""

from __future__ import annotations

import json
import re
import subprocess
from dataclasses import dataclass
from pathlib import Path
from typing import Any, Callable

from tests.booted.nspawn import Boot
from tests.booted.overlay import Overlay
from tests.booted.patience import wait_for

USERS = {"root": 0, "alice": 1000, "bob": 1001, "zhang@corp.example": 20001, "@li": 20002}
GREETERS = {"greeter": 150, "made-up-greeter": 60999}
_UIDS = {**USERS, **GREETERS}
_COMMAND_SECONDS = 120
CONTROL = "com.norix.velk.booted"
DAEMON = ("com.norix.velk.velkg", "/com/norix/velk/velkg", "com.norix.velk.velkg")


@dataclass(frozen=True)
class Asked:
    """What a fake service was asked, or the begin of a session."""

    who: str
    member: str
    args: list[Any]
    uid: int | None
    pid: int | None


@dataclass(frozen=True)
class LogIn:
    """A log-in that a test has made; the unit is that of its first program."""

    unit: str
    user: str
    name: str


class Machine:
    """The terminal, from its first boot until it is closed. It may reboot in between."""

    def __init__(self, name: str, log: Path) -> None:
        self.overlay = Overlay(name)
        self.overlay.prepare()
        self._name = name
        self._log = log
        self._sessions = 0
        self._boot = self._begin()

    def run(self, *command: str, user: str = "root", check: bool = True) -> subprocess.CompletedProcess[str]:
        """Run a command as root, or as a user who can reach their service manager and bus; in no session."""
        uid = str(_UIDS[user])
        runtime = f"/run/user/{uid}"
        become = ["setpriv", f"--reuid={uid}", f"--regid={uid}", "--clear-groups"]
        environment = [
            f"XDG_RUNTIME_DIR={runtime}",
            f"DBUS_SESSION_BUS_ADDRESS=unix:path={runtime}/bus",
            "HOME=/",
        ]
        enter = ["nsenter", "--target", str(self._boot.leader), *"-m -u -i -n -p -C".split(), "--"]
        ended = subprocess.run(
            [*enter, "env", *environment, *(become if user != "root" else []), *command],
            capture_output=True,
            text=True,
            timeout=_COMMAND_SECONDS,
            stdin=subprocess.DEVNULL,
        )
        assert not check or ended.returncode == 0, f"{command}: {ended.stdout}{ended.stderr}"
        return ended

    def said(self, *command: str, user: str = "root") -> str:
        """What a command writes, whatever its status."""
        return self.run(*command, user=user, check=False).stdout.strip()

    def write(self, path: str, content: str) -> None:
        """Write a file while the machine runs."""
        place = Path(f"/proc/{self._boot.leader}/root") / path.lstrip("/")
        self.run("mkdir", "-p", str(Path(path).parent))
        place.write_text(content)

    def install(self, package: Path) -> str:
        """Install a package as an administrator does on a running machine; what its scripts printed."""
        place = Path(f"/proc/{self._boot.leader}/root/root/agent.deb")
        place.write_bytes(package.read_bytes())
        return self.run("dpkg", "--force-downgrade,unsafe-io", "--install", "/root/agent.deb").stdout

    def log_in(
        self,
        user: str,
        way: str = "target",
        kind: str = "wayland",
        session_class: str = "user",
        seat: str = "seat0",
    ) -> LogIn:
        """Begin a session whose program is the desktop of guest/desktop.py; a `kind` of "tty" has none."""
        self._sessions += 1
        unit = f"log-in-{self._sessions}.service"
        mark = len(self.events())
        variables = {"XDG_SESSION_TYPE": kind, "XDG_SESSION_CLASS": session_class, "XDG_SEAT": seat}
        program = (
            ["sleep", "infinity"] if kind == "tty" else ["/usr/bin/python3", "/opt/booted/desktop.py", way]
        )
        self.run(
            *["systemd-run", "--quiet", f"--unit={unit}", "--property=PAMName=booted", f"--uid={user}"],
            *[f"--setenv={name}={value}" for name, value in variables.items() if value],
            *program,
        )
        if kind == "tty":
            name = wait_for(f"a text session of {user}", lambda: self._text_session(user))
        else:
            begun = self.wait_for_event(lambda e: e.who == "session" and e.uid == _UIDS[user], mark)
            name = begun.args[0]
        return LogIn(unit, user, name)

    def log_out(self, session: LogIn) -> None:
        """End a session as its desktop does; returns when the login manager has forgotten it."""
        self.run("systemctl", "stop", session.unit)
        wait_for(f"the end of session {session.name}", lambda: session.name not in self.session_names())

    def session_names(self, user: str | None = None) -> list[str]:
        """The sessions that the login manager knows, but for those of service managers."""
        lines = self.said("loginctl", "--no-legend", "list-sessions").splitlines()
        rows = [line.split() for line in lines if "manager" not in line]
        return [row[0] for row in rows if user is None or row[2] == user]

    def end_sessions(self) -> None:
        """Log everybody out; returns when no user manager runs any more."""
        self.run("systemctl", "stop", "log-in-*.service", check=False)
        for name in self.session_names():
            self.run("loginctl", "terminate-session", name, check=False)
        wait_for("the end of all user managers", self._has_no_users)

    def agent(self, user: str) -> int:
        """Process id of the user's agent, 0 if none runs."""
        return int(self.unit("MainPID", user) or 0)

    def unit(self, name: str, user: str = "alice") -> str:
        """What the service manager shows of the user's agent: a property of its unit."""
        return self.said("systemctl", "--user", "show", "velks", f"--property={name}", "--value", user=user)

    def wait_for_agent(self, user: str, other_than: int = 0) -> int:
        """Process id of an agent that has announced its session to the daemon, and is not an earlier one."""

        def ready() -> int:
            pid = self.agent(user)
            has_reported = any(
                event.member == "SendUserStatus" and event.pid == pid for event in self.events()
            )
            return pid if has_reported and pid != other_than else 0

        return wait_for(f"an agent of {user}", ready)

    def wait_for_manager(self, user: str) -> None:
        """Return when the user's service manager has started all that it starts by itself."""
        start = ["systemctl", "--user", "start", "default.target"]
        wait_for(f"the manager of {user}", lambda: self.run(*start, user=user, check=False).returncode == 0)

    def starts_skipped(self) -> int:
        """How often conditions have kept an agent from starting, as the service managers tell."""
        return len(
            re.findall(r"velks\.service.* [Ss]kipped", self.said("journalctl", "--boot", "--unit=user@*"))
        )

    def agents(self) -> list[int]:
        """The uids that agents run for."""
        lines = self.said("ps", "-C", "velks", "-o", "pid=,ppid=,uid=").splitlines()
        rows = [[int(word) for word in line.split()] for line in lines]
        known = {pid for pid, _, _ in rows}
        # A child that has not become another program yet is no agent.
        return sorted(uid for _, parent, uid in rows if parent not in known)

    def events(self) -> list[Asked]:
        """All that the fakes were asked since the boot."""
        lines = Path(f"/proc/{self._boot.leader}/root/run/booted/events").read_text().splitlines()
        return [Asked(**json.loads(line)) for line in lines]

    def count(self, member: str, after: int) -> int:
        """How often a member was called since then."""
        return sum(event.member == member for event in self.events()[after:])

    def mark(self) -> int:
        """The place in `events` where what comes now begins."""
        return len(self.events())

    def wait_for_event(self, wanted: Callable[[Asked], bool], after: int = 0) -> Asked:
        """The first event of this kind."""
        return wait_for("an event", lambda: next((e for e in self.events()[after:] if wanted(e)), None))

    def push_policy(self, payload: dict[str, Any] | str) -> None:
        """Have the daemon broadcast a policy."""
        text = payload if isinstance(payload, str) else json.dumps(payload)
        self.command_daemon("Emit", DAEMON[1], DAEMON[2], "pushPolicyMsg", "booted", text)

    def command_daemon(self, member: str, *arguments: str) -> None:
        """Configure root's fakes: see guest/services.py."""
        self.run("busctl", "call", DAEMON[0], DAEMON[1], CONTROL, member, "s" * len(arguments), *arguments)

    def command_desktop(self, user: str, member: str, *arguments: str) -> None:
        """Tell the fakes of a user's desktop what to do."""
        service = ["com.norix.kpx.Notification", "/com/norix/kpx/Notification", CONTROL]
        command = ["busctl", "--user", "call", *service, member, "s" * len(arguments), *arguments]
        self.run(*command, user=user)

    def wait_for_reboot(self) -> None:
        """Return when the machine has rebooted itself and runs again."""
        self._wait_for_end()
        assert self._boot.rebooted, "the machine went off"
        self._boot = self._begin()

    def wait_for_power_off(self) -> None:
        """Return when the machine has gone off, and been switched on again."""
        self._wait_for_end()
        assert not self._boot.rebooted, "the machine rebooted"
        self._boot = self._begin()

    def _wait_for_end(self) -> None:
        wait_for("the machine's end", lambda: self._boot.ended)
        self._boot.stop()

    def check(self, user: str = "alice") -> str:
        """What velks-check tells the user, in a session, or the policy kit would refuse all."""
        asked = ["systemd-run", "--user", "--quiet", "--pipe", "--wait", "--collect", "velks-check"]
        return self.said(*asked, user=user)

    def reload_bus(self) -> None:
        """Have the system bus read its policies and services anew."""
        bus = "org.freedesktop.DBus"
        self.run("busctl", "call", bus, "/", bus, "ReloadConfig")

    def has_service(self, name: str) -> bool:
        """Whether somebody owns a name on the system bus."""
        bus = "org.freedesktop.DBus"
        return self.said("busctl", "call", bus, "/", bus, "NameHasOwner", "s", name) == "b true"

    def uptime(self) -> float:
        """Seconds since the host has booted, which the machine's processes live by."""
        return float(self.said("cut", "--delimiter= ", "--fields=1", "/proc/uptime"))

    def close(self) -> None:
        """End the machine at once and forget what it wrote."""
        self._boot.stop()
        self.overlay.close()

    def _begin(self) -> Boot:
        boot = Boot(self._name, self.overlay.root, self._log)
        self._boot = boot
        wait_for("the boot", lambda: self.said("systemctl", "is-system-running") in {"running", "degraded"})
        wait_for("the daemon", lambda: self.has_service(DAEMON[0]))
        return boot

    def _has_no_users(self) -> bool:
        # It fails if a user goes while it asks.
        listed = self.run("loginctl", "--no-legend", "list-users", check=False)
        return listed.returncode == 0 and not listed.stdout.strip()

    def _text_session(self, user: str) -> str:
        for name in self.session_names(user):
            if self.said("loginctl", "show-session", name, "--property=Type", "--value") == "tty":
                return name
        return ""
