"""How a terminal's day goes."""

from __future__ import annotations

from dataclasses import dataclass
from random import Random
from typing import Callable

from sandbox.soak.activities import Activities
from sandbox.soak.accounting import Accounting
from sandbox.terminal import Terminal

BEGIN = 8  # o'clock, when somebody logs in

_MINUTES = 60
_WORKING_HOURS = range(8, 20)
_LEAST_ABSENCE, _LONGEST_ABSENCE = 3, 25  # minutes
_SCREEN_SAVER_AFTER = 5  # minutes of absence
_LONGEST_OUTAGE = 15  # minutes
_STATE_PERIOD = 300  # seconds between two reports of the session's state
_SURELY_ALL_POLLED = 10  # minutes; each poll reads all that wait
# The agent's timers are coarse: looked at in the middle of a minute, they are due or they are not.
_HALF_A_MINUTE = 30


@dataclass(frozen=True)
class _Rate:
    """How often an activity takes place in an hour: while the user is there, in an absence in the working
    hours, at night."""

    activity: Callable[[], None]
    present: float
    absent: float
    night: float


class Day:
    """Lives hour by hour through a day that a seed tells, minute by minute of the agent's time."""

    def __init__(self, terminal: Terminal, accounting: Accounting, seed: int) -> None:
        self._terminal = terminal
        self._random = Random(seed)
        self._activities = Activities(terminal, accounting, self._random)
        self._rates = self._make_rates()
        self._elapsed = 0  # seconds
        self._absence = 0  # minutes until the user is back
        self._absent_for = 0
        self._outage = 0  # minutes until the platform is back

    def _make_rates(self) -> list[_Rate]:
        activities = self._activities
        return [
            _Rate(activities.use_kept_application, 10, 0, 0),
            _Rate(activities.open_application, 10, 0, 0),
            _Rate(activities.change_windows, 15, 1, 0),
            _Rate(activities.close_application, 8, 1, 0.2),
            _Rate(self._go_away, 2, 0, 0),
            _Rate(activities.post_messages, 4, 4, 1),
            _Rate(activities.push_forwarded_policies, 5, 5, 2),
            _Rate(activities.push_notice, 1, 1, 0.5),
            _Rate(activities.push_logout, 0.5, 0.5, 0.1),
            _Rate(activities.push_for_somebody_else, 0.5, 0.5, 0.1),
            _Rate(activities.change_packages, 2, 1, 3),
            _Rate(activities.restart_daemon, 0.5, 0.5, 0.5),
            _Rate(activities.restart_desktop, 0.3, 0.3, 0.1),
            _Rate(activities.restart_service, 1, 1, 0.5),
            _Rate(self._stop_platform, 0.2, 0.2, 0.2),
        ]

    def begin(self) -> None:
        """Log in."""
        self._activities.log_in()
        self._pass(_HALF_A_MINUTE)

    def live_hour(self) -> None:
        """Whatever an hour brings."""
        for _ in range(_MINUTES):
            self._live_minute()

    def end(self) -> None:
        """Let the user come back and the platform too, and all that still waits arrive."""
        self._come_back()
        self._activities.start_platform()
        for _ in range(_SURELY_ALL_POLLED):
            self._pass(_MINUTES)

    def _live_minute(self) -> None:
        works = self._hour in _WORKING_HOURS
        for rate in self._rates:
            often = (rate.absent if self._absence else rate.present) if works else rate.night
            if self._random.random() < often / _MINUTES:
                rate.activity()
        self._wait_for_user(works)
        self._wait_for_platform()
        self._pass(_MINUTES)

    @property
    def _hour(self) -> int:
        return (BEGIN + self._elapsed // 3600) % 24

    def _wait_for_user(self, works: bool) -> None:
        if not works:
            self._absence = 1  # and another one, until the morning
        if self._absent_for == 0 and self._absence:
            self._activities.lock(True)
        if self._absent_for == _SCREEN_SAVER_AFTER:
            self._activities.start_screen_saver()
        if self._absence:
            self._absent_for += 1
            self._absence -= 1
        elif self._absent_for:
            self._come_back()

    def _go_away(self) -> None:
        self._absence = self._random.randint(_LEAST_ABSENCE, _LONGEST_ABSENCE)

    def _come_back(self) -> None:
        self._absence = self._absent_for = 0
        self._activities.lock(False)

    def _stop_platform(self) -> None:
        self._outage = self._random.randint(1, _LONGEST_OUTAGE)
        self._activities.stop_platform()

    def _wait_for_platform(self) -> None:
        if self._outage:
            self._outage -= 1
        else:
            self._activities.start_platform()

    def _pass(self, seconds: int) -> None:
        """Let time pass, with what is due in it."""
        periods = self._elapsed // _STATE_PERIOD
        self._elapsed += seconds
        if self._elapsed // _STATE_PERIOD > periods:
            self._activities.expect_status()
        if seconds == _MINUTES:
            self._activities.expect_forced_logout()
        self._terminal.advance(seconds)
