"""Line breaks in long names and paths."""

from __future__ import annotations

import re
from itertools import chain

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
    pieces = _PIECE.findall(word)
    # A part that is too wide itself is taken character by character.
    for piece in chain.from_iterable([piece] if cell_len(piece) <= width else piece for piece in pieces):
        if lines[-1] and cell_len(lines[-1] + piece) > width:
            lines.append("")
        lines[-1] += piece
    return "\n".join(lines)
