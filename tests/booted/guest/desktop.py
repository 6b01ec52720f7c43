"""The program of a graphical session: the desktop's services on the user's bus, then the start of the agent.

    desktop.py target|autostart|generator|none

`target` reaches graphical-session.target, `autostart` starts the entries of /etc/xdg/autostart itself,
`generator` reaches the target and lets systemd start them, `none` starts nothing. SIGTERM ends the session.
"""

from __future__ import annotations

import os
import signal
import subprocess
import sys

import dbus
from gi.repository import GLib

from services import Answers, Services, main_loop, record

KPX = "com.norix.kpx"
ANSWERS: Answers = {
    (f"{KPX}.Notification", "Notify"): ("u", 1),
    ("com.norix.ScreenSaver", "Get isRunning"): ("v", dbus.Boolean(False)),
    ("com.norix.SessionManager", "Get Locked"): ("v", dbus.Boolean(False)),
    (f"{KPX}.daemon.Dock", "Get Entries"): ("v", dbus.Array([], signature="o")),
    (f"{KPX}.daemon.Launcher", "GetAllItemInfos"): (
        "a(ssssxx)",
        [("/usr/share/x.desktop", "X", "x", "", 0, 0)],
    ),
    ("com.norix.velk.prys", "onPolicyMsg"): ("", None),
}
NAMES = [
    "com.norix.velk.prys",
    f"{KPX}.Notification",
    "com.norix.ScreenSaver",
    "com.norix.SessionManager",
    f"{KPX}.daemon.Dock",
    f"{KPX}.daemon.Launcher",
]
SYSTEMCTL = ["systemctl", "--user"]
WAYS = {
    "target": [*SYSTEMCTL, "start", "booted-desktop.target"],
    "generator": [*SYSTEMCTL, "start", "booted-generator.target"],
    "none": ["true"],
}


def autostart_entry() -> list[str]:
    """What a desktop runs of the agent's autostart entry, if anything."""
    with open("/etc/xdg/autostart/velks.desktop", encoding="utf-8") as file:
        entry = dict(line.rstrip("\n").split("=", 1) for line in file if "=" in line and line[0] not in "#[")
    return entry["Exec"].split() if os.access(entry["TryExec"], os.X_OK) else ["true"]


def main() -> None:
    """Live until SIGTERM."""
    way = sys.argv[1]
    loop = main_loop()
    kept = Services("desktop", dbus.SessionBus(), NAMES, ANSWERS)
    assert kept
    command = autostart_entry() if way == "autostart" else WAYS[way]
    for ending in (signal.SIGTERM, signal.SIGHUP):  # the login manager sends both
        GLib.unix_signal_add(GLib.PRIORITY_DEFAULT, ending, loop.quit)
    begin = subprocess.Popen(command)
    record("session", "begins", [os.environ.get("XDG_SESSION_ID", "")], os.getuid())
    loop.run()
    begin.wait()
    if way in ("target", "generator"):
        subprocess.run([*SYSTEMCTL, "stop", WAYS[way][-1]], check=False)


main()
