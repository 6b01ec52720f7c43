"""The terminal's network is the same in each terminal, and tests may change it."""

from __future__ import annotations

import json
import socket
import subprocess
from typing import Any, Iterator

import pytest

from sandbox.machine.network import NetworkTrouble
from sandbox.terminal import Terminal

RUNNING = (True, True)
UP_ONLY = (True, False)
DOWN = (False, False)
AS_SAID = {
    "lo": (RUNNING, "00:00:00:00:00:00", ["127.0.0.1", "::1"]),
    "eth0": (RUNNING, "00:1a:4b:00:00:05", ["10.0.0.5"]),
    "eth1": (RUNNING, "f4:0b:93:00:00:07", ["192.168.1.7", "fd00::7"]),
    "wlan0": (DOWN, "fa:ce:00:00:00:03", []),
    "eth2": (UP_ONLY, "fe:ed:00:00:00:02", []),
}


def interfaces() -> dict[str, tuple[tuple[bool, bool], str, list[str]]]:
    """Whether each interface is up and whether it runs, its hardware address, its addresses; in the system's
    order."""
    shown = subprocess.run(["ip", "-json", "address"], capture_output=True, check=True)
    return {
        link["ifname"]: (state(link), link["address"], addresses(link)) for link in json.loads(shown.stdout)
    }


def state(link: dict[str, Any]) -> tuple[bool, bool]:
    return "UP" in link["flags"], "LOWER_UP" in link["flags"]


def addresses(link: dict[str, Any]) -> list[str]:
    return [known["local"] for known in link["addr_info"]]


@pytest.fixture
def terminals() -> Iterator[list[Terminal]]:
    """Closes the terminals that a test adds."""
    opened: list[Terminal] = []
    yield opened
    for terminal in opened:
        terminal.close()


def test_interfaces_and_addresses_are_as_said(terminal: Terminal) -> None:
    assert interfaces() == AS_SAID


def test_order_of_the_interfaces_is_as_said(terminal: Terminal) -> None:
    assert list(interfaces()) == list(AS_SAID)


def test_addresses_can_be_taken_away(terminal: Terminal) -> None:
    terminal.network.remove_ipv4()

    assert [found[2] for found in interfaces().values()] == [["127.0.0.1", "::1"], [], ["fd00::7"], [], []]


def test_interface_whose_other_end_is_down_is_up_and_does_not_run(terminal: Terminal) -> None:
    terminal.network.change("link set eth1 down")

    found = interfaces()
    assert (found["eth0"][0], found["eth1"][0]) == (UP_ONLY, DOWN)


def test_changes_are_gone_in_the_next_terminal(terminals: list[Terminal]) -> None:
    terminals.append(Terminal())
    terminals[-1].network.change("link set eth2 down", "addr add 10.9.9.9/8 dev wlan0", "link del eth0")
    terminals[-1].network.change("addr add 127.0.0.2/8 dev lo")
    terminals.pop().close()

    terminals.append(Terminal())

    assert interfaces() == AS_SAID


def test_impossible_change_tells_why(terminal: Terminal) -> None:
    with pytest.raises(NetworkTrouble, match="Cannot find device"):
        terminal.network.change("link set nowhere up")


def test_only_the_box_is_reached(terminal: Terminal) -> None:
    with pytest.raises(OSError, match="unreachable"):
        socket.create_connection(("198.51.100.1", 80), timeout=1)


def test_programs_cannot_change_the_network(terminal: Terminal) -> None:
    attempt = subprocess.run(["ip", "link", "set", "eth0", "down"], capture_output=True, text=True)

    assert (attempt.returncode, attempt.stderr) == (2, "RTNETLINK answers: Operation not permitted\n")
