"""The log calls of the C++ sources, as the lines that they write."""

from __future__ import annotations

import re
from pathlib import Path
from typing import Iterator, NamedTuple

_VALUE = "…"
_CALL = re.compile(r"\bq(Debug|Info|Warning|Critical|Fatal)\(")
_LITERAL = re.compile(r'"((?:\\.|[^"\\])*)"')
_FORM = re.compile(rf"(?:\s*{_LITERAL.pattern})+")
_FORMAT_VALUE = re.compile(r"%l*[a-z]")


class LogLine(NamedTuple):
    """A level as Qt calls it, and a text in which successive values are one ellipsis."""

    level: str
    text: str


def lines_of(source: str) -> Iterator[LogLine]:
    """All lines that a C++ source can write to the log."""
    for call in _CALL.finditer(source):
        statement = source[call.end() : _end_of_statement(source, call.end())]
        yield LogLine(call[1].lower(), _text(statement))


def lines_of_all(*folders: Path) -> set[LogLine]:
    """The same of all sources in these folders."""
    files = [file for folder in folders for suffix in ("cpp", "h") for file in folder.rglob(f"*.{suffix}")]
    return {line for file in files for line in lines_of(file.read_text())}


def _end_of_statement(source: str, start: int) -> int:
    outside = _LITERAL.sub(lambda literal: "x" * len(literal[0]), source[start:])
    return start + outside.index(";")


def _text(statement: str) -> str:
    if not statement.startswith(")"):
        form = _FORM.match(statement)
        assert form, f"the log call's form is no literal: {statement}"
        return _FORMAT_VALUE.sub(_VALUE, "".join(_LITERAL.findall(form[0])))
    # The stream separates parts by a blank; successive values are one ellipsis.
    parts = [_part(piece) for piece in statement.split("<<")[1:]]
    return re.sub(f"{_VALUE}( {_VALUE})+", _VALUE, " ".join(parts))


def _part(piece: str) -> str:
    literals = _LITERAL.findall(piece)
    return "".join(literals) if piece.strip().startswith('"') else _VALUE
