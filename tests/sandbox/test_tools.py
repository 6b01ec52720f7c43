"""Package tools that a test replaces, and the real ones afterwards."""

from __future__ import annotations

import subprocess
import threading
from pathlib import Path

import pytest

from sandbox.machine.commands import Answer
from sandbox.machine.packages import desktop_file
from sandbox.terminal import Terminal

QUERY = ("/usr/bin/dpkg-query", "-W", "-f=${Version}", "editor")
# How the agent calls each tool, and what the real one then prints.
CALLS = {"dpkg": ("/usr/bin/dpkg", "-S", desktop_file("editor")), "dpkg-query": QUERY}
PRINTED = {"dpkg": f"editor: {desktop_file('editor')}\n".encode(), "dpkg-query": b"2.1"}


def run(*argv: str, **environment: str) -> subprocess.CompletedProcess[bytes]:
    """A command that has ended."""
    return subprocess.run(argv, env={"PATH": "/usr/bin", **environment}, capture_output=True)


@pytest.mark.parametrize(
    "answer", [Answer(3, b"\xff\xfe"), Answer(0, b""), Answer(-9), Answer(-11, b"half")], ids=str
)
@pytest.mark.parametrize("tool", CALLS)
def test_replaced_tool_gives_its_answer(terminal: Terminal, tool: str, answer: Answer) -> None:
    terminal.tools.answer(tool, answer)

    ended = run(*CALLS[tool])

    assert (ended.returncode, ended.stdout) == (answer.status, answer.stdout)


@pytest.mark.parametrize("tool", CALLS)
def test_calls_are_recorded_with_arguments_and_environment(terminal: Terminal, tool: str) -> None:
    terminal.packages.install("editor", "2.1")
    terminal.tools.record(tool)

    printed = run(*CALLS[tool], LC_ALL="C", EMPTY="").stdout

    call = terminal.events.wait_for(kind="command", target=tool)
    assert (printed, call.args) == (PRINTED[tool], CALLS[tool][1:])
    assert call.detail["environment"] == {"PATH": "/usr/bin", "LC_ALL": "C", "EMPTY": ""}


def test_tools_that_call_one_another_reach_the_real_ones(terminal: Terminal) -> None:
    terminal.packages.install("editor", "2.1")
    terminal.tools.answer("dpkg-query", Answer(1))
    found = run(*CALLS["dpkg"]).stdout
    terminal.tools.answer("dpkg", Answer(1))
    architecture = run("/usr/bin/dpkg-architecture", "-q", "DEB_HOST_ARCH").stdout

    assert found == PRINTED["dpkg"]
    assert architecture
    assert terminal.events.all(kind="command") == []


def test_held_tool_hangs_until_it_is_released(terminal: Terminal) -> None:
    terminal.tools.answer("dpkg-query", Answer(0, b"late"))
    terminal.tools.hold("dpkg-query")
    with subprocess.Popen(QUERY, stdout=subprocess.PIPE) as child:
        call = terminal.events.wait_for(kind="command", target="dpkg-query")
        still_there = child.poll() is None
        terminal.tools.release("dpkg-query")
        printed = child.communicate()[0]

    assert (still_there, call.detail["pid"], printed) == (True, child.pid, b"late")


def test_held_tool_can_be_nudged_without_its_end(terminal: Terminal) -> None:
    terminal.tools.hold("dpkg-query")
    with subprocess.Popen(QUERY, stdout=subprocess.PIPE, stderr=subprocess.PIPE) as child:
        assert child.stdout and child.stderr
        terminal.events.wait_for(kind="command", target="dpkg-query")
        nudging = threading.Thread(target=terminal.tools.nudge, args=("dpkg-query", b"half\n"))
        nudging.start()
        read = (child.stdout.readline(), child.stderr.readline())
        nudging.join()
        still_there = child.poll() is None
        terminal.tools.release("dpkg-query")

    assert (read, still_there) == ((b"half\n", b"\n"), True)


def test_tool_that_was_ended_is_not_nudged(terminal: Terminal) -> None:
    terminal.tools.hold("dpkg-query")
    with subprocess.Popen(QUERY) as child:
        terminal.events.wait_for(kind="command", target="dpkg-query")
        child.kill()

    assert terminal.tools.nudge("dpkg-query") == 0


def test_tool_can_be_a_script(terminal: Terminal) -> None:
    terminal.tools.write("dpkg-architecture", "#!/bin/sh\necho $2 64\n")

    assert run("/usr/bin/dpkg-architecture", "-q", "bits").stdout == b"bits 64\n"


def test_tool_can_be_forbidden(terminal: Terminal) -> None:
    terminal.tools.forbid("dpkg-query")

    with pytest.raises(PermissionError):
        run(*QUERY)


@pytest.mark.parametrize("tool", CALLS)
def test_real_tool_is_back_in_the_next_terminal(tool: str) -> None:
    with Terminal() as before:
        before.tools.answer(tool, Answer(1, b"fake"))
        before.tools.forbid(tool)

    with Terminal() as after:
        after.packages.install("editor", "2.1")
        assert run(*CALLS[tool]).stdout == PRINTED[tool]


def test_tool_is_replaced_once_its_last_run_has_ended(terminal: Terminal, tmp_path: Path) -> None:
    terminal.tools.write("dpkg", "#!/bin/sh\n")
    Path("/usr/bin/dpkg").write_bytes(Path("/usr/bin/sleep").read_bytes())
    running = subprocess.Popen(["/usr/bin/dpkg", "infinity"])
    threading.Timer(0.2, running.kill).start()

    terminal.tools.answer("dpkg", Answer(0, b"replaced"))

    assert (running.wait(), run(*CALLS["dpkg"]).stdout) == (-9, b"replaced")


def test_replaced_command_is_gone_in_the_next_terminal() -> None:
    with Terminal() as before:
        before.commands.answer("no-such-command", Answer())

    with Terminal():
        assert not Path("/run/box/bin/no-such-command").is_symlink()
