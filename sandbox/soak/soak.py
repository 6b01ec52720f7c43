"""The soak inside the box, from the opening of the terminal to the tables."""

from __future__ import annotations

import sys
from argparse import Namespace

from rich.console import Console
from rich.table import Table
from rich.text import Text

from sandbox.box.preconditions import require_agent
from sandbox.events import NotSeen
from sandbox.soak.accounting import KINDS, Accounting
from sandbox.soak.day import live
from sandbox.soak.search import SECONDS, shortest_history
from sandbox.soak.session import Lost, Session
from sandbox.soak.usage import growth

_COLUMNS = ("hour", "resident, KiB", "private dirty, KiB", "descriptors", "threads", "sent", "arrived")
_SWITCH_SECONDS = 0.0001  # the services' threads share one interpreter and hand over often


def soak(options: Namespace) -> int:
    """Live through a day or replay a history; the status is 0 if nothing was lost and nothing grew."""
    require_agent()
    sys.setswitchinterval(_SWITCH_SECONDS)
    console = Console(highlight=False, soft_wrap=True)
    session = Session()
    lost = []
    try:
        problems = _live(session, options, console) if options.replay is None else _replay(session, options)
    except (Lost, NotSeen) as error:
        problems = lost = str(error).splitlines() if isinstance(error, Lost) else str(error).splitlines()[:1]
    finally:
        ending = session.terminal.shut_down()
    problems += [problem for problem in ending if problem not in problems]
    console.print(_counts(session.accounting))
    for problem in problems:
        console.print(Text(problem, "bold red"))
    if lost and options.replay is None:
        _search(console, options)
    console.print("soak: something was lost or grew" if problems else "soak: all arrived, nothing grew")
    return 1 if problems else 0


def _live(session: Session, options: Namespace, console: Console) -> list[str]:
    """Live through the day and say each hour how the agent does; in what it has grown."""
    samples = []
    console.print(_row(*_COLUMNS))
    for hour, sample in enumerate(live(session, options.hours, options.seed)):
        samples.append(sample)
        held = (sample.resident, sample.private_dirty, sample.descriptors, sample.threads)
        console.print(_row(hour or "warm-up", *held, *session.accounting.totals()))
    return growth(samples, options.allowance)


def _replay(session: Session, options: Namespace) -> list[str]:
    session.log_in()
    session.replay(options.replay.split())
    return []


def _search(console: Console, options: Namespace) -> None:
    console.print(f"looking for a short history that fails, for at most {SECONDS} seconds ...")
    history = shortest_history(options.seed)
    if history is None:
        console.print("none was found: only the day as a whole fails")
    else:
        local = " --local" if options.local else ""
        console.print(f"the shortest that failed: ./dev soak{local} --replay '{' '.join(history)}'")


def _row(*cells: object) -> str:
    return "  ".join(f"{cell:>{len(title)}}" for cell, title in zip(map(str, cells), _COLUMNS))


def _counts(accounting: Accounting) -> Table:
    table = Table("kind")
    for title in ("sent", "arrived"):
        table.add_column(title, justify="right")
    for kind in KINDS:
        table.add_row(kind, f"{accounting.sent(kind):,}", f"{accounting.arrived(kind):,}")
    return table
