"""The soak inside the box, from the opening of the terminal to the tables."""

from __future__ import annotations

import sys
from argparse import Namespace
from datetime import datetime, time

from rich.console import Console
from rich.table import Table
from rich.text import Text

from sandbox.box.preconditions import require_agent
from sandbox.machine.clock import ManualClock
from sandbox.soak.day import BEGIN, Day
from sandbox.soak.accounting import KINDS, Accounting
from sandbox.soak.usage import Usage, growth, usage
from sandbox.terminal import Terminal

_COLUMNS = ("hour", "resident, KiB", "private dirty, KiB", "descriptors", "threads", "sent", "arrived")
_SWITCH_SECONDS = 0.0001  # the services' threads share one interpreter and hand over often


def soak(options: Namespace) -> int:
    """Live through a day; the status is 0 if all arrived that was sent and nothing grew."""
    require_agent()
    sys.setswitchinterval(_SWITCH_SECONDS)
    console = Console(highlight=False, soft_wrap=True)
    terminal = Terminal(clock=ManualClock(datetime.combine(datetime.now(), time(BEGIN))))
    accounting = Accounting(terminal.events)
    try:
        samples = _live(terminal, accounting, options, console)
    finally:
        problems = terminal.shut_down()
    problems += [*accounting.differences(), *growth(samples, options.allowance)]
    console.print(_counts(accounting))
    for problem in problems:
        console.print(Text(problem, "bold red"))
    console.print("soak: something was lost or grew" if problems else "soak: all arrived, nothing grew")
    return 1 if problems else 0


def _live(terminal: Terminal, accounting: Accounting, options: Namespace, console: Console) -> list[Usage]:
    """Live through the day and say each hour how the agent does; its usage after each hour."""
    day = Day(terminal, accounting, options.seed)
    day.begin()
    samples = []
    console.print(_row(*_COLUMNS))
    for hour in range(options.hours + 1):
        day.live_hour()
        sample = usage(terminal.agent.pid)
        samples.append(sample)
        held = (sample.resident, sample.private_dirty, sample.descriptors, sample.threads)
        console.print(_row(hour or "warm-up", *held, *accounting.totals()))
    day.end()
    return samples


def _row(*cells: object) -> str:
    return "  ".join(f"{cell:>{len(title)}}" for cell, title in zip(map(str, cells), _COLUMNS))


def _counts(accounting: Accounting) -> Table:
    table = Table("kind")
    for title in ("sent", "arrived"):
        table.add_column(title, justify="right")
    for kind in KINDS:
        table.add_row(kind, f"{accounting.sent(kind):,}", f"{accounting.arrived(kind):,}")
    return table
