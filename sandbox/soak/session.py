"""A session in a terminal of its own: what people and services do there, as rules of hypothesis."""

from __future__ import annotations

from datetime import datetime, time
from typing import Sequence

from hypothesis import settings
from hypothesis.stateful import RuleBasedStateMachine, initialize, invariant

from sandbox import policies
from sandbox.ending import CannotRun
from sandbox.fakes.launcher import LauncherItem
from sandbox.machine.clock import ManualClock
from sandbox.machine.packages import desktop_file
from sandbox.soak.accounting import Accounting
from sandbox.soak.activity import Activity, activity
from sandbox.soak.model import KEPT_ON_DOCK, MOST_PACKAGES, PASSWORD_TIP, Model
from sandbox.terminal import FAKES, Terminal

BEGIN = 8  # o'clock, when somebody logs in

# Until after the notice of the password. The agent's timers are coarse: looked at in the middle of a minute,
# they are due or they are not.
_LOG_IN_SECONDS = 90

settings.register_profile("soak", database=None)  # the tree of a box cannot be written to
settings.load_profile("soak")


class Lost(Exception):
    """Not exactly what was sent has arrived, or a contract was broken; the text has a line for each case."""


class Session(RuleBasedStateMachine):
    """What happens is noted in `history`; after each activity, nothing must be lost."""

    patience = 20.0
    """Seconds until a piece that does not come is lost."""

    def __init__(self) -> None:
        super().__init__()
        self.history: list[str] = []
        self.terminal = Terminal(clock=ManualClock(datetime.combine(datetime.now(), time(BEGIN))))
        self.terminal.patience = 5 * self.patience
        self.accounting = Accounting(self.terminal.events, self.patience)
        self.model = Model(self.terminal.user, self.accounting)

    @initialize()
    def log_in(self) -> None:
        """Fill the terminal and start the agent."""
        user = self.model.user
        if user.is_domain_user:
            self.terminal.platform.password_tip(user.plain_name, PASSWORD_TIP)
        for app, name in KEPT_ON_DOCK.items():
            self.terminal.dock.open_app(app, name, docked=True, windows=0)
        self.model.log_in()
        for package in self.model.packages:
            self._put(package)
        self.terminal.launcher.items = list(map(_item, self.model.packages))
        self.terminal.start_agent()
        self.model.pass_time(_LOG_IN_SECONDS)
        self.terminal.advance(_LOG_IN_SECONDS)

    @invariant()
    def nothing_is_lost(self) -> None:
        """All that is due has arrived, and nothing else."""
        due = self.model.due()
        self.accounting.wait(*due)
        problems = [*self.accounting.differences(due), *self.terminal.violations()]
        if self.terminal.agent.died_unexpectedly:
            problems.append(f"the agent died: exit status {self.terminal.agent.exit_status}")
        if problems:
            raise Lost("\n".join(problems))

    def teardown(self) -> None:
        """Log out."""
        self.terminal.shut_down()

    def replay(self, history: Sequence[str]) -> None:
        """Let all of a history happen again."""
        for step in history:
            name, _, argument = step.partition(":")
            if name not in ACTIVITIES or not ACTIVITIES[name].replay(self, argument):
                raise CannotRun(f"'{step}' is not possible after: {' '.join(self.history) or 'the log-in'}")
            self.nothing_is_lost()

    @activity(minutes=lambda _: (1, 2, 5, 10))
    def wait(self, minutes: int) -> None:
        """Time passes, with what is due in it."""
        for _ in range(minutes):
            if self.model.pass_minute():
                self.terminal.screensaver.run()
            self.terminal.advance(60)

    @activity(when=lambda model: model.present)
    def go_away(self) -> None:
        """The user locks the session; a screen saver will start."""
        self.model.leave()
        self.terminal.session_manager.lock(True)

    @activity(when=lambda model: not model.present)
    def come_back(self) -> None:
        """The user unlocks the session, which ends the screen saver."""
        self.model.come_back()
        self.terminal.session_manager.lock(False)
        self.terminal.screensaver.run(False)

    @activity(when=lambda model: model.served)
    def stop_platform(self) -> None:
        """Nothing is to be had of the platform until it starts again."""
        self.model.serve(False)
        self.terminal.platform.leave()

    @activity(when=lambda model: model.user.is_domain_user and not model.served)
    def start_platform(self) -> None:
        """The platform serves again."""
        self.model.serve(True)
        self.terminal.platform.appear()

    @activity(when=lambda model: model.user.is_domain_user, count=lambda _: range(1, 6))
    def post_messages(self, count: int) -> None:
        """Somebody writes to the user; the messages arrive with the next polls."""
        for _ in range(count):
            message = self.model.message()
            self.model.receipt(self.terminal.platform.post_message(self.model.user.plain_name, *message))

    @activity(count=lambda _: range(1, 9))
    def push_forwarded(self, count: int) -> None:
        """The platform sets a few policies that are not the agent's own."""
        for _ in range(count):
            self.terminal.daemon.push_policy(self.model.forwarded())
        self.terminal.sync()

    @activity(code=lambda _: policies.with_action("Notify", "RequestPasswordChange", "WarnThenLogOut"))
    def push_policy(self, code: policies.Policy) -> None:
        """The platform sends one of the agent's own; the box's login manager only takes note of a log-out."""
        self.model.policy(code)
        self._push(code, self.model.user.uid)

    @activity(code=lambda _: policies.for_one_account())
    def push_for_somebody_else(self, code: policies.Policy) -> None:
        """The platform ends the session of another user."""
        self._push(code, self.model.user.uid + 1)

    @activity(name=lambda model: list(model.windows))
    def change_windows(self, name: str) -> None:
        """One window more of an application on the dock, or one less."""
        self.terminal.dock.set_windows(name, self.model.change_windows(name))

    @activity(name=lambda model: model.closed_applications())
    def open_application(self, name: str) -> None:
        """Start one that is not open yet."""
        self.model.open(name)
        self.terminal.dock.open_app(name, name)

    @activity(name=lambda model: model.open_applications())
    def close_application(self, name: str) -> None:
        """End an open one with all its windows."""
        self.model.close(name)
        self.terminal.dock.close_app(name)

    @activity(when=lambda model: len(model.packages) < MOST_PACKAGES)
    def install_package(self) -> None:
        """A package comes, and with it an application."""
        name = self.model.install()
        self._put(name)
        self.terminal.launcher.install(_item(name))

    @activity(name=lambda model: list(model.packages))
    def update_package(self, name: str) -> None:
        """A package gets its next version."""
        self.model.update(name)
        self._put(name)
        self.terminal.launcher.update(_item(name))

    @activity(name=lambda model: list(model.packages)[1:])
    def remove_package(self, name: str) -> None:
        """A package goes, but never the last one."""
        self.model.remove(name)
        self.terminal.packages.remove(name)
        self.terminal.launcher.remove(_item(name))

    @activity()
    def restart_daemon(self) -> None:
        """The daemon is updated: it ends, starts and asks the sessions to announce themselves."""
        self.terminal.sync()
        self.terminal.daemon.leave()
        self.model.announce()
        self.terminal.daemon.appear(announce=True)
        self.terminal.sync()

    @activity(name=lambda _: [name for name in FAKES if name != "daemon"])
    def restart_service(self, name: str) -> None:
        """Another service starts again; the applications go on."""
        self.terminal.sync()
        self.terminal.fakes[name].restart()
        self.terminal.receive_all()

    def _push(self, policy: policies.Policy, uid: int) -> None:
        self.terminal.daemon.push_policy({"type": policy.code, "payload": {"uid": uid}})
        self.terminal.sync()

    def _put(self, package: str) -> None:
        self.terminal.packages.install(package, str(self.model.packages[package]))


ACTIVITIES: dict[str, Activity] = {
    name: method.activity for name, method in vars(Session).items() if hasattr(method, "activity")
}


def _item(package: str) -> LauncherItem:
    return LauncherItem(desktop_file(package), package.title())
