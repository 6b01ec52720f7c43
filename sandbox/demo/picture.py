"""The tour as a self-contained SVG picture, without web fonts."""

from __future__ import annotations

import re
from pathlib import Path
from typing import IO

from rich.console import Console

_WEB_FONT = re.compile(r"\s*@font-face \{.*?\}", re.DOTALL)
_FONTS = '"DejaVu Sans Mono", Menlo, Consolas, "Noto Sans Mono CJK SC", monospace'


def svg(recorded: Console) -> str:
    """The console's recording as SVG."""
    drawn = recorded.export_svg(title="./dev demo", unique_id="demo")
    return _WEB_FONT.sub("", drawn).replace("Fira Code, monospace", _FONTS)


class PictureFile:
    """Receives the picture from the box; writes the file only if the picture is complete."""

    def __init__(self, path: Path) -> None:
        self._path = path
        self._content = b""

    def receive(self, stream: IO[bytes]) -> None:
        """Read the picture."""
        self._content = stream.read()

    def keep(self) -> None:
        """Write the file."""
        if self._content:
            self._path.write_bytes(self._content)
