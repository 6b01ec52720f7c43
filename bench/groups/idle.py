"""The agent's activity in a minute in which no timer is due."""

from __future__ import annotations

import time
from typing import Iterator

from bench.testbed import ADDRESS, Testbed
from bench.figures import Figure, Goal
from bench.plan import Plan
from bench.programs import agent, floor
from sandbox.machine.users import current_user

_CALM = 2.0  # seconds after which the start is certainly over
# The first poll of a domain user may come a minute after the start.
_SECONDS = {"local": 60, "domain": 56}


def measure(plan: Plan) -> Iterator[Figure]:
    """Measures both programs during the same minute."""
    is_domain = current_user().is_domain_user
    who = "domain" if is_domain else "local"
    seconds = _SECONDS[who]
    bare = floor("drain", ADDRESS) if is_domain else floor("start")
    with Testbed(platform=is_domain) as testbed, testbed.start_and_wait(agent()) as one:
        with testbed.start_and_wait(bare) as other:
            plan.show_step(f"idle for {seconds} s")
            time.sleep(_CALM)
            switches = [process.voluntary_switches() for process in (one, other)]
            busy = [process.cpu_nanoseconds() for process in (one, other)]
            time.sleep(seconds)
            switches = [process.voluntary_switches() - was for process, was in zip((one, other), switches)]
            busy = [process.cpu_nanoseconds() - was for process, was in zip((one, other), busy)]
            threads = [process.threads() for process in (one, other)]

    def figure(name: str, title: str, unit: str, values: list[int], most: int) -> Figure:
        title = f"{title} in {seconds} s idle, {who} user"
        goal = Goal("at most", most, "value")
        return Figure(f"idle.{who}.{name}", title, "count", unit, values[:1], values[1:], goal)

    yield figure("switches", "voluntary switches", "switches", switches, 0)
    yield figure("cpu", "CPU", "ns", busy, 0)
    yield figure("threads", "threads", "threads", threads, 2)
