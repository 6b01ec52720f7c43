"""Inventories of the launcher's items and of the daemon's inventory file."""

from __future__ import annotations

import json
import time
from typing import Any, Iterator

from bench import packages
from bench.testbed import Testbed
from bench.figures import Figure, Goal
from bench.plan import Plan
from bench.programs import Program, agent, floor
from sandbox.machine import layout
from sandbox.machine.packages import Packages

_ITEMS = (10, 100, 300)
_UPGRADED, _UPGRADED_ITEMS = 30, 10  # packages of an upgrade, items of the launcher meanwhile
_LOG_OUT = 1201
_BEHIND = 0.5  # seconds until the agent has all changes in its queue
_MINUTE = 60
_SECONDS_PER_CHILD = 0.5
_ASKED = 300  # records of the file that the tools are asked about
_MEGABYTES = 10
_CHILDREN = Goal("at most", 1.05)
_FORKS = Goal(
    "at most",
    1.02,
    otherwise="QProcess forks, which takes the longer the larger the agent is; posix_spawn would reach it",
)


def measure(plan: Plan) -> Iterator[Figure]:
    """Measures the time from exec until the daemon has the inventory."""
    if plan.quick:
        return
    installed = Packages(packages.database())
    for number in range(max(_ITEMS)):
        installed.install(_package(number), "1")
    for count in _ITEMS:
        yield _items(plan, count)
    yield from _upgrade(plan)
    if plan.records:
        yield from _file(plan)
    yield _parsing(plan)


def _package(number: int) -> str:
    return f"package-{number}"


def _items(plan: Plan, count: int) -> Figure:
    title = f"inventory of {count} items"
    with Testbed(items=count) as testbed:
        values, floors = plan.pairs(
            title,
            agent(),
            floor("inventory", "items", str(count)),
            lambda program: _seconds(testbed, program, 2 * count),
        )
    name = f"inventory.items.{count}"
    return Figure(name, title, "time", "s", values, floors, _CHILDREN, "inventory.items", count)


def _seconds(testbed: Testbed, program: Program, children: int) -> float:
    with testbed.start(program) as process:
        (reported,) = testbed.desktop.wait_for("onUploadFinished", 60 + children * _SECONDS_PER_CHILD)
    return (reported - process.began) / 1e9


def _upgrade(plan: Plan) -> Iterator[Figure]:
    """Thirty changes at once, and right after them the policy that logs the user out a minute later. It takes
    minutes, and as many children that are all alike: once is enough."""
    title = f"{_UPGRADED} changes in a row, {_UPGRADED_ITEMS} items"
    children = _UPGRADED * (2 * _UPGRADED_ITEMS + 3)
    patience = 60 + children * _SECONDS_PER_CHILD
    with Testbed(items=_UPGRADED_ITEMS) as testbed:
        plan.show_step(title)
        with testbed.start(agent()) as process:
            testbed.desktop.wait_for("UpdateUserInfo", patience)
            process.await_calm()
            testbed.desktop.send(f"changes {_UPGRADED}")
            time.sleep(_BEHIND)
            testbed.desktop.send(f"policy {_LOG_OUT}")
            begin, end, *_ = testbed.desktop.wait_for("done", patience)
            (ended,) = testbed.desktop.wait_for("Terminate", 2 * _MINUTE)
        plan.show_step(f"{title}, the tools alone")
        arguments = ("changes", str(_UPGRADED), str(_UPGRADED_ITEMS))
        alone = _seconds(testbed, floor("inventory", *arguments), children)
    values = [(end - begin) / 1e9]
    yield Figure("inventory.upgrade", title, "time", "s", values, [alone], _CHILDREN)
    late = [(ended - begin) / 1e9 - _BEHIND - _MINUTE]
    yield Figure("inventory.upgrade.logout", "a forced log-out behind them, late by", "time", "s", late)


def _record(package: str, number: int) -> dict[str, Any]:
    return {"package_name": package, "name": "n", "id": number, "architecture": "a", "installed_type": 1}


def _parsing(plan: Plan) -> Figure:
    """Compares a file of records without a package, about which no tool is asked, with an empty file."""
    with Testbed() as testbed:

        def to_announcement() -> float:
            with testbed.start(agent()) as process:
                (reported,) = testbed.desktop.wait_for("UpdateUserInfo")
            return (reported - process.began) / 1e9

        def seconds() -> float:
            testbed.files.write_software_list(layout.SOFTWARE_LIST, [])
            without = to_announcement()
            testbed.files.write(layout.SOFTWARE_LIST, json.dumps(_long_list(), indent=4))
            megabytes = layout.SOFTWARE_LIST.stat().st_size / 1e6
            return (to_announcement() - without) * _MEGABYTES / megabytes

        title = f"parsing of {_MEGABYTES} MB, with its log lines"
        (values,) = plan.repeat(title, lambda: (seconds(),))
    return Figure("inventory.parsing", title, "time", "s", values, (), Goal("at most", 1, "value"))


def _long_list() -> list[dict[str, Any]]:
    one = len(str(_record("", 0))) + 30  # with its line breaks and indents
    return [_record("", number) for number in range(_MEGABYTES * 1_000_000 // one)]


def _file(plan: Plan) -> Iterator[Figure]:
    """The tools are asked about the first records only: the others have no package. What that takes is
    multiplied; every child is the same, and a hundred thousand of them would take many minutes."""
    records, asked = plan.records, min(plan.records, _ASKED)
    times = records / asked
    title = f"inventory file of {records:,} records"
    with Testbed(items=1) as testbed:

        def seconds(program: Program, packages: int) -> float:
            known = [_record(_package(0) if number < packages else "", number) for number in range(records)]
            testbed.files.write(layout.SOFTWARE_LIST, json.dumps(known, indent=4))
            return _seconds(testbed, program, asked)

        def whole() -> tuple[float, float]:
            parsing = seconds(agent(), 0)
            bare = seconds(floor("inventory", "records", str(asked)), 0)
            return parsing + (seconds(agent(), asked) - parsing) * times, bare * times

        values, floors = plan.repeat(title, whole)
    yield Figure(f"inventory.file.{records}", title, "time", "s", values, floors, _FORKS)
