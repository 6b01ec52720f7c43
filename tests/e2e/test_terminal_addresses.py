"""Which of the terminal's addresses a report of a software change carries."""

from __future__ import annotations

import pytest

from sandbox.terminal import Terminal
from tests.e2e.software import EDITOR, next_change

REMOVE_IPV4 = ("addr del 10.0.0.5/24 dev eth0", "addr del 192.168.1.7/24 dev eth1")


def reported(terminal: Terminal) -> tuple[str, str]:
    """Address and hardware address as a report of now carries them."""
    terminal.start_agent()
    terminal.launcher.announce("created", EDITOR)
    change = next_change(terminal)
    return change["pc_ip"], change["mac"]


def test_last_address_and_greatest_hardware_address(terminal: Terminal) -> None:
    assert reported(terminal) == ("192.168.1.7", "F4:0B:93:00:00:07")


@pytest.mark.parametrize(
    ("changes", "address"),
    [
        (("addr del 192.168.1.7/24 dev eth1",), "10.0.0.5"),
        (("addr del 192.168.1.7/24 dev eth1", "addr add 192.168.1.7/24 dev eth0"), "192.168.1.7"),
        (("addr add 10.0.0.6/24 dev eth1",), "10.0.0.6"),
        ((*REMOVE_IPV4, "addr add 10.0.0.6/24 dev eth1"), "10.0.0.6"),
        ((*REMOVE_IPV4, "addr add 169.254.7.7/16 dev eth0"), "169.254.7.7"),
        # What has no carrier has no address that counts.
        (("addr add 172.16.0.9/16 dev eth2",), "192.168.1.7"),
        (("addr add 172.16.0.9/16 dev eth2", "link set wlan0 up"), "172.16.0.9"),
        ((*REMOVE_IPV4, "addr add 127.0.0.2/8 dev lo"), "127.0.0.2"),
        (REMOVE_IPV4, ""),
    ],
    ids=str,
)
def test_last_address_that_is_not_the_loopbacks(
    terminal: Terminal, changes: tuple[str, ...], address: str
) -> None:
    terminal.network.change(*changes)

    assert reported(terminal)[0] == address


@pytest.mark.parametrize(
    ("changes", "hardware_address"),
    [
        (("link set eth0 address fa:0b:93:00:00:07",), "FA:0B:93:00:00:07"),
        (("link set eth1 address 02:00:00:00:00:01",), "02:00:00:00:00:01"),
        (
            ("link set eth0 address aa:00:00:00:00:01", "link set eth1 address 9e:ff:ff:ff:ff:ff"),
            "AA:00:00:00:00:01",
        ),
        (("link set wlan0 up",), "FE:ED:00:00:00:02"),
        # Of the two ends of a cable, one that is down keeps the other one from running.
        (("link set eth0 down",), "00:00:00:00:00:00"),
        (("link set eth1 down",), "00:00:00:00:00:00"),
        (("link set eth0 down", "link set lo down"), ""),
    ],
    ids=str,
)
def test_greatest_hardware_address_of_the_running_interfaces(
    terminal: Terminal, changes: tuple[str, ...], hardware_address: str
) -> None:
    terminal.network.change(*changes)

    assert reported(terminal)[1] == hardware_address


def test_addresses_are_those_of_the_moment(terminal: Terminal) -> None:
    terminal.start_agent()
    terminal.network.change(*REMOVE_IPV4, "link set eth0 address fe:00:00:00:00:05")

    terminal.launcher.announce("created", EDITOR)

    change = next_change(terminal)
    assert (change["pc_ip"], change["mac"]) == ("", "FE:00:00:00:00:05")
