"""What the agent asks of the buses and of nobody is overheard, and fails the test if no contract has it."""

from __future__ import annotations

from pathlib import Path
from typing import Literal

import dbus
import pytest

from sandbox.bus.monitor import Overheard
from sandbox.bus.stranger import Stranger
from sandbox.terminal import Terminal
from tests.sandbox.programs import talking_agent

SOME_POLICY = '{"type": 5}'


def play(terminal: Terminal, folder: Path, *deeds: str) -> None:
    """Let an agent do this after a call that everybody knows; its end is no surprise."""
    terminal.agent.binary = talking_agent(folder, "; ".join(deeds))
    terminal.daemon.push_policy(SOME_POLICY)
    terminal.start_agent(ready=terminal.agent.wait)
    if terminal.agent.exit_status != 0:
        pytest.fail(terminal.report())


def ask(bus: Literal["system", "session"], name: str, member: str = "greet") -> str:
    """What an agent does that asks for something on a bus; one that has got an answer before is known."""
    known = {"system": "call_daemon('GetMachineID')", "session": f"call_policy_service({SOME_POLICY!r})"}
    return f"{known[bus]}; ask({bus!r}, {name!r}, {member!r})"


@pytest.mark.parametrize(
    ("bus", "name"),
    [
        ("system", "com.norix.nobody"),
        ("session", "com.norix.nobody"),
        ("session", "com.norix.velk.iam"),
        ("system", "com.norix.ScreenSaver"),
    ],
)
def test_an_agent_that_asks_nobody_fails_the_test(
    tmp_path: Path, bus: Literal["system", "session"], name: str
) -> None:
    complaint = f"(?m)^the agent asks {name} for {name}.greet; no contract has that on the {bus} bus$"
    with pytest.raises(AssertionError, match=complaint), Terminal() as terminal:
        play(terminal, tmp_path, ask(bus, name))


def test_an_agent_that_asks_somebody_without_a_contract_fails_the_test(tmp_path: Path) -> None:
    with pytest.raises(AssertionError, match="com.norix.somebody"), Terminal() as terminal:
        somebody = Stranger(terminal.session_bus)
        assert somebody.own("com.norix.somebody") == 1
        play(terminal, tmp_path, ask("session", "com.norix.somebody"))
        somebody.close()


def test_an_agent_that_asks_nobody_on_a_restarted_bus_fails_the_test(tmp_path: Path) -> None:
    with pytest.raises(AssertionError, match="com.norix.nobody"), Terminal() as terminal:
        terminal.session_bus.restart()
        terminal.policy_service.appear()
        play(terminal, tmp_path, ask("session", "com.norix.nobody"))


def test_an_agent_may_ask_a_service_that_is_absent_and_the_bus_itself(tmp_path: Path) -> None:
    with Terminal(absent=["screensaver"]) as terminal:
        play(terminal, tmp_path, ask("session", "com.norix.ScreenSaver"), "dbus.SessionBus().list_names()")

        overheard = terminal.session_monitor.calls
        assert overheard[-2:] == [
            Overheard("com.norix.ScreenSaver", "greet"),
            Overheard("org.freedesktop.DBus", "ListNames"),
        ]


def test_questions_to_the_bus_are_overheard_with_what_they_are_about(
    terminal: Terminal, tmp_path: Path
) -> None:
    question = "dbus.SystemBus().name_has_owner('com.norix.nobody')"
    play(terminal, tmp_path, "call_daemon('GetMachineID')", question)

    terminal.receive_all()
    assert terminal.system_monitor.calls[-1] == Overheard(
        "org.freedesktop.DBus", "NameHasOwner", ("com.norix.nobody",)
    )


def test_somebody_else_may_ask_nobody(terminal: Terminal) -> None:
    client = Stranger(terminal.session_bus)
    with pytest.raises(dbus.DBusException, match="com.norix.nobody"):
        client.call("com.norix.nobody", "/", "com.norix.nobody", "greet")
    client.close()

    terminal.session_monitor.receive_all()
    assert (terminal.session_monitor.calls, terminal.violations()) == ([], [])


def test_a_stopped_bus_is_no_trouble_for_those_who_listen() -> None:
    with Terminal() as terminal:
        terminal.system_bus.stop()
        terminal.session_bus.restart()
