"""Strangers on a bus: to which receivers they send their signals, and when those have been sent."""

from __future__ import annotations

import pytest

from sandbox.bus.buses import Bus
from sandbox.bus.stranger import Stranger
from sandbox.terminal import Terminal

BUS = "org.freedesktop.DBus"
BUS_PATH = "/org/freedesktop/DBus"

straight_or_not = pytest.mark.parametrize("straight", [False, True], ids=["broadcast", "straight"])


def receivers(terminal: Terminal, bus: Bus, straight: bool) -> list[str | None]:
    """The receivers that a signal names: none in a broadcast, else each connection of the agent."""
    return [*terminal.agent.bus_names(bus)] if straight else [None]


def let_reach_the_bus(stranger: Stranger) -> None:
    """Return once the bus has passed on what the stranger sent."""
    stranger.call(BUS, BUS_PATH, BUS, "GetId")
