"""Prints events as a table that grows while they happen."""

from __future__ import annotations

import io
import re
import sys
import threading
from contextlib import contextmanager
from typing import IO, Iterator, Sequence, cast

from rich.console import Console, RenderableType
from rich.table import Table
from rich.text import Text

from sandbox.events import SYNC, WAKE_UP, Event, Events
from sandbox.timeline import phrases
from sandbox.timeline.agent_time import AgentTime, minutes
from sandbox.timeline.line_breaks import breakable

_PLAIN_WIDTH = 136
_PICTURE_WIDTH = 115  # still readable when a page scales it to two thirds
_WIDE = 110
_TIME, _ROUTE, _GAP = 5, 27, 2
_REMARK = "dim italic"
_LOG_KINDS = ("log", "output")


def screen_console() -> Console:
    """Standard output: as wide as the terminal window, or plain text of a readable width without one."""
    if sys.stdout.isatty():
        return Console(highlight=False)
    return Console(
        width=_PLAIN_WIDTH, highlight=False, file=cast(IO[str], _WithoutTrailingBlanks(sys.stdout))
    )


def picture_console() -> Console:
    """A console that only records, with colours."""
    return Console(
        width=_PICTURE_WIDTH, highlight=False, record=True, file=io.StringIO(), force_terminal=True
    )


class _WithoutTrailingBlanks(io.TextIOBase):
    """Removes the blanks that pad printed lines."""

    def __init__(self, stream: IO[str]) -> None:
        self._stream = stream

    def write(self, text: str) -> int:
        """Write text that consists of whole lines."""
        return self._stream.write(re.sub(r" +$", "", text, flags=re.MULTILINE))

    def flush(self) -> None:
        """Flush the underlying stream."""
        self._stream.flush()


class Timeline:
    """Shows each event in a line: agent time, sender and receiver, content, meaning."""

    def __init__(
        self, events: Events, time: AgentTime, consoles: Sequence[Console], show_log: bool = False
    ) -> None:
        self.time = time
        self.show_log = show_log
        self._consoles = consoles
        self._is_open = True
        # Several threads record events; output during the start or end of the status line would garble it.
        self._output = threading.Lock()
        events.subscribe(self._take)

    def print(self, what: RenderableType = "") -> None:
        """Print something between the events."""
        with self._output:
            for console in self._consoles:
                console.print(what)

    def draw(self, wanted: bool) -> None:
        """Include the following lines in the picture or not."""
        for console in self._consoles[1:]:
            console.quiet = not wanted

    def end(self) -> None:
        """Show no more events."""
        self._is_open = False

    @contextmanager
    def waiting(self, words: str) -> Iterator[None]:
        """While waiting, show a status line with the awaited event and the agent time (interactive only)."""
        console = self._consoles[0]
        if not console.is_terminal:
            yield
            return
        status = console.status(_Waiting(words, self.time), spinner="dots", refresh_per_second=8)
        with self._output:
            status.start()
        try:
            yield
        finally:
            with self._output:
                status.stop()

    def shows(self, event: Event) -> bool:
        """Whether an event is shown."""
        if event.kind in _LOG_KINDS:
            return self.show_log
        return not _is_probe(event)

    def _take(self, event: Event) -> None:
        if event.kind == "life" and event.target == "velks":
            self.time.started(event)
        if self._is_open and self.shows(event):
            with self._output:
                for console in self._consoles:
                    console.print(self._line(event, console.width))

    def _line(self, event: Event, width: int) -> Table:
        line = Table.grid(padding=(0, _GAP, 0, 0), pad_edge=False)
        line.add_column(width=_TIME)
        line.add_column(width=_ROUTE)
        rest = width - _TIME - _ROUTE - 2 * _GAP
        cells = [Text(minutes(self.time.at(event.time)), "dim"), _route(event)]
        if width < _WIDE or event.kind in _LOG_KINDS:
            line.add_column(max_width=rest, overflow="fold")
            cells.append(_stacked(event, rest))
        else:
            half = rest * 9 // 16
            line.add_column(width=half - _GAP, overflow="fold")
            line.add_column(max_width=rest - half, overflow="fold")
            words = breakable(phrases.what(event), half - _GAP)
            cells += [Text(words), Text(breakable(phrases.meaning(event), rest - half), _REMARK)]
        line.add_row(*cells)
        return line


def _stacked(event: Event, width: int) -> Text:
    """The content, and the meaning below it."""
    style = "dim" if event.kind in _LOG_KINDS else ""
    means = breakable(phrases.meaning(event), width)
    words = breakable(phrases.what(event), width)
    return Text.assemble((words, style), ("\n" + means if means else "", _REMARK))


class _Waiting:
    """The status line, rendered again at each refresh."""

    def __init__(self, words: str, time: AgentTime) -> None:
        self._words = words
        self._time = time

    def __rich__(self) -> Text:
        return Text(f"agent time {minutes(self._time.now())}, waiting for: {self._words}", "dim")


def _route(event: Event) -> Text:
    if event.kind == "life":
        return _participant(event.target if event.source == "box" else event.source)
    if event.kind in _LOG_KINDS:
        return Text("agent's log", "dim")
    return Text.assemble(_participant(event.source), " ", ("→", "dim"), " ", _participant(event.target))


def _participant(name: str) -> Text:
    return Text(phrases.who(name), {"velks": "bold cyan", "stranger": "bold red"}.get(name, "green"))


def _is_probe(event: Event) -> bool:
    """Whether the terminal pushed this only to synchronise with the agent."""
    return event.member == "pushPolicyMsg" and event.args[1].startswith((SYNC, WAKE_UP))
