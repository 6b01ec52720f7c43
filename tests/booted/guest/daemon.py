"""Root's services on the system bus: the daemon and the identity service."""

from __future__ import annotations

import dbus

from services import Answers, Services, main_loop

DAEMON = "com.norix.velk.velkg"
IDENTITY = "com.norix.velk.iam"
MACHINE = "booted-machine-1"

DAEMON_ANSWERS: Answers = {
    (DAEMON, "GetMachineID"): ("s", MACHINE),
    (DAEMON, "UpdateUserInfo"): ("", None),
    (DAEMON, "SendUserStatus"): ("", None),
    (DAEMON, "sendAppOpenState"): ("", None),
    (DAEMON, "onUploadFinished"): ("", None),
    (DAEMON, "onDomainConfig"): ("i", 0),
}
IDENTITY_ANSWERS: Answers = {
    (IDENTITY, "Get Enable"): ("v", dbus.Boolean(True, variant_level=0)),
    (IDENTITY, "Set Enable"): ("", None),
}


def main() -> None:
    """Serve until the service manager says otherwise."""
    loop = main_loop()
    kept = [
        Services("daemon", dbus.SystemBus(private=True), [DAEMON], DAEMON_ANSWERS),
        Services("identity", dbus.SystemBus(private=True), [IDENTITY], IDENTITY_ANSWERS),
    ]
    assert kept
    loop.run()


main()
