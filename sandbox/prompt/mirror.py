"""Sends the agent's notifications from the box to the host's desktop, as JSON lines."""

from __future__ import annotations

import json
from typing import IO

from sandbox.events import Event, Events


class Mirror:
    """Writes each notification of the agent to a stream."""

    def __init__(self, events: Events, stream: IO[bytes]) -> None:
        self._stream = stream
        events.subscribe(self._take)

    def _take(self, event: Event) -> None:
        if (event.target, event.member) != ("notifications", "Notify"):
            return
        app_name, _, _, summary, body, _, _, timeout = event.args
        # Without the actions, which would have no effect on the host.
        shown = {"app_name": app_name, "summary": summary, "body": body, "timeout": timeout}
        self._stream.write(json.dumps(shown).encode() + b"\n")
