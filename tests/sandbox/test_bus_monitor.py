"""Every call of the agent is recorded, and fails the test if no contract describes it."""

from __future__ import annotations

from pathlib import Path
from typing import Literal

import dbus
import pytest

from sandbox.bus.monitor import MonitoredCall
from sandbox.bus.stranger import Stranger
from sandbox.terminal import Terminal
from tests.sandbox import programs

SOME_POLICY = '{"type": 5}'


def play_after_a_call(terminal: Terminal, folder: Path, *actions: str) -> None:
    """Let an agent do this after an ordinary call, and end."""
    terminal.daemon.push_policy(SOME_POLICY)
    programs.play(terminal, folder, "; ".join(actions))


def ask(bus: Literal["system", "session"], name: str, member: str = "greet") -> str:
    """What an agent does that asks for something on a bus; one that has got an answer before is known."""
    known = {"system": "call_daemon('GetMachineID')", "session": f"call_policy_service({SOME_POLICY!r})"}
    return f"{known[bus]}; ask({bus!r}, {name!r}, {member!r})"


@pytest.mark.parametrize(
    ("bus", "name"),
    [
        ("system", "com.norix.absent"),
        ("session", "com.norix.absent"),
        ("session", "com.norix.velk.iam"),
        ("system", "com.norix.ScreenSaver"),
    ],
)
def test_a_call_to_an_absent_service_fails_the_test(
    tmp_path: Path, bus: Literal["system", "session"], name: str
) -> None:
    complaint = f"(?m)^the agent calls {name}.greet of {name}; no contract has that on the {bus} bus$"
    with pytest.raises(AssertionError, match=complaint), Terminal() as terminal:
        play_after_a_call(terminal, tmp_path, ask(bus, name))


def test_a_call_to_a_service_without_a_contract_fails_the_test(tmp_path: Path) -> None:
    with pytest.raises(AssertionError, match="com.norix.unknown"), Terminal() as terminal:
        service = Stranger(terminal.session_bus)
        assert service.own("com.norix.unknown") == 1
        play_after_a_call(terminal, tmp_path, ask("session", "com.norix.unknown"))
        service.close()


def test_a_call_to_an_absent_service_on_a_restarted_bus_fails_the_test(tmp_path: Path) -> None:
    with pytest.raises(AssertionError, match="com.norix.absent"), Terminal() as terminal:
        terminal.session_bus.restart()
        terminal.policy_service.appear()
        play_after_a_call(terminal, tmp_path, ask("session", "com.norix.absent"))


def test_an_agent_may_ask_a_service_that_is_absent_and_the_bus_itself(tmp_path: Path) -> None:
    with Terminal(absent=["screensaver"]) as terminal:
        play_after_a_call(
            terminal, tmp_path, ask("session", "com.norix.ScreenSaver"), "dbus.SessionBus().list_names()"
        )

        calls = terminal.session_monitor.calls
        assert calls[-2:] == [
            MonitoredCall("com.norix.ScreenSaver", "greet"),
            MonitoredCall("org.freedesktop.DBus", "ListNames"),
        ]


def test_calls_to_the_bus_are_recorded_with_their_arguments(terminal: Terminal, tmp_path: Path) -> None:
    question = "dbus.SystemBus().name_has_owner('com.norix.absent')"
    play_after_a_call(terminal, tmp_path, "call_daemon('GetMachineID')", question)

    terminal.receive_all()
    assert terminal.system_monitor.calls[-1] == MonitoredCall(
        "org.freedesktop.DBus", "NameHasOwner", ("com.norix.absent",)
    )


def test_another_client_may_call_an_absent_service(terminal: Terminal) -> None:
    client = Stranger(terminal.session_bus)
    with pytest.raises(dbus.DBusException, match="com.norix.absent"):
        client.call("com.norix.absent", "/", "com.norix.absent", "greet")
    client.close()

    terminal.session_monitor.receive_all()
    assert (terminal.session_monitor.calls, terminal.violations()) == ([], [])


def test_a_stopped_bus_is_no_trouble_for_those_who_listen() -> None:
    with Terminal() as terminal:
        terminal.system_bus.stop()
        terminal.session_bus.restart()
