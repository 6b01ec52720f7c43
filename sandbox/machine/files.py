"""The terminal's files: those that the daemon writes for the session agents, and the accounts."""

from __future__ import annotations

import json
import shutil
from pathlib import Path
from typing import Any, Mapping, Sequence

from sandbox import contracts
from sandbox.machine import layout
from sandbox.machine.users import User

MACHINE_ID = "box-file-machine-0001"
DEFAULT_USERINFO: dict[str, Any] = {
    "is_Domain": True,
    "domain_host": layout.PLATFORM_HOST,
    "domain_port": "636",
    "terminal_name": "box-terminal",
}
# The control center's modules from before the terminal joined the domain.
_BACKUP_CONFIG = "[config]\nControlCenterList=network, display, sound\n"
DEFAULT_RESTORE_SCRIPT = '#!/bin/bash\nexec restore_config "$@"\n'

_ETC = {
    "group": "root:x:0:\nnogroup:x:65534:\n",
    "nsswitch.conf": "passwd: files\ngroup: files\nhosts: files\n",
    "hosts": f"127.0.0.1 localhost terminal {layout.PLATFORM_HOST}\n",
    "machine-id": "b0c5b0c5b0c5b0c5b0c5b0c5b0c5b0c5\n",
}
_SYSTEM_ACCOUNTS = (
    "root:x:0:0:root:/root:/bin/bash\nnobody:x:65534:65534:nobody:/nonexistent:/usr/sbin/nologin\n"
)


class FileView:
    """Writes the terminal's files; tests may change them, `reset` restores the defaults."""

    def __init__(self, user: User) -> None:
        self._user = user

    def reset(self) -> None:
        """Restore the defaults of all files; this removes the certificates."""
        for folder in (
            layout.CONFIG,
            layout.SHARE,
            layout.VELK_STATE,
            layout.PRYG_STATE,
            Path(self._user.home),
        ):
            _empty(folder)
        layout.runtime_folder(self._user.uid).mkdir(parents=True, exist_ok=True, mode=0o700)
        for name, text in _ETC.items():
            self.write(Path("/etc", name), text)
        self.write_accounts(self._user)
        self.write_userinfo()
        self.write_machine_id(MACHINE_ID)
        self.write_restore_script()
        self.write(layout.BACKUP_CONFIG, _BACKUP_CONFIG)
        for path in (layout.SOFTWARE_LIST, layout.PRYG_SOFTWARE_LIST):
            self.write_software_list(path, [])

    def write(self, path: Path | str, content: str | bytes) -> None:
        """Replace a file atomically, as the daemon does."""
        target = Path(path)
        target.parent.mkdir(parents=True, exist_ok=True)
        fresh = target.with_name(target.name + ".new")
        fresh.write_bytes(content.encode() if isinstance(content, str) else content)
        fresh.replace(target)

    def write_accounts(self, *users: User) -> None:
        """Write /etc/passwd with the system's accounts and these users."""
        self.write("/etc/passwd", _SYSTEM_ACCOUNTS + "".join(user.passwd_line for user in users))

    def write_userinfo(self, content: str | bytes | None = None, **keys: Any) -> None:
        """Write the daemon's information file: any `content`, or else the default with `keys` changed, which
        must keep to its contract."""
        if content is None:
            known = {**DEFAULT_USERINFO, **keys}
            contracts.require("user-info", known)
            content = json.dumps(known, ensure_ascii=False, indent=4)
        self.write(layout.USERINFO, content)

    def write_platform_address(self, port: int) -> None:
        """Write the platform's address; without it the agent sends no requests."""
        self.write_userinfo(server_host=layout.PLATFORM_HOST, server_port=str(port))

    def write_machine_id(self, text: str) -> None:
        """Write the terminal's machine identifier."""
        self.write(layout.MACHINE_ID, f"{text}\n")

    def write_restore_script(self, body: str = DEFAULT_RESTORE_SCRIPT) -> None:
        """Write the restore script; the default one runs the command `restore_config`, which records its
        calls."""
        self.write(layout.RESTORE_SCRIPT, body)

    def write_software_list(self, path: Path, records: Sequence[Mapping[str, Any]]) -> None:
        """Write one of the daemon's two inventory files."""
        contracts.require("software-list", list(records))
        self.write(path, json.dumps(list(records), ensure_ascii=False, indent=4))

    def write_certificates(self, authority: Path, certificate: Path, key: Path) -> None:
        """Install the platform's authority and the terminal's certificate and key."""
        self.write(layout.SERVER_CERTIFICATE, authority.read_bytes())
        self.write(layout.CLIENT_CERTIFICATE, certificate.read_bytes())
        self.write(layout.CLIENT_KEY, key.read_bytes())


def _empty(folder: Path) -> None:
    folder.mkdir(parents=True, exist_ok=True)
    for child in folder.iterdir():
        if child.is_dir() and not child.is_symlink():
            shutil.rmtree(child)
        else:
            child.unlink()
