"""The agent's intervals, in seconds of its clock."""

from __future__ import annotations

# The first poll comes 60 to 120 s after the start, each later one 60 to 180 s after the previous one.
BEFORE_ANY_POLL = 58
LONGEST_FIRST_POLL, LONGEST_POLL = 120, 180
SURELY_FIRST_POLL, SURELY_NEXT_POLL = LONGEST_FIRST_POLL + 1, LONGEST_POLL + 1

STATE_REPORT = 300

# How long it waits for an answer over D-Bus, and over HTTPS.
DBUS_LIMIT, TRANSFER_LIMIT = 25, 30
