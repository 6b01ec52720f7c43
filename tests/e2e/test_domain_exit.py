"""The terminal leaves the domain: warning, restored desktop, reboot, and the script in between."""

from __future__ import annotations

import configparser
import os
import shutil
from pathlib import Path
from typing import Callable

import pytest

from sandbox.fakes.base import Fake
from sandbox.fakes.fault import Fault
from sandbox.machine import layout
from sandbox.machine.commands import Answer
from sandbox.policies import POLICIES
from sandbox.terminal import Terminal
from tests.e2e.wire import (
    Notification,
    comes_in_a_minute,
    forced_actions,
    log_lines,
    next_notification,
    push,
    settled,
)

EXIT = {"type": 1200}
ON_SYSTEM_BUS = ("daemon", "identity", "logind")
EXIT_STEPS = [
    ("notifications", "Notify"),
    ("restore_config", "restore_config"),
    ("systemctl", "systemctl"),
    ("daemon", "onDomainConfig"),
    ("identity", "Set"),
]


def leave_domain(session: Terminal) -> int:
    """Push the policy, wait for the sequence's last step; the result is the mark before it."""
    mark = push(session, EXIT)
    session.events.wait_for(target="identity", member="Set", after=mark)
    return mark


def steps_seen(session: Terminal, mark: int) -> list[tuple[str, str]]:
    """The steps of the exit that were seen from outside, in their order.

    The agent waits for each step but the calls on the system bus, which come last; their serial numbers
    show in which order they were sent to different receivers.
    """
    steps = settled(session, mark)
    sent = sorted(
        (step for step in steps if step.target in ON_SYSTEM_BUS), key=lambda step: step.detail["serial"]
    )
    waited_for = [step for step in steps if step not in sent]
    return [(step.target, step.member) for step in waited_for + sent]


def restrictions() -> dict[str, str]:
    """The user's restriction switches in the file."""
    file = configparser.RawConfigParser()
    file.optionxform = str  # type: ignore[assignment]
    file.read(Path.home() / ".config" / "norix" / "desktop-control.ini")
    return dict(file["restrictions"])


def test_steps_come_in_their_order_and_the_reboot_after_a_minute(session: Terminal) -> None:
    mark = leave_domain(session)
    assert steps_seen(session, mark) == EXIT_STEPS

    comes_in_a_minute(session, "Reboot", mark)


def test_warning_offers_the_reboot(session: Terminal) -> None:
    mark = leave_domain(session)
    assert next_notification(session, mark) == Notification(
        "提醒",
        0,
        "velkw",
        "提醒",
        POLICIES[1200].notice,
        ["_open", "重启"],
        {"x-norix-action-_open": "reboot"},
        -1,
    )


def test_commands_and_calls_carry_their_arguments(session: Terminal) -> None:
    mark = leave_domain(session)
    arguments = {event.target: event.args for event in settled(session, mark)}
    assert arguments["systemctl"] == ("--global", "stop", "prys")
    assert arguments["daemon"] == ("remove",)
    assert arguments["identity"] == ("com.norix.velk.iam", "Enable", False)


def test_desktop_gets_its_unrestricted_state_back(session: Terminal) -> None:
    leave_domain(session)
    assert restrictions() == {
        "ControlCenterList": "network, display, sound",
        "ControlCenterExtra": "",
        "HotspotEnable": "1",
        "ShortcutKeyEnable": "true",
        "LauncherDisplayable": "true",
        "TaskbarRightclickMenuEnable": "true",
        "ResidentTaskbarAppDisplayable": "true",
        "RecycleBinDisplayable": "true",
        "WebTrayIconClickable": "true",
        "UsbTrayIconClickable": "true",
    }


def test_second_exit_restores_the_same_state_again(session: Terminal) -> None:
    leave_domain(session)
    first = restrictions()
    mark = leave_domain(session)
    assert steps_seen(session, mark) == EXIT_STEPS
    assert restrictions() == first


@pytest.mark.parametrize(
    "content", [None, b"", b"\0\xff\x80\n", b"{}", b"ControlCenterList=network\n", b"[config\n\xff"], ids=str
)
def test_exit_without_a_sound_backup_file_restores_an_empty_list(
    session: Terminal, content: bytes | None
) -> None:
    if content is None:
        layout.BACKUP_CONFIG.unlink()
    else:
        session.files.write(layout.BACKUP_CONFIG, content)
    mark = leave_domain(session)
    assert steps_seen(session, mark) == EXIT_STEPS
    assert restrictions()["ControlCenterList"] == "@Invalid()"
    assert restrictions()["UsbTrayIconClickable"] == "true"


def answer_nothing(fake: Fake) -> None:
    """Answer nothing."""
    fake.fault = Fault("hang")


HINDRANCES: dict[str, Callable[[Terminal], object]] = {
    "systemctl fails": lambda terminal: terminal.commands.answer("systemctl", Answer(1)),
    "systemctl cannot be run": lambda terminal: terminal.commands.answer("systemctl", Answer(127)),
    "the identity service hangs": lambda terminal: answer_nothing(terminal.identity),
    "the daemon hangs": lambda terminal: answer_nothing(terminal.daemon),
    "settings cannot be written": lambda _: (Path.home() / ".config").write_text("no folder"),
}


@pytest.mark.parametrize("happen", HINDRANCES.values(), ids=HINDRANCES)
def test_hindrance_does_not_stop_the_exit(session: Terminal, happen: Callable[[Terminal], object]) -> None:
    happen(session)
    mark = leave_domain(session)
    assert steps_seen(session, mark) == EXIT_STEPS
    session.advance(60)
    assert forced_actions(session, mark) == ["Reboot"]


def test_missing_systemctl_does_not_stop_the_exit(terminal: Terminal, tmp_path: Path) -> None:
    for program in ("bash", "restore_config"):
        found = shutil.which(program)
        assert found
        (tmp_path / program).symlink_to(found)
    terminal.start_agent(extra_env={"PATH": str(tmp_path)})
    mark = leave_domain(terminal)
    shell_complains = ("log", "")
    assert steps_seen(terminal, mark) == [
        shell_complains if step[0] == "systemctl" else step for step in EXIT_STEPS
    ]
    terminal.advance(60)
    assert forced_actions(terminal, mark) == ["Reboot"]


@pytest.mark.parametrize("held", ["restore_config", "systemctl"])
def test_command_that_takes_longer_than_the_minute_delays_all_that_follows(
    session: Terminal, held: str
) -> None:
    session.commands.hold(held)
    mark = push(session, EXIT)
    session.events.wait_for(target=held, after=mark)

    session.jump(90)
    session.receive_all()
    done = [event.target for event in session.events.all(source="velks", after=mark) if event.kind != "log"]
    names = [name for name, _ in EXIT_STEPS]
    assert done == names[: names.index(held) + 1]
    session.commands.release(held)
    session.sync()
    session.sync()
    assert steps_seen(session, mark) == [*EXIT_STEPS, ("logind", "Reboot")]


@pytest.mark.parametrize("fault", [Fault("fail"), Fault("hang")], ids=lambda fault: fault.kind)
def test_identity_service_that_does_not_introspect_is_switched_off(session: Terminal, fault: Fault) -> None:
    session.identity.faults["Introspect"] = fault
    leave_domain(session)
    assert session.identity.value("Enable") is False


def test_absent_services_do_not_stop_the_exit(session: Terminal) -> None:
    session.identity.leave()
    session.notifications.leave()
    mark = push(session, EXIT)
    session.events.wait_for(target="daemon", member="onDomainConfig", after=mark)
    session.advance(60)
    assert forced_actions(session, mark) == ["Reboot"]


def test_script_path_is_logged(session: Terminal) -> None:
    mark = leave_domain(session)
    assert 'onPolicyMsg ----strPath: "/usr/share/velk/scripts/restore_config.bash"' in log_lines(
        session, mark
    )


@pytest.mark.parametrize(
    "script",
    [
        None,
        "exit 1\n",
        "kill -9 $$\n",
        "syntax error (\n",
        "cat /nowhere >&2\n",
        "printf 'a long line\\n%.0s' {1..20000}\n",
    ],
)
def test_missing_failing_or_noisy_script_does_not_stop_the_exit(
    session: Terminal, script: str | None
) -> None:
    if script is None:
        layout.RESTORE_SCRIPT.unlink()
    else:
        session.files.write_restore_script(script)
    mark = leave_domain(session)
    session.advance(60)
    assert forced_actions(session, mark) == ["Reboot"]


def test_script_that_reads_its_input_finds_its_end_at_once(session: Terminal) -> None:
    session.files.write_restore_script('read -r line; restore_config "status $?" "$(cat)"\n')
    mark = leave_domain(session)
    script = session.events.wait_for(target="restore_config", after=mark)
    assert script.args == ("status 1", "")


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
