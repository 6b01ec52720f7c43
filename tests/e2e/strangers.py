"""Strangers on a bus: what they send, to which receivers, and in whose name."""

from __future__ import annotations

from typing import Any, Iterable, NamedTuple

import pytest

from sandbox.bus.buses import Bus
from sandbox.bus.stranger import Stranger
from sandbox.fakes.base import Fake
from sandbox.terminal import Terminal

BUS = "org.freedesktop.DBus"
BUS_PATH = "/org/freedesktop/DBus"


class Spoken(NamedTuple):
    """A signal that a stranger sends."""

    path: str
    interface: str
    member: str
    signature: str = ""
    args: tuple[Any, ...] = ()


straight_or_not = pytest.mark.parametrize("straight", [False, True], ids=["broadcast", "straight"])


def receivers(terminal: Terminal, bus: Bus, straight: bool) -> list[str | None]:
    """The receivers that a signal names: none in a broadcast, else each connection of the agent."""
    return [*bus.names_of(terminal.agent.pid)] if straight else [None]


def send(stranger: Stranger, signals: Iterable[Spoken], to: Iterable[str | None] = (None,)) -> None:
    """Let a stranger send signals to each of these receivers; the bus has passed them on then."""
    for receiver in to:
        for path, interface, member, signature, args in signals:
            stranger.emit(path, interface, member, *args, signature=signature, destination=receiver)
    stranger.call(BUS, BUS_PATH, BUS, "GetId")


def send_in_the_name_of(fake: Fake, signals: Iterable[Spoken]) -> None:
    """Let a stranger own a service's name while it sends signals; then the service is back."""
    fake.leave()
    owner = Stranger(fake.bus)
    assert owner.own(fake.bus_name) == 1
    send(owner, signals)
    owner.close()
    fake.appear()
