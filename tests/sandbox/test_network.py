"""The network of a box is as its description says, and programs in the box cannot change it."""

from __future__ import annotations

import json
import socket
import subprocess

import pytest

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
        link["ifname"]: (
            ("UP" in link["flags"], "LOWER_UP" in link["flags"]),
            link["address"],
            [known["local"] for known in link["addr_info"]],
        )
        for link in json.loads(shown.stdout)
    }


def test_interfaces_their_order_and_addresses_are_as_said() -> None:
    assert list(interfaces().items()) == list(AS_SAID.items())


def test_only_the_box_is_reached() -> None:
    with pytest.raises(OSError, match="unreachable"):
        socket.create_connection(("198.51.100.1", 80), timeout=1)


def test_programs_cannot_change_the_network() -> None:
    attempt = subprocess.run(["ip", "link", "set", "eth0", "down"], capture_output=True, text=True)

    assert (attempt.returncode, attempt.stderr) == (2, "RTNETLINK answers: Operation not permitted\n")
