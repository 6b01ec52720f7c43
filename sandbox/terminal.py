"""The simulated terminal: buses, fakes, files, platform and agent of the box that this program runs in."""

from __future__ import annotations

from functools import cached_property
from typing import Callable, Collection, Mapping, get_type_hints
from uuid import uuid4

from sandbox.agent import Agent, StillRunning
from sandbox.bus.buses import Bus
from sandbox.bus.monitor import BusMonitor
from sandbox.bus.senders import Senders
from sandbox.contracts import Contracts
from sandbox.events import PATIENCE, SYNC, WAKE_UP, Events
from sandbox.fakes.base import Fake
from sandbox.fakes.daemon import Daemon
from sandbox.fakes.dock import Dock
from sandbox.fakes.identity import IdentityService
from sandbox.fakes.launcher import Launcher
from sandbox.fakes.logind import Logind
from sandbox.fakes.notifications import Notifications
from sandbox.fakes.policy_service import PolicyService
from sandbox.fakes.screensaver import ScreenSaver
from sandbox.fakes.session_manager import SessionManager
from sandbox.machine import commands
from sandbox.machine.clock import Clock, ManualClock, MovableClock
from sandbox.machine.files import FileView
from sandbox.machine.package_tools import Tools
from sandbox.machine.packages import Packages
from sandbox.machine.users import current_user
from sandbox.platform.server import Platform, trust


class Terminal:
    """A new Terminal has fresh files, fresh buses with all fakes on them except those in `absent`, and an
    agent that is not started. As a context manager it closes itself.

    Needs a box; only one program at a time may open a Terminal there.
    """

    daemon: Daemon
    logind: Logind
    identity: IdentityService
    policy_service: PolicyService
    notifications: Notifications
    screensaver: ScreenSaver
    session_manager: SessionManager
    dock: Dock
    launcher: Launcher

    def __init__(self, clock: Clock | None = None, absent: Collection[str] = ()) -> None:
        self.user = current_user()
        self.events = Events()
        self.patience = PATIENCE  # seconds that `sync` waits
        self.contracts = Contracts(self.events)
        self.clock: Clock = clock or ManualClock()
        self.files = FileView(self.user)
        self.files.reset()
        self.system_bus = Bus("system", self.user)
        self.session_bus = Bus("session", self.user)
        for bus in (self.system_bus, self.session_bus):
            bus.restart()
        commands.install_defaults()
        self.commands = self.tools = Tools(self.events)
        self.packages = Packages()
        self.senders = Senders()
        self._add_fakes()
        self.system_monitor = self._monitor(self.system_bus)
        self.session_monitor = self._monitor(self.session_bus)
        self.monitors = (self.system_monitor, self.session_monitor)
        self.agent = Agent(self.events, self.senders)
        unknown = set(absent) - self.fakes.keys()
        assert not unknown, f"no such fakes: {unknown}"
        for name, fake in self.fakes.items():
            if name not in absent:
                fake.appear()

    def _add_fakes(self) -> None:
        self.fakes: dict[str, Fake] = {}
        for name, fake in FAKES.items():
            bus = self.system_bus if fake.bus_kind == "system" else self.session_bus
            self.fakes[name] = fake(bus, self.events, self.senders)
            setattr(self, name, self.fakes[name])

    def _monitor(self, bus: Bus) -> BusMonitor:
        served = [fake.bus_name for fake in self.fakes.values() if fake.bus is bus]
        return BusMonitor(bus, self.senders, served)

    def __enter__(self) -> Terminal:
        return self

    def __exit__(self, kind: type[BaseException] | None, *_details: object) -> None:
        if kind:
            self.shut_down()
        else:
            self.close()

    @cached_property
    def platform(self) -> Platform:
        """The platform. It starts on first use, when the terminal also gets its address and certificates; a
        test that does not use it sees no polls."""
        known = trust()
        self.files.write_certificates(
            known.authority.certificate, known.terminal.certificate, known.terminal.key
        )
        platform = Platform(self.events)
        self.files.write_platform_address(platform.port)
        return platform

    def start_agent(
        self, ready: Callable[[], object] | None = None, extra_env: Mapping[str, str] | None = None
    ) -> None:
        """Start the agent and wait until it has reported the session to the daemon and handles messages.

        Without a daemon, wait until it has logged the user's name instead; `ready` replaces the whole wait.
        """
        mark = self.events.mark()
        self.agent.start(self.clock, extra_env)
        if ready:
            ready()
        elif self.daemon.present:
            self.events.wait_for(source="velks", target="daemon", member="SendUserStatus", after=mark)
            self.sync()
        else:
            self.events.wait_for(
                lambda event: "---getusername:" in event.args[0], kind="log", count=2, after=mark
            )
            self.receive_all()

    def sync(self, timeout: float | None = None) -> None:
        """Return once the agent has handled everything that was sent to it so far, and everything that it
        sent in response is recorded.

        To see that, the daemon pushes a policy that is no JSON, which the agent logs and ignores.
        """
        token = f"{SYNC}{uuid4()}"
        mark = self.events.mark()
        self.daemon.push_policy(token)
        limit = timeout or self.patience
        self.events.wait_for(lambda event: token in event.args[0], kind="log", after=mark, timeout=limit)
        self.receive_all()

    def receive_all(self) -> None:
        """Return once everything that the agent has sent so far, to present or absent services, is
        recorded."""
        for bus in (self.system_bus, self.session_bus):
            bus.receive_all_from(self.agent.pid)
        for fake in self.fakes.values():
            if fake.present:
                fake.receive_all_from(self.agent.pid)
        for monitor in self.monitors:
            monitor.receive_all()

    def advance(self, seconds: int) -> None:
        """Move the agent's clock ahead and return once the timers that became due have fired.

        The agent first handles everything that was sent to it, so its timers start from now. After the jump,
        one message wakes it up; it handles the next one after the timers.
        """
        self.sync()
        self.jump(seconds)
        self.sync()
        self.sync()

    def jump(self, seconds: int) -> None:
        """Move the agent's clock ahead and wake the agent up without waiting for it: it may be blocked."""
        assert isinstance(self.clock, MovableClock), "this clock cannot be moved"
        self.clock.jump(seconds)
        self.daemon.push_policy(WAKE_UP)

    def violations(self) -> list[str]:
        """Contract violations so far: wrong D-Bus calls, wrong JSON, and calls to services without a
        contract."""
        return [
            *self.contracts.violations,
            *(found for fake in self.fakes.values() for found in fake.violations),
            *(found for monitor in self.monitors for found in monitor.violations),
        ]

    def report(self) -> str:
        """The agent's log and all events, to find the cause of a failure."""
        return f"agent's log:\n{self.agent.log}\n\nevents:\n{self.events.report()}"

    def close(self) -> None:
        """End everything; raises AssertionError if a contract was broken or the agent died."""
        problems = self.shut_down()
        if problems:
            raise AssertionError("\n".join([*problems, self.report()]))

    def shut_down(self) -> list[str]:
        """End everything; returns the problems found."""
        problems = []
        if self.agent.died_unexpectedly:
            problems.append(f"the agent died: exit status {self.agent.exit_status}")
        try:
            self.agent.stop()
        except StillRunning as error:
            problems.append(str(error))
        for monitor in self.monitors:
            monitor.close()
        problems += self.violations()
        for fake in self.fakes.values():
            fake.leave()
        self.commands.close()
        if "platform" in self.__dict__:
            self.platform.close()
        return problems


FAKES: dict[str, type[Fake]] = get_type_hints(Terminal)
"""The fakes of a terminal by name: its declared attributes."""
