"""Line breaks in long names and paths."""

from __future__ import annotations

import re
from typing import Iterator

from rich.cells import cell_len

# A name or path is broken after these characters, so that its parts stay whole.
_PIECE = re.compile(r"[^/._:=,;?&-]*[/._:=,;?&-]*")


def breakable(text: str, width: int) -> str:
    """The text with words wider than the column broken between the parts of names and paths, and anywhere in
    a part that is too wide itself: rich's own breaks lose some characters of double width."""
    return re.sub(r"\S+", lambda word: _broken(word[0], width), text)


def _broken(word: str, width: int) -> str:
    if cell_len(word) <= width:
        return word
    lines = [""]
    for piece in _pieces(word, width):
        if lines[-1] and cell_len(lines[-1] + piece) > width:
            lines.append("")
        lines[-1] += piece
    return "\n".join(lines)


def _pieces(word: str, width: int) -> Iterator[str]:
    for piece in _PIECE.findall(word):
        if cell_len(piece) <= width:
            yield piece
        else:
            yield from piece  # character by character
