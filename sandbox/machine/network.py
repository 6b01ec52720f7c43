"""The terminal's network: interfaces with known addresses, and a way to change them.

| Interface | State           | Hardware address  | Addresses            |
|-----------|-----------------|-------------------|----------------------|
| lo        | running         | none              | 127.0.0.1, ::1       |
| eth0      | running         | 00:1A:4B:00:00:05 | 10.0.0.5             |
| eth1      | running         | F4:0B:93:00:00:07 | 192.168.1.7, fd00::7 |
| wlan0     | down            | FA:CE:00:00:00:03 |                      |
| eth2      | up, not running | FE:ED:00:00:00:02 |                      |

eth0 and eth1 are the two ends of one cable: when one of them is taken down, the other one stays up but does
not run. So are eth2 and wlan0.
"""

from __future__ import annotations

import ctypes
import json
import os
import signal
import socketserver
import subprocess
import time
from socket import AF_UNIX, socket
from typing import Any, Sequence

from sandbox.machine import layout

# The end that is named last is made first and comes first in the system's lists.
_CABLES = (
    "link add eth1 address f4:0b:93:00:00:07 type veth peer name eth0 address 00:1a:4b:00:00:05",
    "link add eth2 address fe:ed:00:00:00:02 type veth peer name wlan0 address fa:ce:00:00:00:03",
)
_DEFAULT = (
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


class NetworkTrouble(Exception):
    """What the system said instead of changing the network."""


class Network:
    """Changes the network of the box; in each terminal it begins as the table above says."""

    def __init__(self) -> None:
        _ask("reset", [])

    def change(self, *commands: str) -> None:
        """Carry out commands of `ip`, such as "link set eth1 down", and wait until the interfaces have taken
        note of it."""
        _ask("change", commands)

    def remove_ipv4(self) -> None:
        """Take all IPv4 addresses but the loopback's away."""
        self.change("addr del 10.0.0.5/24 dev eth0", "addr del 192.168.1.7/24 dev eth1")


def set_up() -> None:
    """Make the interfaces of a fresh box and keep the power to change them in a process of its own: whatever
    else the caller starts, on this thread, is without it."""
    try:
        _run(_DEFAULT)
    finally:
        _start_keeper()
        ctypes.CDLL(None).prctl(_PR_CAP_AMBIENT, _PR_CAP_AMBIENT_CLEAR_ALL, 0, 0, 0)


def _ask(verb: str, commands: Sequence[str]) -> None:
    with socket(AF_UNIX) as connection:
        connection.connect(str(layout.NETWORK_SOCKET))
        connection.sendall(json.dumps({"verb": verb, "commands": commands}).encode() + b"\n")
        with connection.makefile() as stream:
            complaint = json.loads(stream.readline())
    if complaint:
        raise NetworkTrouble(complaint)


def _start_keeper() -> None:
    layout.NETWORK_SOCKET.parent.mkdir(parents=True, exist_ok=True)
    server = _Keeper(str(layout.NETWORK_SOCKET), _Request)
    if os.fork():
        server.socket.close()
        return
    # It ends with the box, and not on the Ctrl+C that is for the program in the box.
    signal.signal(signal.SIGINT, signal.SIG_IGN)
    nowhere = os.open(os.devnull, os.O_RDWR)
    for stream in range(3):
        os.dup2(nowhere, stream)
    server.serve_forever()


class _Keeper(socketserver.UnixStreamServer):
    changed = False

    def carry_out(self, verb: str, commands: Sequence[str]) -> None:
        if verb == "change":
            self.changed = True
            _run(commands)
        elif self.changed:
            _remove_all()
            _run(_DEFAULT)
            self.changed = False


class _Request(socketserver.StreamRequestHandler):
    def handle(self) -> None:
        request = json.loads(self.rfile.readline())
        assert isinstance(self.server, _Keeper)
        complaint = ""
        try:
            self.server.carry_out(request["verb"], request["commands"])
        except NetworkTrouble as trouble:
            complaint = str(trouble)
        self.wfile.write(json.dumps(complaint).encode() + b"\n")


def _remove_all() -> None:
    # The loopback gets its addresses from the kernel when it comes up without any.
    _run(("link set lo down", "addr flush dev lo"))
    while ends := [link["ifname"] for link in _links() if link["ifname"] != "lo"]:
        _run([f"link del {ends[0]}"])


def _run(commands: Sequence[str]) -> None:
    text = "".join(f"{command}\n" for command in commands)
    try:
        done = subprocess.run(["ip", "-batch", "-"], input=text, capture_output=True, text=True)
    except FileNotFoundError:
        raise NetworkTrouble("ip is missing; install it with: apt-get install iproute2") from None
    if done.returncode:
        raise NetworkTrouble(done.stderr.strip())
    _settle()


def _settle() -> None:
    """Wait until each interface that is up runs if and only if it has a carrier, which the kernel sees to a
    moment later."""
    end = time.monotonic() + _SETTLE_SECONDS
    while not all(_is_settled(link["flags"]) for link in _links("up")):
        if time.monotonic() > end:
            raise NetworkTrouble("the interfaces do not settle")


def _links(*which: str) -> list[dict[str, Any]]:
    shown = subprocess.run(["ip", "-json", "link", "show", *which], capture_output=True, check=True)
    # An interface that is left out is an empty object.
    return [link for link in json.loads(shown.stdout) if link]


def _is_settled(flags: Sequence[str]) -> bool:
    return ("LOWER_UP" in flags) != ("NO-CARRIER" in flags)
