"""Names the programs that send on the buses."""

from __future__ import annotations

import os
import threading
from pathlib import Path

from sandbox.bus.buses import Bus


class Senders:
    """Names the process behind a connection: "velks" is the agent, "box" the process that runs the
    terminal."""

    def __init__(self) -> None:
        self.lock = threading.Lock()
        self._known = {os.getpid(): "box"}

    def register(self, pid: int, name: str) -> None:
        """Name a process; the caller must hold `lock` from before the process starts."""
        self._known[pid] = name

    def label(self, bus: Bus, unique_name: str) -> str:
        """Name of a connection's process: as registered, else its program's name, else (the process has
        ended) the connection's unique name."""
        pid = bus.process_of(unique_name)
        if pid is None:
            return unique_name
        with self.lock:
            if pid in self._known:
                return self._known[pid]
        try:
            return Path(f"/proc/{pid}/comm").read_text().strip()
        except OSError:
            return unique_name
