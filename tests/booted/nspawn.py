"""One boot of a machine: systemd-nspawn, in a control group of its own."""

from __future__ import annotations

import os
import signal
import subprocess
from pathlib import Path

from tests.booted.patience import wait_for

_REBOOTED = 133  # how nspawn ends, with --keep-unit, when its machine reboots
_GROUPS = [Path("/sys/fs/cgroup/unified"), Path("/sys/fs/cgroup")]


def control_groups() -> Path:
    """Where the second version of control groups is mounted."""
    return next(folder for folder in _GROUPS if (folder / "cgroup.procs").exists())


class Boot:
    """From the start of the machine's first process to its end."""

    def __init__(self, name: str, root: Path, log: Path) -> None:
        self._group = control_groups() / f"velks-booted-{name}"
        self._group.mkdir(exist_ok=True)
        with open(log, "ab") as output:
            self._nspawn = subprocess.Popen(
                ["sh", "-c", 'echo $$ > "$0/cgroup.procs"; exec "$@"', str(self._group), "systemd-nspawn"]
                + [
                    "--quiet",
                    "--boot",
                    f"--directory={root}",
                    f"--machine={name}",
                    "--register=no",
                    "--keep-unit",
                ]
                + ["--private-network", "--console=pipe", "--link-journal=no"],
                env={**os.environ, "SYSTEMD_NSPAWN_UNIFIED_HIERARCHY": "1"},
                stdin=subprocess.DEVNULL,
                stdout=output,
                stderr=output,
            )
        self.leader = wait_for("the machine's first process", self._child)

    @property
    def rebooted(self) -> bool:
        """Whether the machine has rebooted itself."""
        return self._nspawn.poll() == _REBOOTED

    @property
    def ended(self) -> bool:
        """Whether the machine is off, or about to be started again."""
        return self._nspawn.poll() is not None

    def stop(self) -> None:
        """End all of the machine at once. Ending nspawn alone would leave the machine running."""
        if not self.ended:
            os.kill(self.leader, signal.SIGKILL)
        self._nspawn.wait()
        for folder in sorted(self._group.rglob("*/"), reverse=True):
            folder.rmdir()
        self._group.rmdir()

    def _child(self) -> int:
        assert not self.ended, "systemd-nspawn has ended; see its log"
        children = Path(f"/proc/{self._nspawn.pid}/task/{self._nspawn.pid}/children").read_text().split()
        # An earlier child of nspawn only prepares the machine and ends.
        begun = [pid for pid in children if Path(f"/proc/{pid}/comm").read_text() in {"systemd\n", "init\n"}]
        return int(begun[0]) if begun else 0
