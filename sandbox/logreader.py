"""Turns an agent's log into events while it is written."""

from __future__ import annotations

import codecs
import os
import threading
from typing import IO

from sandbox.events import Events

# A record starts and ends with control characters of its own: a message may hold line breaks, and what is not
# a record (a sanitizer's report, a crash) must stay apart from the messages.
_START, _FIELD, _END = "\x1e", "\x1f", "\x1d"
PATTERN = _START + _FIELD.join(("%{type}", "%{file}", "%{line}", "%{function}", "%{message}")) + _END
_FIELDS = 5


class LogReader:
    """Reads until the writer has gone. Messages become events of kind "log" with the level as member, the
    message as only argument and file, line and function as detail; other lines events of kind "output"."""

    def __init__(self, source: str, stream: IO[bytes], events: Events) -> None:
        self._source = source
        self._stream = stream
        self._events = events
        self._decoder = codecs.getincrementaldecoder("utf-8")(errors="backslashreplace")
        self._rest = ""
        self._lines: list[str] = []
        self._thread = threading.Thread(target=self._read, name=f"log of {source}", daemon=True)
        self._thread.start()

    @property
    def text(self) -> str:
        """The whole log so far, as a person reads it."""
        return "\n".join(self._lines)

    def finish(self) -> None:
        """Wait for the end of the log."""
        self._thread.join()

    def _read(self) -> None:
        while chunk := os.read(self._stream.fileno(), 65536):
            self._feed(self._decoder.decode(chunk))
        self._feed(self._decoder.decode(b"", final=True) + "\n")
        self._stream.close()

    def _feed(self, text: str) -> None:
        self._rest += text
        while True:
            end = _END + "\n" if self._rest.startswith(_START) else "\n"
            piece, found, rest = self._rest.partition(end)
            if not found:
                return
            self._rest = rest
            self._take(piece)

    def _take(self, piece: str) -> None:
        fields = piece.removeprefix(_START).split(_FIELD, _FIELDS - 1)
        if not piece.startswith(_START) or len(fields) < _FIELDS:
            if piece:
                self._lines.append(piece)
                self._events.record(self._source, "log", "output", "", (piece,))
            return
        level, file, line, function, message = fields
        self._lines.append(f"{level:8} {file}:{line} {function}: {message}")
        detail = {"file": file, "line": int(line), "function": function}
        self._events.record(self._source, "log", "log", level, (message,), detail)
