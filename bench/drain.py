"""Stack and memory of the agent while it drains long rows of unread messages.

Runs inside the simulated terminal: ./dev bench drain. Both must stay flat, whatever the length of the row.
"""

from __future__ import annotations

import argparse
import re
import sys
import time
from dataclasses import dataclass
from pathlib import Path

from rich.console import Console
from rich.table import Table

from sandbox.terminal import Terminal

_POLL = 181  # seconds of agent time within which the next poll surely comes
_SECONDS_PER_MESSAGE = 0.1
_SWITCH_SECONDS = 0.0001  # the services' threads share one interpreter and hand over often


@dataclass(frozen=True)
class Figures:
    """The agent after a drain: stack and resident memory in KiB, and the drain's duration in seconds."""

    messages: int
    stack: int
    resident: int
    seconds: float


def drain(terminal: Terminal, messages: int) -> Figures:
    """Let the agent fetch, show and mark read so many messages."""
    for number in range(messages):
        terminal.platform.post_message(terminal.user.plain_name, f"message {number}", "text")
    mark = terminal.events.mark()
    terminal.sync()
    start = time.monotonic()
    terminal.jump(_POLL)
    last = f"message {messages - 1}"
    terminal.events.wait_for(
        lambda event: event.args[3] == last,
        member="Notify",
        after=mark,
        timeout=60 + messages * _SECONDS_PER_MESSAGE,
    )
    terminal.sync()
    seconds = time.monotonic() - start
    return Figures(messages, _memory(terminal, "VmStk"), _memory(terminal, "VmRSS"), seconds)


def _memory(terminal: Terminal, name: str) -> int:
    status = Path(f"/proc/{terminal.agent.pid}/status").read_text()
    return int(re.findall(rf"{name}:\s*(\d+) kB", status)[0])


def main() -> int:
    """Entry point; the status is 0 if the stack and the memory stayed flat."""
    parser = argparse.ArgumentParser(prog="./dev bench drain", description=__doc__)
    parser.add_argument("--messages", type=int, default=100_000, help="length of the longest row")
    longest = parser.parse_args().messages
    sys.setswitchinterval(_SWITCH_SECONDS)

    table = Table("messages", "stack, KiB", "resident, KiB", "seconds")
    console = Console()
    figures = []
    with Terminal() as terminal:
        assert terminal.platform
        terminal.start_agent()
        for messages in [length for length in (100, 10_000) if length < longest] + [longest]:
            terminal.events.forget()
            figures.append(drain(terminal, messages))
            done = figures[-1]
            table.add_row(f"{done.messages:,}", f"{done.stack}", f"{done.resident:,}", f"{done.seconds:.1f}")
    console.print(table)
    first, last = figures[0], figures[-1]
    flat = last.stack - first.stack <= 64 and last.resident <= first.resident * 1.25
    console.print("flat" if flat else "not flat: more than 64 KiB of stack or a quarter of memory more")
    return 0 if flat else 1


if __name__ == "__main__":
    sys.exit(main())
