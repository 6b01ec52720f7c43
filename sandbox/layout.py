"""Where things lie inside the box."""

from __future__ import annotations

import os
from pathlib import Path

REPOSITORY = Path(__file__).resolve().parent.parent

CONFIG = Path("/etc/velk")
SHARE = Path("/usr/share/velk")
SCRIPTS = SHARE / "scripts"
VELK_STATE = Path("/var/lib/velk")
PRYG_STATE = Path("/var/lib/pryg")

USERINFO = CONFIG / "userinfo.json"
BACKUP_CONFIG = CONFIG / "config.ini"
SERVER_CERTIFICATE = CONFIG / "clientapi_ca.crt"
CLIENT_CERTIFICATE = CONFIG / "ZEF_Velk.pem"
CLIENT_KEY = CONFIG / ".ZEF_Velk.key"
MACHINE_ID = SHARE / "machine.txt"
RESTORE_SCRIPT = SCRIPTS / "restore_config.bash"

BOX = Path("/run/box")
COMMANDS = BOX / "bin"
COMMAND_SOCKET = BOX / "commands.sock"
COMMAND_RECORD = BOX / "commands.jsonl"
CLOCK = BOX / "clock"
SYSTEM_BUS_SOCKET = Path("/run/dbus/system_bus_socket")

PLATFORM_HOST = "platform.box"
PLATFORM_PORT = 8443


def runtime_folder(uid: int) -> Path:
    """The user's XDG_RUNTIME_DIR."""
    return Path(f"/run/user/{uid}")


def session_bus_socket(uid: int) -> Path:
    """Socket of the user's session bus."""
    return runtime_folder(uid) / "bus"


def inside_box() -> bool:
    """Whether this process runs in a box."""
    return "VELK_BOX_USER" in os.environ
