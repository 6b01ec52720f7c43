"""The network of a box, which is always the same and isolated from the host's.

| Interface | State           | Hardware address  | Addresses            |
|-----------|-----------------|-------------------|----------------------|
| lo        | running         | none              | 127.0.0.1, ::1       |
| eth0      | running         | 00:1A:4B:00:00:05 | 10.0.0.5             |
| eth1      | running         | F4:0B:93:00:00:07 | 192.168.1.7, fd00::7 |
| wlan0     | down            | FA:CE:00:00:00:03 |                      |
| eth2      | up, not running | FE:ED:00:00:00:02 |                      |

eth0 and eth1 are the two ends of one cable. So are eth2 and wlan0: eth2 has no carrier because wlan0 is down.
"""

from __future__ import annotations

import ctypes
import json
import subprocess
import time
from typing import Sequence

# The kernel creates the end named last first, and lists it first.
_CABLES = (
    "link add eth1 address f4:0b:93:00:00:07 type veth peer name eth0 address 00:1a:4b:00:00:05",
    "link add eth2 address fe:ed:00:00:00:02 type veth peer name wlan0 address fa:ce:00:00:00:03",
)
_INTERFACES = (
    "link set lo up",
    *_CABLES,
    *(f"link set {name} addrgenmode none" for name in ("eth0", "eth1", "eth2", "wlan0")),
    "addr add 10.0.0.5/24 dev eth0",
    "addr add 192.168.1.7/24 dev eth1",
    "addr add fd00::7/64 dev eth1 nodad",
    *(f"link set {name} up" for name in ("eth0", "eth1", "eth2")),
)
_SETTLE_SECONDS = 5.0
_PR_CAP_AMBIENT, _PR_CAP_AMBIENT_CLEAR_ALL = 47, 4


class NetworkUnavailable(Exception):
    """The network could not be set up; the message is the system's."""


def set_up() -> None:
    """Create the interfaces of a fresh box, then drop the capability to change them, also for all programs
    that this thread starts afterwards."""
    try:
        _run_ip("".join(f"{command}\n" for command in _INTERFACES))
        _settle()
    finally:
        ctypes.CDLL(None).prctl(_PR_CAP_AMBIENT, _PR_CAP_AMBIENT_CLEAR_ALL, 0, 0, 0)


def _run_ip(commands: str) -> None:
    try:
        done = subprocess.run(["ip", "-batch", "-"], input=commands, capture_output=True, text=True)
    except FileNotFoundError:
        raise NetworkUnavailable("ip is missing; install it with: apt-get install iproute2") from None
    if done.returncode:
        raise NetworkUnavailable(done.stderr.strip())


def _settle() -> None:
    """Wait until the kernel has updated the flags of all interfaces that are up: each either has a carrier or
    is marked as having none."""
    end = time.monotonic() + _SETTLE_SECONDS
    while not all(_is_settled(flags) for flags in _flags_of_up_interfaces()):
        if time.monotonic() > end:
            raise NetworkUnavailable("the interfaces do not settle")


def _flags_of_up_interfaces() -> list[Sequence[str]]:
    shown = subprocess.run(["ip", "-json", "link", "show", "up"], capture_output=True, check=True)
    # ip prints an empty object for an interface that it filters out.
    return [link["flags"] for link in json.loads(shown.stdout) if link]


def _is_settled(flags: Sequence[str]) -> bool:
    return ("LOWER_UP" in flags) != ("NO-CARRIER" in flags)
