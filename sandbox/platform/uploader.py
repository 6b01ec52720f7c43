"""The daemon's uploads to the platform, which sessions ask it for."""

from __future__ import annotations

import ssl
from concurrent.futures import ThreadPoolExecutor
from contextlib import closing
from http.client import HTTPException, HTTPSConnection
from urllib.parse import urlsplit

from sandbox.events import PATIENCE, Events
from sandbox.machine import layout
from sandbox.platform.server import DAEMON_AGENT

_HEADERS = {"Content-Type": "application/json", "User-Agent": DAEMON_AGENT}


class Uploader:
    """Posts texts to the platform, one after the other, with the terminal's certificate.

    No caller waits for an upload. Its result shows in the platform's events; one that the platform never saw
    is an event of kind "upload", member "failed". It is not tried again.
    """

    def __init__(self, events: Events, port: int) -> None:
        self._events = events
        self._port = port
        self._worker = ThreadPoolExecutor(max_workers=1, thread_name_prefix="uploads")

    def upload(self, template: str, text: str) -> None:
        """Post `text` to an address whose %1 and %2 stand for the platform's host and port."""
        address = template.replace("%1", layout.PLATFORM_HOST).replace("%2", str(self._port))
        self._worker.submit(self._post, address, text)

    def _post(self, address: str, text: str) -> None:
        try:
            parts = urlsplit(address)
            context = ssl.create_default_context(cafile=str(layout.SERVER_CERTIFICATE))
            context.load_cert_chain(layout.CLIENT_CERTIFICATE, layout.CLIENT_KEY)
            connection = HTTPSConnection(parts.hostname or "", parts.port, context=context, timeout=PATIENCE)
            with closing(connection):
                connection.request("POST", parts.path, text.encode(), _HEADERS)
                connection.getresponse().read()
        except (OSError, HTTPException, ValueError) as error:
            self._events.record("daemon", "platform", "upload", "failed", (address, str(error)))
