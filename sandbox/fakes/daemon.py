"""The fake of the system daemon, which pushes policies to the sessions and receives their reports."""

from __future__ import annotations

import json
from typing import Any, Mapping

from sandbox import contracts
from sandbox.fakes.base import Fake
from sandbox.machine import layout
from sandbox.platform.server import Platform
from sandbox.platform.uploader import Uploader

INTERFACE = "com.norix.velk.velkg"
PATH = "/com/norix/velk/velkg"
MACHINE_ID = "box-machine-0001"


class Daemon(Fake):
    """Owns com.norix.velk.velkg on the system bus."""

    name = "daemon"
    bus_name = INTERFACE
    bus_kind = "system"
    replies = {
        "GetDomainStatus": 1,
        "GetMachineID": MACHINE_ID,
        "GetNetStatus": 1,
        "GetPolicyPullTime": 60,
        "GetServerIP": layout.PLATFORM_HOST,
        "GetServerPort": str(layout.PLATFORM_PORT),
        "onDomainConfig": 0,
    }

    def appear(self, announce: bool = False) -> None:
        """Appear on the bus; with `announce`, push the online signal as a freshly started daemon does."""
        super().appear()
        if announce:
            self.push_online()

    def uploads_to(self, platform: Platform) -> None:
        """From now on, upload the sessions' reports, without blocking the callers."""
        self.objects[PATH].handlers["onUploadFinished"] = Uploader(self._events, platform.port).upload

    def push_online(self) -> None:
        """Ask the sessions to report themselves."""
        self.emit(INTERFACE, "pushOnlineMsg")

    def push_policy(self, payload: str | Mapping[str, Any], app_id: str = "box") -> None:
        """Broadcast a policy: a mapping, which must keep to its contract, as JSON (not restricted to ASCII),
        or any text unchanged."""
        if isinstance(payload, str):
            text = payload
        else:
            contracts.require("policy-message", payload)
            text = json.dumps(payload, ensure_ascii=False)
        self.emit(INTERFACE, "pushPolicyMsg", app_id, text)
