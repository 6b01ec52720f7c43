"""Programs of Debian that live in each session, too, beside the agent: unpacked, not installed."""

from __future__ import annotations

import time
from contextlib import ExitStack
from typing import Iterator, Mapping, NamedTuple

from bench.figures import Figure, Kind
from bench.plan import Plan
from bench.programs import Process, agent
from bench.testbed import Testbed
from sandbox import REPOSITORY

_FOLDER = REPOSITORY / "build" / "neighbours"
_ROOT = _FOLDER / "root"
_CALM = 2.0  # seconds without work after which a start is over
_SECONDS = 60  # of idleness


class Neighbour(NamedTuple):
    """What it is, and its command line below the folder of the unpacked packages."""

    meaning: str
    argv: tuple[str, ...]


_NEIGHBOURS = {
    "xdg-desktop-portal": Neighbour("a portal", ("usr/libexec/xdg-desktop-portal",)),
    "lxqt-notificationd": Neighbour("notifications", ("usr/bin/lxqt-notificationd",)),
    "lxqt-policykit": Neighbour("a policy-kit agent", ("usr/bin/lxqt-policykit-agent",)),
    "gnome-keyring": Neighbour(
        "a key daemon", ("usr/bin/gnome-keyring-daemon", "--foreground", "--components=secrets")
    ),
}


def measure(plan: Plan) -> Iterator[Figure]:
    """Each is started in turn; then all are idle in the same minute, after which they are looked at."""
    versions = dict(line.split() for line in (_FOLDER / "versions").read_text().splitlines())
    titles = {name: f"{name} {versions[name]}, {one.meaning}" for name, one in _NEIGHBOURS.items()}
    with ExitStack() as stack:
        testbed = stack.enter_context(Testbed())
        running = {"agent": stack.enter_context(testbed.start_and_wait(agent()))}
        for name, (_, argv) in _NEIGHBOURS.items():
            plan.show_step(f"start of {name}")
            running[name] = stack.enter_context(Process([str(_ROOT / argv[0]), *argv[1:]], _environment()))
            running[name].await_calm(_CALM)
        starts = {name: process.cpu_nanoseconds() / 1e6 for name, process in running.items()}
        before = {name: process.voluntary_switches() for name, process in running.items()}
        plan.show_step(f"idle for {_SECONDS} s")
        time.sleep(_SECONDS)
        for name, process in running.items():
            title = titles.get(name, "the agent")
            yield _figure(name, "start", f"processor time of the start, {title}", "ms", starts[name], "time")
            yield _figure(name, "Rss", f"resident, {title}", "KiB", process.memory("Rss"), "memory")
            dirty = process.memory("Private_Dirty")
            yield _figure(name, "Private_Dirty", f"private dirty, {title}", "KiB", dirty, "memory")
            woken = process.voluntary_switches() - before[name]
            yield _figure(name, "wakeups", f"wake-ups in an idle minute, {title}", "", woken)


def _environment() -> Mapping[str, str]:
    """The unpacked programs find their libraries and files, and draw on no screen."""
    share = _ROOT / "usr" / "share"
    return {
        "LD_LIBRARY_PATH": _folders("usr/lib/*-linux-gnu"),
        "QT_PLUGIN_PATH": _folders("usr/lib/*-linux-gnu/qt[56]/plugins"),
        "QT_QPA_PLATFORM": "offscreen",
        "XDG_DATA_DIRS": f"{share}:/usr/share",
        "GSETTINGS_SCHEMA_DIR": str(share / "glib-2.0" / "schemas"),
        "GSETTINGS_BACKEND": "memory",
    }


def _folders(pattern: str) -> str:
    return ":".join(str(folder) for folder in sorted(_ROOT.glob(pattern)))


def _figure(program: str, name: str, title: str, unit: str, value: float, kind: Kind = "count") -> Figure:
    return Figure(f"neighbours.{program}.{name}", title, kind, unit, [value])
