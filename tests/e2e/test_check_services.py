"""What velks-check says of services, tools, the unit and the agent's process."""

from __future__ import annotations

import os
import shutil
import signal
import subprocess
import sys
from pathlib import Path

import pytest

from sandbox.fakes.exported import Reply
from sandbox.fakes.fault import Fault
from sandbox.fakes.logind import DISPLAY, USER
from sandbox.machine.commands import Answer
from sandbox.terminal import Terminal
from tests.e2e.checkreport import Line, findings

DENIED = Fault("fail", "org.freedesktop.DBus.Error.AccessDenied")


@pytest.mark.parametrize(
    ("fake", "result"),
    [
        ("daemon", "bad"),
        ("logind", "bad"),
        ("identity", "warning"),
        ("policy_service", "warning"),
        ("notifications", "bad"),
        ("screensaver", "warning"),
        ("session_manager", "warning"),
        ("dock", "warning"),
        ("launcher", "warning"),
    ],
)
def test_service_that_is_absent_is_named_with_what_follows(
    terminal: Terminal, fake: str, result: str
) -> None:
    terminal.fakes[fake].leave()
    found = findings(terminal)
    line = found.line("service", "is not there: ")
    assert (line.result, line.text.split()[0]) == (result, terminal.fakes[fake].bus_name)
    assert len([name for name, _ in found.lines if name == "service"]) == len(terminal.fakes)


@pytest.mark.parametrize("kind", ["system", "session"])
def test_bus_that_cannot_be_reached_is_one_bad_line(terminal: Terminal, kind: str) -> None:
    found = findings(terminal, env={f"DBUS_{kind.upper()}_BUS_ADDRESS": "unix:path=/nowhere"})
    assert found.line(f"{kind} bus", "cannot be reached: ").result == "bad"
    assert found.status == 2


@pytest.mark.parametrize("tool", ["dpkg", "dpkg-query", "dpkg-architecture"])
def test_package_tool_that_does_not_run_is_a_warning(terminal: Terminal, tool: str) -> None:
    terminal.tools.forbid(tool)
    lines = [line for subject, line in findings(terminal).lines if subject == "package tool"]
    broken = [line.text for line in lines if line.result == "warning"]
    assert len(lines) == 3
    assert [text.split()[0].rpartition("/")[2] for text in broken] == [tool]


FAILED = "failed; see journalctl --user -u velks, then systemctl --user restart velks"
INACTIVE = "inactive; start it with systemctl --user start velks"
MASKED = "masked: an administrator or the user has disabled the agent; "
NOT_MEANT = "not meant to run for this user: "


@pytest.mark.parametrize(
    ("properties", "result", "text"),
    [
        ("ActiveState=failed", "bad", FAILED),
        ("ActiveState=inactive", "warning", INACTIVE),
        ("ActiveState=inactive LoadState=masked", "warning", MASKED),
        ("ActiveState=inactive LoadState=not-found", "warning", "unknown to the service manager; "),
        ("ActiveState=activating", "warning", "about to start again after a failure; see journalctl"),
        ("ActiveState=inactive Result=exec-condition", "warning", NOT_MEANT),
        ("ActiveState=inactive ConditionResult=no ConditionTimestampMonotonic=17", "warning", NOT_MEANT),
        ("ActiveState=inactive ConditionResult=no ConditionTimestampMonotonic=0", "warning", INACTIVE),
    ],
)
def test_unit_that_is_not_active(terminal: Terminal, properties: str, result: str, text: str) -> None:
    said = ("ConditionTimestampMonotonic=0 " + properties).replace(" ", "\n")
    terminal.commands.answer("systemctl", Answer(stdout=f"{said}\n".encode()))
    line = findings(terminal).line("unit")
    assert line.result == result
    assert line.text.startswith(f"velks.service is {text}")
    (call,) = terminal.events.all(kind="command", member="systemctl")
    assert call.args[:3] == ("--user", "show", "velks.service")


def test_without_a_service_manager_the_unit_is_a_warning(terminal: Terminal) -> None:
    terminal.commands.answer("systemctl", Answer(1))
    assert findings(terminal).line("unit").text == "there is no user service manager to ask"


@pytest.mark.parametrize(("fake", "result"), [("daemon", "bad"), ("logind", "bad"), ("identity", "warning")])
@pytest.mark.parametrize(
    ("fault", "text"),
    [
        (Fault("hang"), " does not answer (Did not receive a reply."),
        (DENIED, " may not be called by this user; the bus lacks"),
    ],
)
def test_service_that_is_of_no_use_is_named_with_what_follows(
    terminal: Terminal, fake: str, result: str, fault: Fault, text: str
) -> None:
    terminal.fakes[fake].fault = fault
    line = findings(terminal).line("service", text)
    assert (line.result, line.text.split()[0]) == (result, terminal.fakes[fake].bus_name)


@pytest.mark.parametrize("answer", ["challenge", "no", "na"])
def test_reboot_that_would_be_refused_is_a_warning(working: Terminal, answer: str) -> None:
    assert findings(working).line("reboot").result == "good"
    working.logind.answers["CanReboot"] = Reply("s", (answer,))
    line = findings(working).line("reboot")
    assert (line.result, line.text.split(":")[0]) == ("warning", f"would be refused now ({answer})")


def test_reboot_that_cannot_be_asked_for_without_a_policy_kit_is_a_warning(working: Terminal) -> None:
    working.logind.faults["CanReboot"] = DENIED
    line = findings(working).line("reboot")
    assert (line.result, line.text.split(" (")[0]) == ("warning", "would be refused now")


@pytest.mark.parametrize("kind", ["wayland", "x11"])
def test_graphical_session_is_good(working: Terminal, kind: str) -> None:
    working.logind.set("Type", kind, path=DISPLAY)
    assert findings(working).line("session") == Line("good", f"is graphical ({kind})")
    working.logind.set("Active", False, path=DISPLAY)
    assert findings(working).line("session") == Line("good", f"is graphical ({kind}), in the background")


@pytest.mark.parametrize(
    ("path", "name", "value"),
    [
        (DISPLAY, "Type", "tty"),
        (DISPLAY, "Type", "unspecified"),
        (DISPLAY, "Class", "greeter"),
        (USER, "Display", ("", "/")),
    ],
)
def test_agent_without_a_graphical_session_of_the_user_is_bad(
    working: Terminal, path: str, name: str, value: object
) -> None:
    working.logind.set(name, value, path=path)
    line = findings(working).line("session")
    assert (line.result, line.text.split(":")[0]) == ("bad", "this user has no graphical one")


def test_agent_that_is_frozen_is_bad(working: Terminal) -> None:
    os.kill(working.agent.pid, signal.SIGSTOP)
    line = findings(working).line("agent")
    os.kill(working.agent.pid, signal.SIGCONT)
    assert (line.result, line.text.split(" and ")[0]) == ("bad", "is stopped by a signal")


def test_agent_that_does_not_run_is_bad(terminal: Terminal) -> None:
    assert findings(terminal).line("agent") == Line("bad", "does not run")


def test_second_agent_is_bad(working: Terminal) -> None:
    with subprocess.Popen([working.agent.binary], stderr=subprocess.DEVNULL) as second:
        line = findings(working).line("agent")
        second.terminate()
    assert (line.result, line.text) == ("bad", "runs 2 times; there must be one")


FORKS = """
import os, sys
open("/proc/self/comm", "w").write("velks")
if os.fork():
    print("forked", flush=True)
sys.stdin.read()
"""


def test_child_of_the_agent_that_is_no_other_program_yet_is_no_second_agent(terminal: Terminal) -> None:
    command = [sys.executable, "-c", FORKS]
    with subprocess.Popen(command, stdin=subprocess.PIPE, stdout=subprocess.PIPE) as forked:
        assert forked.stdout and forked.stdout.readline() == b"forked\n"
        line = findings(terminal).line("agent")
    assert (line.result, line.text) == ("good", "runs")


def test_agent_whose_program_was_replaced_is_a_warning(terminal: Terminal, tmp_path: Path) -> None:
    installed = terminal.agent.binary
    terminal.agent.binary = Path(shutil.copy(installed, tmp_path / "velks"))
    terminal.start_agent()
    assert agent_line(terminal, installed).text == "runs"
    os.replace(shutil.copy(installed, tmp_path / "newer"), tmp_path / "velks")
    line = agent_line(terminal, installed)
    assert line.result == "warning"
    assert line.text.startswith(
        "runs an older program than the one installed; systemctl --user restart velks"
    )


def agent_line(terminal: Terminal, installed: Path) -> Line:
    """What the installed check program says of an agent that was started elsewhere."""
    started, terminal.agent.binary = terminal.agent.binary, installed
    found = findings(terminal).line("agent")
    terminal.agent.binary = started
    return found
