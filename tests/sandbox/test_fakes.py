"""The services on the buses: what they record, how they fail, what they hold against a client."""

from __future__ import annotations

import re
from concurrent.futures import ThreadPoolExecutor
from typing import Any

import dbus
import pytest

from sandbox.bus.buses import Bus
from sandbox.bus.stranger import Stranger
from sandbox.fakes.fault import Fault
from sandbox.terminal import Terminal

DAEMON = ("com.norix.velk.velkg", "/com/norix/velk/velkg", "com.norix.velk.velkg")
SCREEN_SAVER = ("com.norix.ScreenSaver", "/com/norix/ScreenSaver", "org.freedesktop.DBus.Properties")

IDENTITY = ("com.norix.velk.iam", "/com/norix/velk/iam", "org.freedesktop.DBus.Properties")


def property_call(bus: Bus, known: tuple[str, ...], member: str, *args: Any) -> Any:
    """What a service answers to a client that reads or sets a property; the last part of an error's name."""
    client = Stranger(bus)
    signature = {"Get": "ss", "GetAll": "s", "Set": "ssv"}[member]
    try:
        return client.call(*known, member, *args, signature=signature)
    except dbus.DBusException as error:
        return error.get_dbus_name().rpartition(".")[2]
    finally:
        client.close()


def test_a_call_is_recorded_with_its_exact_signature(terminal: Terminal, on_system: Stranger) -> None:
    on_system.call(*DAEMON, "SendUserStatus", 3, "zhang", signature="is")

    call = terminal.events.wait_for(target="daemon", member="SendUserStatus")
    assert (call.source, call.args, call.detail["signature"]) == ("box", (3, "zhang"), "is")


@pytest.mark.parametrize(
    "member, args, signature",
    [
        ("SendUserStatus", (3, "zhang"), "us"),
        ("sendUserStatus", (3, "zhang"), "is"),
        ("GetServerPort", (1,), "i"),
    ],
)
def test_a_call_that_breaks_the_contract_fails_the_test(
    member: str, args: tuple[Any, ...], signature: str
) -> None:
    terminal = Terminal()
    caller = Stranger(terminal.system_bus)
    with pytest.raises(dbus.DBusException):
        caller.call(*DAEMON, member, *args, signature=signature)
    caller.close()

    with pytest.raises(AssertionError, match=member):
        terminal.close()


@pytest.mark.parametrize(
    ("args", "error", "complaint"),
    [
        (("Get", IDENTITY[0], "enable"), "UnknownProperty", "com.norix.velk.iam.enable"),
        (("Get", "com.norix.iam", "Enable"), "UnknownInterface", "com.norix.iam"),
        (("GetAll", "com.norix.iam"), "UnknownInterface", "com.norix.iam"),
        (("Set", IDENTITY[0], "enable", True), "UnknownProperty", "com.norix.velk.iam.enable"),
    ],
    ids=str,
)
def test_a_property_that_no_contract_has_fails_the_test(
    args: tuple[Any, ...], error: str, complaint: str
) -> None:
    with pytest.raises(AssertionError, match=f"(?m)^identity: .* {complaint}$"), Terminal() as terminal:
        assert property_call(terminal.system_bus, IDENTITY, *args) == error


def test_a_change_of_a_property_that_is_only_read_fails_the_test() -> None:
    with pytest.raises(AssertionError, match="isRunning is read-only"), Terminal() as terminal:
        refused = property_call(terminal.session_bus, SCREEN_SAVER, "Set", SCREEN_SAVER[0], "isRunning", True)
        assert (refused, terminal.screensaver.value("isRunning")) == ("PropertyReadOnly", False)


@pytest.mark.parametrize(
    ("value", "signature"),
    [
        (dbus.Int32(0), "i"),
        (dbus.UInt32(0), "u"),
        ("false", "s"),
        (dbus.ObjectPath("/"), "o"),
        (dbus.Boolean(False, variant_level=2), "v"),
        (dbus.Array([True], "b"), "ab"),
        (dbus.Array([[True]], "av"), "aav"),
        (dbus.Dictionary({"a": 1}, "sv"), "a{sv}"),
        (dbus.Struct((1, "a", dbus.Boolean(True, variant_level=1))), "(isv)"),
    ],
    ids=str,
)
def test_a_property_set_to_a_value_of_another_type_fails_the_test(value: Any, signature: str) -> None:
    complaint = f"Enable is (b), set to ({signature})"
    with pytest.raises(AssertionError, match=re.escape(complaint)), Terminal() as terminal:
        refused = property_call(terminal.system_bus, IDENTITY, "Set", IDENTITY[0], "Enable", value)
        assert (refused, terminal.identity.value("Enable")) == ("InvalidArgs", True)


def test_a_property_may_be_read_and_set_as_its_contract_says(terminal: Terminal) -> None:
    assert property_call(terminal.system_bus, IDENTITY, "Set", IDENTITY[0], "Enable", False) == []
    assert property_call(terminal.system_bus, IDENTITY, "Get", IDENTITY[0], "Enable") is False
    assert property_call(terminal.system_bus, IDENTITY, "GetAll", IDENTITY[0]) == {"Enable": False}


def test_a_failing_service_answers_with_its_error(terminal: Terminal, on_system: Stranger) -> None:
    terminal.daemon.fault = Fault("fail", "com.norix.Error.Broken")

    with pytest.raises(dbus.DBusException) as raised:
        on_system.call(*DAEMON, "GetMachineID")

    assert raised.value.get_dbus_name() == "com.norix.Error.Broken"


def test_a_fault_of_one_member_spares_the_others(terminal: Terminal, on_system: Stranger) -> None:
    terminal.daemon.faults["GetServerIP"] = Fault("fail")

    assert on_system.call(*DAEMON, "GetMachineID") == "box-machine-0001"


def test_a_held_call_is_answered_on_release(terminal: Terminal, on_system: Stranger) -> None:
    terminal.daemon.fault = Fault("hold")
    with ThreadPoolExecutor() as pool:
        answer = pool.submit(on_system.call, *DAEMON, "GetMachineID")
        terminal.events.wait_for(target="daemon", member="GetMachineID")
        held = not answer.done()
        terminal.daemon.release()

    assert (held, answer.result()) == (True, "box-machine-0001")


def test_a_hanging_call_ends_with_the_service(terminal: Terminal, on_system: Stranger) -> None:
    terminal.daemon.fault = Fault("hang")
    with ThreadPoolExecutor() as pool:
        answer = pool.submit(on_system.call, *DAEMON, "GetMachineID")
        terminal.events.wait_for(target="daemon", member="GetMachineID")
        terminal.daemon.leave()

    assert "NoReply" in str(answer.exception())


def test_a_restarted_service_has_a_new_unique_name(terminal: Terminal) -> None:
    before = terminal.system_bus.owner("com.norix.velk.velkg")

    terminal.daemon.restart()

    assert terminal.system_bus.owner("com.norix.velk.velkg") not in (before, None)


def test_a_restarted_bus_has_lost_its_services(terminal: Terminal) -> None:
    terminal.session_bus.restart()

    present = {name for name, fake in terminal.fakes.items() if fake.present}
    assert present == {"daemon", "logind", "identity"}


def test_a_property_may_have_a_wrong_type(terminal: Terminal) -> None:
    terminal.screensaver.set("isRunning", "yes", signature="s")

    running = property_call(terminal.session_bus, SCREEN_SAVER, "Get", SCREEN_SAVER[0], "isRunning")
    assert running == "yes"


def test_an_absent_service_has_no_owner() -> None:
    with Terminal(absent=("screensaver",)) as terminal:
        assert terminal.session_bus.owner("com.norix.ScreenSaver") is None
