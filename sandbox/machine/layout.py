"""The paths and addresses inside a box."""

from __future__ import annotations

import os
from pathlib import Path

CONFIG = Path("/etc/velk")
SHARE = Path("/usr/share/velk")
SCRIPTS = SHARE / "scripts"
VELK_STATE = Path("/var/lib/velk")
PRYG_STATE = Path("/var/lib/pryg")
PACKAGE_DATABASE = Path("/var/lib/dpkg")
APPLICATIONS = Path("/usr/share/applications")
PACKAGE_TOOLS = tuple(Path("/usr/bin", name) for name in ("dpkg", "dpkg-query", "dpkg-architecture"))

USERINFO = CONFIG / "userinfo.json"
BACKUP_CONFIG = CONFIG / "config.ini"
SERVER_CERTIFICATE = CONFIG / "clientapi_ca.crt"
CLIENT_CERTIFICATE = CONFIG / "ZEF_Velk.pem"
CLIENT_KEY = CONFIG / ".ZEF_Velk.key"
MACHINE_ID = SHARE / "machine.txt"
SOFTWARE_LIST = VELK_STATE / "software_list.list"
PRYG_SOFTWARE_LIST = PRYG_STATE / "software_list.list"
RESTORE_SCRIPT = SCRIPTS / "restore_config.bash"

BOX = Path("/run/box")
COMMANDS = BOX / "bin"
COMMAND_SOCKET = BOX / "commands.sock"
REAL_TOOLS = BOX / "real"
CLOCK = BOX / "clock"
HISTORY = Path("/run/history")  # of the prompt; only `./dev box` shows it
SYSTEM_BUS_SOCKET = Path("/run/dbus/system_bus_socket")

PLATFORM_HOST = "platform.box"
PLATFORM_PORT = 8443


def runtime_folder(uid: int) -> Path:
    """The user's XDG_RUNTIME_DIR."""
    return Path(f"/run/user/{uid}")


def session_bus_socket(uid: int) -> Path:
    """The socket of the user's session bus."""
    return runtime_folder(uid) / "bus"


def inside_box() -> bool:
    """Whether this process runs in a box."""
    return "VELK_BOX_USER" in os.environ
