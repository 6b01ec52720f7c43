"""The start: from exec to the report of the user, for a domain user to the reply with the password tips."""

from __future__ import annotations

import subprocess
import time
from typing import Iterator

from bench import callgrind
from bench.testbed import ADDRESS, Testbed
from bench.figures import Figure, Goal
from bench.plan import Plan
from bench.programs import Program, agent, floor
from sandbox.machine.users import current_user

_CHILD = ["/usr/bin/dpkg-architecture", "-q", "DEB_HOST_ARCH_CPU"]
_ASKS = "beside the child the agent asks login manager, dock and launcher in turn; fewer calls would reach it"
_TIME = Goal("at most", 1.25, otherwise=_ASKS)


def measure(plan: Plan) -> Iterator[Figure]:
    """Measures the figures of this box's user."""
    return _domain(plan) if current_user().is_domain_user else _local(plan)


def _local(plan: Plan) -> Iterator[Figure]:
    programs = agent(), floor("start")
    with Testbed() as testbed:

        def milliseconds(program: Program) -> float:
            with testbed.start(program) as process:
                (reported,) = testbed.desktop.wait_for("UpdateUserInfo")
            return (reported - process.began) / 1e6

        values, floors = plan.pairs("start of a local user", *programs, milliseconds)
        yield Figure("start.local.time", "local user, to UpdateUserInfo", "time", "ms", values, floors, _TIME)

        (children,) = plan.repeat("dpkg-architecture", lambda: (_child_milliseconds(),))
        yield Figure("start.local.child", "of it, dpkg-architecture, a child", "time", "ms", children)

        values, floors = plan.counts("instructions of a local user's start", *programs, callgrind.of_start)
        goal = Goal("at most", 1.5)
        yield _instructions("start.local.instructions", "local user, to UpdateUserInfo", values, floors, goal)


def _domain(plan: Plan) -> Iterator[Figure]:
    programs = agent(), floor("drain", ADDRESS)
    with Testbed(platform=True) as testbed:

        def milliseconds(program: Program) -> float:
            with testbed.start(program) as process:
                (answered,) = testbed.platform.wait_for("tips")
            return (answered - process.began) / 1e6

        values, floors = plan.pairs("start of a domain user", *programs, milliseconds)
        yield Figure("start.domain.time", "domain user, to the tips", "time", "ms", values, floors, _TIME)

        values, floors = plan.counts("instructions of a domain user's start", *programs, callgrind.of_start)
        yield _instructions("start.domain.instructions", "domain user, to the tips", values, floors, _TIME)


def _instructions(name: str, title: str, values: list[float], floors: list[float], goal: Goal) -> Figure:
    millions, floor_millions = ([value / 1e6 for value in row] for row in (values, floors))
    return Figure(name, title, "instructions", "million", millions, floor_millions, goal)


def _child_milliseconds() -> float:
    begin = time.monotonic()
    subprocess.run(_CHILD, stdin=subprocess.DEVNULL, capture_output=True, check=True)
    return (time.monotonic() - begin) * 1e3
