"""The notification service of the host's desktop."""

from __future__ import annotations

import html
import json
import sys
from typing import IO

import dbus

from sandbox.ending import CannotRun

_NAME = "org.freedesktop.Notifications"
_PATH = "/org/freedesktop/Notifications"


class HostDesktop:
    """Shows the box's notifications; raises CannotRun if the desktop has no notification service."""

    def __init__(self) -> None:
        try:
            found = dbus.SessionBus(private=True).get_object(_NAME, _PATH)
            self._service = dbus.Interface(found, _NAME)
            self._reads_markup = "body-markup" in self._service.GetCapabilities()
        except dbus.DBusException as error:
            raise CannotRun(
                f"cannot reach {_NAME} on your session bus: {error.get_dbus_message()}"
            ) from error

    def relay(self, stream: IO[bytes]) -> None:
        """Show the notifications until the stream ends."""
        failed = False
        for line in stream:
            if failed:
                continue  # read on: the box must never block on a full pipe
            try:
                self._show(**json.loads(line))
            except dbus.DBusException as error:
                failed = True
                message = error.get_dbus_message()
                print(f"box: your desktop shows no more notifications: {message}", file=sys.stderr)

    def _show(self, app_name: str, summary: str, body: str, timeout: int) -> None:
        text = html.escape(body, quote=False) if self._reads_markup else body
        no_hints = dbus.Dictionary(signature="sv")
        self._service.Notify(
            app_name, dbus.UInt32(0), "", summary, text, dbus.Array(signature="s"), no_hints, timeout
        )
