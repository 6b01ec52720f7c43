"""The system's journal as the programs see it that write to it: the socket that takes their entries."""

from __future__ import annotations

import os
import socket
import struct
from pathlib import Path
from typing import Mapping

from sandbox.events import PATIENCE

SOCKET = Path("/run/systemd/journal/socket")
_LARGEST = 1 << 20


class Journal:
    """Takes entries in the place of the journal, one datagram each, as maps of their fields."""

    def __init__(self) -> None:
        SOCKET.parent.mkdir(parents=True, exist_ok=True)
        SOCKET.unlink(missing_ok=True)
        self._socket = socket.socket(socket.AF_UNIX, socket.SOCK_DGRAM)
        self._socket.bind(str(SOCKET))
        self._socket.settimeout(PATIENCE)

    def wait_for(self, text: str) -> Mapping[str, str]:
        """The next entry whose message contains `text`."""
        while True:
            entry = self._next()
            if text in entry.get("MESSAGE", ""):
                return entry

    def close(self) -> None:
        """Be gone, as a journal is that has been stopped."""
        self._socket.close()
        SOCKET.unlink(missing_ok=True)

    def _next(self) -> dict[str, str]:
        content, handed_over, _, _ = socket.recv_fds(self._socket, _LARGEST, 1)
        for file in handed_over:  # an entry that is too long for a datagram comes as a file
            with open(file, "rb") as stream:
                stream.seek(0)
                content = stream.read()
        return fields(content)


def fields(datagram: bytes) -> dict[str, str]:
    """The fields of one entry: lines "NAME=value", or the name alone, then length and bytes of the value."""
    found = {}
    while datagram:
        line, _, datagram = datagram.partition(b"\n")
        name, has_value, value = line.partition(b"=")
        if not has_value:
            (length,) = struct.unpack_from("<Q", datagram)
            value, datagram = datagram[8 : 8 + length], datagram[8 + length + 1 :]
        found[name.decode()] = value.decode()
    return found


def service(agent: Path, folder: Path, stream: str = "2") -> Path:
    """A program that starts the agent as a service manager does: it says which stream leads to the journal,
    by default the agent's own standard error."""
    script = folder / "service"
    script.write_text(
        "#!/bin/sh\n"
        f"JOURNAL_STREAM=$(stat -L -c %d:%i /proc/self/fd/{stream})\n"
        f'export JOURNAL_STREAM\nexec "{agent}"\n'
    )
    os.chmod(script, 0o755)
    return script
