"""A root file system for a booted machine: that of this machine, with all changes kept in memory apart.

VELK_BOOTED_ROOT names another folder to take, such as a root that `./dev elsewhere --keep` has left, with the
packages of the group [booted] and those that the agent depends on.
"""

from __future__ import annotations

import os
import shutil
import subprocess
from pathlib import Path
from typing import Sequence

from tests.booted.patience import REPOSITORY

GUEST = REPOSITORY / "tests" / "booted" / "guest"
EXAMPLES = REPOSITORY / "data" / "examples"
LOWER = Path(os.environ.get("VELK_BOOTED_ROOT", "/"))
_WHERE = Path("/run/velks-booted")
_SIZE = "size=2g"
_USERS = """
alice:x:1000:1000::/home/alice:/bin/bash
bob:x:1001:1001::/home/bob:/bin/bash
zhang@corp.example:x:20001:20001::/home/zhang:/bin/bash
@li:x:20002:20002::/home/li:/bin/bash
greeter:x:150:150::/var/lib/greeter:/bin/sh
made-up-greeter:x:60999:60999::/var/lib/made-up-greeter:/bin/sh
""".strip().splitlines()
_FIRST_PERSON = 1000
_NOBODY = 65534
# Where our files go, as (source, destination below the root).
_FILES = [
    (GUEST / "booted-daemon.service", "etc/systemd/system/booted-daemon.service"),
    (GUEST / "booted-desktop.target", "etc/systemd/user/booted-desktop.target"),
    (GUEST / "booted-generator.target", "etc/systemd/user/booted-generator.target"),
    (GUEST / "booted.pam", "etc/pam.d/booted"),
    (GUEST / "booted.dbus.conf", "usr/share/dbus-1/system.d/booted.conf"),
    (EXAMPLES / "com.norix.velk.conf", "usr/share/dbus-1/system.d/com.norix.velk.conf"),
    (GUEST / "booted.tmpfiles.conf", "etc/tmpfiles.d/booted.conf"),
    (GUEST / "booted.logind.conf", "etc/systemd/logind.conf.d/booted.conf"),
    (GUEST / "services.py", "opt/booted/services.py"),
    (GUEST / "daemon.py", "opt/booted/daemon.py"),
    (GUEST / "desktop.py", "opt/booted/desktop.py"),
]


class Overlay:
    """`LOWER` below, a file system in memory above. To be closed when nothing runs in it any more."""

    def __init__(self, name: str) -> None:
        self._folder = _WHERE / name
        self.root = self._folder / "root"
        self._folder.mkdir(parents=True, exist_ok=True)
        subprocess.run(["mount", "-t", "tmpfs", "-o", _SIZE, "velks-booted", self._folder], check=True)
        for part in ("upper", "work", "root"):
            (self._folder / part).mkdir()
        layers = f"lowerdir={LOWER},upperdir={self._folder}/upper,workdir={self._folder}/work"
        subprocess.run(["mount", "-t", "overlay", "velks-booted", "-o", layers, self.root], check=True)

    def prepare(self) -> None:
        """Put our users and services in the place of what this machine would start."""
        self._forget_units()
        self._write_users()
        for source, destination in _FILES:
            self.copy(source, destination)
        self.write("etc/machine-id", "")
        self.write("etc/velk/userinfo.json", '{"is_Domain": true, "terminalName": "booted"}')
        self.write("usr/share/velk/machine.txt", "booted-machine-1")
        wants = self.place("etc/systemd/system/multi-user.target.wants")
        wants.mkdir(exist_ok=True)
        (wants / "booted-daemon.service").symlink_to("/etc/systemd/system/booted-daemon.service")

    def place(self, path: str) -> Path:
        """Where a file of the machine is seen from outside. Refuses what links out of the machine."""
        place = self.root / path
        assert place.parent.resolve().is_relative_to(self.root), f"{path} leads out of the machine"
        return place

    def copy(self, source: Path, destination: str) -> None:
        """Copy a file into the machine."""
        self.write(destination, source.read_text())

    def write(self, path: str, content: str) -> None:
        """Write a file of the machine, which all may read."""
        (self.root / path).parent.mkdir(parents=True, exist_ok=True)
        place = self.place(path)
        place.unlink(missing_ok=True)
        place.write_text(content)
        place.chmod(0o644)

    def apt(self, *arguments: str, folder: Path | None = None) -> str:
        """What apt-get says of the packages of the machine's release. It runs here, where a network is."""
        ended = self._try_apt(arguments, folder)
        if ended.returncode:  # there are no package lists, or old ones
            self._try_apt(["update"], folder)
            ended = self._try_apt(arguments, folder)
        assert ended.returncode == 0, f"apt-get {' '.join(arguments)}: {ended.stderr}; is there a network?"
        return ended.stdout

    def bring_programs(self, package: str) -> None:
        """Unpack a package without installing it: none of its services is enabled or started."""
        place = self.root / "root" / package
        if place.exists():
            return
        place.mkdir()
        self.apt("download", package, folder=place)
        (archive,) = place.glob("*.deb")
        with subprocess.Popen(["dpkg-deb", "--fsys-tarfile", archive], stdout=subprocess.PIPE) as content:
            unpack = ["tar", "--extract", "--keep-directory-symlink", f"--directory={self.root}"]
            subprocess.run(unpack, stdin=content.stdout, check=True)

    def close(self) -> None:
        """Forget all changes."""
        for mounted in (self.root, self._folder):
            subprocess.run(["umount", "--lazy", mounted], check=True)
        self._folder.rmdir()

    def _try_apt(self, arguments: Sequence[str], folder: Path | None) -> subprocess.CompletedProcess[str]:
        options = ["-o", f"Dir={self.root}", "-o", "APT::Sandbox::User=root", "--quiet"]
        return subprocess.run(["apt-get", *options, *arguments], cwd=folder, capture_output=True, text=True)

    def _forget_units(self) -> None:
        """Nothing that this machine has enabled starts in the other."""
        for folder in (self.root / "etc/systemd/system").glob("*.wants"):
            shutil.rmtree(folder)

    def _write_users(self) -> None:
        """The people of a fleet, in the place of those of this machine."""
        passwd = self.place("etc/passwd")
        kept = [line for line in passwd.read_text().splitlines() if not _is_person(line)]
        self.write("etc/passwd", "\n".join([*kept, *_USERS]) + "\n")
        group = self.place("etc/group").read_text()
        own = [f"{name}:x:{gid}:" for name, _, _, gid, *_ in (line.split(":") for line in _USERS)]
        others = [line for line in group.splitlines() if line.split(":")[2] not in {"1000", "1001", "150"}]
        self.write("etc/group", "\n".join([*others, *own]) + "\n")
        self.write("etc/shadow", self.place("etc/shadow").read_text() + "".join(map(_no_password, _USERS)))
        for line in _USERS:
            _, _, uid, gid, _, home, _ = line.split(":")
            folder = self.place(home.lstrip("/"))
            folder.mkdir(exist_ok=True)
            shutil.chown(folder, int(uid), int(gid))


def _is_person(line: str) -> bool:
    name, _, uid, *_ = line.split(":")
    return name in {"greeter"} or _FIRST_PERSON <= int(uid) < _NOBODY


def _no_password(line: str) -> str:
    return line.split(":", maxsplit=1)[0] + ":*:19000:0:99999:7:::\n"
