"""Where a long value may go on in the next line."""

from __future__ import annotations

import re

from rich.cells import cell_len

# A name or path is cut behind these, so that its parts stay whole.
_PIECE = re.compile(r"[^/._:=,;?&-]*[/._:=,;?&-]*")


def breakable(text: str, width: int) -> str:
    """The text with line breaks in words that are wider than the column: between parts of names and paths."""
    return re.sub(r"\S+", lambda word: _broken(word[0], width), text)


def _broken(word: str, width: int) -> str:
    if cell_len(word) <= width:
        return word
    lines = [""]
    pieces: list[str] = _PIECE.findall(word)
    for piece in filter(None, pieces):
        if lines[-1] and cell_len(lines[-1] + piece) > width:
            lines.append("")
        lines[-1] += piece
    return "\n".join(lines)
