"""What the package tools report of the launcher's items and of the daemon's inventory file."""

from __future__ import annotations

import json
from typing import Any, Iterator

from bench.testbed import Testbed
from bench.figures import Figure, Goal
from bench.plan import Plan
from bench.programs import Program, agent, floor
from sandbox.machine import layout
from sandbox.machine.packages import Packages

_ITEMS = (10, 100, 300)
_SECONDS_PER_CHILD = 0.1
_ASKED = 1_000  # records of the file that the tools are asked about
_MEGABYTES = 10


def measure(plan: Plan) -> Iterator[Figure]:
    """From exec until the daemon has the inventory."""
    if plan.quick:
        return
    packages = Packages()
    for count in _ITEMS:
        for number in range(count):
            packages.install(_package(number), "1")
        yield _items(plan, count)
    yield _parsing(plan)
    if plan.records:
        packages = Packages()
        packages.install(_package(0), "1")
        yield from _file(plan)


def _package(number: int) -> str:
    return f"package-{number}"


def _items(plan: Plan, count: int) -> Figure:
    with Testbed(items=count) as testbed:
        values, floors = plan.pairs(
            f"inventory of {count} items",
            agent(),
            floor("inventory", "items", str(count)),
            lambda program: _seconds(testbed, program, 2 * count) * 1e3,
        )
    name = f"inventory.items.{count}"
    goal = Goal("at most", 1.05)
    title = f"inventory of {count} items"
    return Figure(name, title, "time", "ms", values, floors, goal, "inventory.items", count)


def _seconds(testbed: Testbed, program: Program, children: int) -> float:
    with testbed.start(program) as process:
        (told,) = testbed.desktop.wait_for("onUploadFinished", 60 + children * _SECONDS_PER_CHILD)
    return (told - process.began) / 1e9


def _record(package: str, number: int) -> dict[str, Any]:
    return {"package_name": package, "name": "n", "id": number, "architecture": "a", "installed_type": 1}


def _parsing(plan: Plan) -> Figure:
    """A file of records without a package, which no tool is asked about, against no file."""
    seconds = []
    with Testbed() as testbed:

        def to_announcement() -> float:
            with testbed.start(agent()) as process:
                (told,) = testbed.desktop.wait_for("UpdateUserInfo")
            return (told - process.began) / 1e9

        for _ in plan.times():
            plan.tell(f"parsing of {_MEGABYTES} MB")
            testbed.files.write_software_list(layout.SOFTWARE_LIST, [])
            without = to_announcement()
            testbed.files.write(layout.SOFTWARE_LIST, json.dumps(_long_list(), indent=4))
            megabytes = layout.SOFTWARE_LIST.stat().st_size / 1e6
            seconds.append((to_announcement() - without) * _MEGABYTES / megabytes)
    goal = Goal("at most", 1, "value")
    return Figure("inventory.parsing", "parsing of 10 MB, with its log lines", "time", "s", seconds, (), goal)


def _long_list() -> list[dict[str, Any]]:
    one = len(str(_record("", 0))) + 30  # with its line breaks and indents
    return [_record("", number) for number in range(_MEGABYTES * 1_000_000 // one)]


def _file(plan: Plan) -> Iterator[Figure]:
    """The tools are asked about the first records only: the others have no package. What that takes is
    multiplied; every child is the same, and a hundred thousand of them would take many minutes."""
    records, asked = plan.records, min(plan.records, _ASKED)
    times = records / asked
    values: list[float] = []
    floors: list[float] = []
    with Testbed(items=1) as testbed:

        def seconds(program: Program, packages: int) -> float:
            known = [_record(_package(0) if number < packages else "", number) for number in range(records)]
            testbed.files.write(layout.SOFTWARE_LIST, json.dumps(known, indent=4))
            return _seconds(testbed, program, packages)

        for run in plan.times():
            plan.tell(f"inventory file of {records:,} records, run {run + 1} of {plan.runs}")
            parsing = seconds(agent(), 0)
            values.append(parsing + (seconds(agent(), asked) - parsing) * times)
            floors.append(seconds(floor("inventory", "records", str(asked)), 0) * times)
    name, title = f"inventory.file.{records}", f"inventory file of {records:,} records"
    yield Figure(name, title, "time", "s", values, floors, Goal("at most", 1.02))
