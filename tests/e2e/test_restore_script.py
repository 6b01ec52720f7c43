"""The restore script of a domain exit: missing, failing, slow, or whatever else it does."""

from __future__ import annotations

import os
from pathlib import Path

import pytest

from sandbox.terminal import Terminal
from tests.e2e.domainexit import EXIT, EXIT_STEPS, leave_domain, steps_seen
from tests.e2e.wire import forced_actions, log_lines, push


def test_script_path_is_logged(session: Terminal) -> None:
    mark = leave_domain(session)
    assert 'onPolicyMsg ----strPath: "/usr/share/velk/scripts/restore_config.bash"' in log_lines(
        session, mark
    )


@pytest.mark.parametrize(
    "script",
    [
        "exit 1\n",
        "kill -9 $$\n",
        "syntax error (\n",
        "cat /nowhere >&2\n",
        "printf 'a long line\\n%.0s' {1..20000}\n",
    ],
)
def test_failing_or_noisy_script_does_not_stop_the_exit(session: Terminal, script: str) -> None:
    session.files.write_restore_script(script)
    mark = leave_domain(session)
    session.advance(60)
    assert forced_actions(session, mark) == ["Reboot"]


def test_missing_script_does_not_stop_the_exit(session: Terminal) -> None:
    Path("/usr/share/velk/scripts/restore_config.bash").unlink()
    mark = leave_domain(session)
    session.advance(60)
    assert forced_actions(session, mark) == ["Reboot"]


def test_script_that_reads_its_input_finds_its_end_at_once(session: Terminal) -> None:
    session.files.write_restore_script('read -r line; restore_config "status $?" "$(cat)"\n')
    mark = leave_domain(session)
    script = session.events.wait_for(target="restore_config", after=mark)
    assert script.args == ("status 1", "")


def test_script_that_takes_longer_than_the_minute_delays_the_reboot_to_its_end(session: Terminal) -> None:
    session.commands.hold("restore_config")
    mark = push(session, EXIT)
    session.events.wait_for(target="restore_config", after=mark)

    session.jump(90)
    assert session.events.all(target="systemctl", after=mark) == []
    session.commands.release("restore_config")
    session.sync()
    session.sync()
    assert steps_seen(session, mark) == [*EXIT_STEPS, ("logind", "Reboot")]


@pytest.mark.parametrize("stream", [1, 2], ids=["stdout", "stderr"])
def test_script_writes_where_the_agent_writes(session: Terminal, stream: int) -> None:
    session.files.write_restore_script(f"restore_config $(readlink /proc/$$/fd/{stream})\n")
    mark = leave_domain(session)
    script = session.events.wait_for(target="restore_config", after=mark)
    assert script.args == (os.readlink(f"/proc/{session.agent.pid}/fd/{stream}"),)


@pytest.mark.real_time
def test_script_is_waited_for_by_the_clock_on_the_wall(session: Terminal) -> None:
    """Longer than the 30 s after which a child process is given up by default."""
    session.files.write_restore_script("sleep 31; restore_config\n")
    mark = push(session, EXIT)
    session.events.wait_for(target="identity", member="Set", after=mark, timeout=120)
    assert steps_seen(session, mark) == EXIT_STEPS


def test_script_leaves_a_child_that_does_not_hold_up_the_exit(session: Terminal) -> None:
    session.files.write_restore_script("sleep 600 & disown; restore_config\n")
    mark = leave_domain(session)
    assert steps_seen(session, mark) == EXIT_STEPS
