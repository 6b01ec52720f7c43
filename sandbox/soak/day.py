"""How a session's day goes."""

from __future__ import annotations

from random import Random
from typing import Iterator, NamedTuple

from sandbox.soak.model import SURELY_ALL_POLLED
from sandbox.soak.session import ACTIVITIES, BEGIN, Session
from sandbox.soak.usage import Usage, usage

_MINUTES = 60
_WORKING_HOURS = range(8, 20)


class _Rate(NamedTuple):
    """How often an activity takes place in an hour, where it is possible: while the user is there, in an
    absence in the working hours, at night."""

    present: float
    absent: float
    night: float


_RATES = {
    "open_application": _Rate(10, 0, 0),
    "change_windows": _Rate(25, 1, 0),
    "close_application": _Rate(8, 1, 0.2),
    "go_away": _Rate(2, 0, 60),
    "come_back": _Rate(0, 5, 0),
    "post_messages": _Rate(4, 4, 1),
    "push_forwarded": _Rate(5, 5, 2),
    "push_policy": _Rate(1.5, 1.5, 0.6),
    "push_for_somebody_else": _Rate(0.5, 0.5, 0.1),
    "install_package": _Rate(0.7, 0.3, 1),
    "update_package": _Rate(0.7, 0.4, 1),
    "remove_package": _Rate(0.7, 0.3, 1),
    "restart_daemon": _Rate(0.5, 0.5, 0.5),
    "restart_service": _Rate(1.5, 1.5, 0.6),
    "stop_platform": _Rate(0.2, 0.2, 0.2),
    "start_platform": _Rate(8, 8, 8),
}


def live(session: Session, hours: int, seed: int) -> Iterator[Usage]:
    """Live through so many hours after one of warming up; what the agent holds of the machine after each.

    The session is one of this box's user, domain or local; its accounting says what was sent and has arrived.
    Lost is raised as soon as something did not arrive that is due, or arrived unsent.
    """
    random = Random(seed)
    session.log_in()
    for _ in range(hours + 1):
        for _ in range(_MINUTES):
            _live_minute(session, random)
        yield usage(session.terminal.agent.pid)
    for name in ("come_back", "start_platform"):
        ACTIVITIES[name].happen_at_random(session, random)
    session.wait(minutes=SURELY_ALL_POLLED)
    session.nothing_is_lost()


def _live_minute(session: Session, random: Random) -> None:
    works = (BEGIN + session.model.elapsed // 3600) % 24 in _WORKING_HOURS
    for name, rate in _RATES.items():
        often = (rate.present if session.model.present else rate.absent) if works else rate.night
        if random.random() < often / _MINUTES:
            ACTIVITIES[name].happen_at_random(session, random)
            session.nothing_is_lost()
    session.wait(minutes=1)
    session.nothing_is_lost()
