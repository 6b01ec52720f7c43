"""The terminal leaves the domain: warning, restore script, restored desktop, reboot."""

from __future__ import annotations

import configparser
import os
import shutil
from pathlib import Path

import pytest

from sandbox.fakes.fault import Fault
from sandbox.machine import layout
from sandbox.machine.commands import Answer
from sandbox.terminal import Terminal
from wire import Notification, forced_actions, log_lines, next_notification, settled

EXIT = {"type": 1200}
WARNING = "当前终端已被管理员退域，1分钟后强制重启"
ON_SYSTEM_BUS = ("daemon", "identity", "logind")
ROAD = [
    ("notifications", "Notify"),
    ("restore_config", "restore_config"),
    ("systemctl", "systemctl"),
    ("daemon", "onDomainConfig"),
    ("identity", "Set"),
]


@pytest.fixture
def session(terminal: Terminal) -> Terminal:
    """A terminal whose agent is ready."""
    terminal.start_agent()
    return terminal


def leave_domain(session: Terminal) -> int:
    """Push the policy, wait for the sequence's last step; the result is the mark before it."""
    mark = session.events.mark()
    session.daemon.push_policy(EXIT)
    session.events.wait_for(target="identity", member="Set", after=mark)
    return mark


def road(session: Terminal, mark: int) -> list[tuple[str, str]]:
    """The steps of the exit that were seen from outside, in their order.

    The agent waits for each step but the calls on the system bus, which come last; their serial numbers tell
    in which order they were sent to different receivers.
    """
    steps = settled(session, mark)
    sent = sorted(
        (step for step in steps if step.target in ON_SYSTEM_BUS), key=lambda step: step.detail["serial"]
    )
    waited_for = [step for step in steps if step not in sent]
    return [(step.target, step.member) for step in waited_for + sent]


def restrictions() -> dict[str, str]:
    """The user's restriction switches as they stand in the file."""
    file = configparser.RawConfigParser()
    file.optionxform = str  # type: ignore[assignment]
    file.read(Path.home() / ".config" / "norix" / "desktop-control.ini")
    return dict(file["restrictions"])


def test_steps_come_in_their_order_and_the_reboot_after_a_minute(session: Terminal) -> None:
    mark = leave_domain(session)
    assert road(session, mark) == ROAD

    session.advance(59)
    assert forced_actions(session, mark) == []
    session.advance(1)
    assert forced_actions(session, mark) == ["Reboot"]


def test_warning_offers_the_reboot(session: Terminal) -> None:
    mark = leave_domain(session)
    assert next_notification(session, mark) == Notification(
        "提醒", 0, "velkw", "提醒", WARNING, ["_open", "重启"], {"x-norix-action-_open": "reboot"}, -1
    )


def test_reboot_asks_nobody_for_a_password(session: Terminal) -> None:
    mark = leave_domain(session)
    session.advance(60)
    call = session.events.wait_for(target="logind", member="Reboot", after=mark)
    assert call.detail["path"] == "/org/freedesktop/login1"
    assert call.detail["interface"] == "org.freedesktop.login1.Manager"
    assert call.args == (False,)


def test_commands_and_calls_carry_their_arguments(session: Terminal) -> None:
    mark = leave_domain(session)
    arguments = {event.target: event.args for event in settled(session, mark)}
    assert arguments["systemctl"] == ("--global", "stop", "prys")
    assert arguments["daemon"] == ("remove",)
    assert arguments["identity"] == ("com.norix.velk.iam", "Enable", False)


def test_daemon_and_identity_service_are_told_after_the_policy_service_was_stopped(session: Terminal) -> None:
    session.commands.hold("systemctl")
    mark = session.events.mark()
    session.daemon.push_policy(EXIT)
    session.events.wait_for(target="systemctl", after=mark)
    session.receive_all()
    told = session.events.all(source="velks", kind="call", after=mark)
    assert [call.target for call in told] == ["notifications"]

    session.commands.release("systemctl")
    session.events.wait_for(target="identity", member="Set", after=mark)


def test_identity_service_is_switched_off(session: Terminal) -> None:
    leave_domain(session)
    assert session.identity.value("Enable") is False


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
    assert road(session, mark) == ROAD
    assert restrictions() == first


def test_exit_without_backup_file_restores_an_empty_list(session: Terminal) -> None:
    Path("/etc/velk/config.ini").unlink()
    mark = leave_domain(session)
    assert road(session, mark) == ROAD
    assert restrictions()["ControlCenterList"] == "@Invalid()"
    assert restrictions()["UsbTrayIconClickable"] == "true"


@pytest.mark.parametrize(
    "content",
    [b"", b"\0\xff\x80\n", b"{}", b"ControlCenterList=network\n", b"[config\n\xff"],
    ids=str,
)
def test_backup_file_that_is_no_such_file_restores_an_empty_list(session: Terminal, content: bytes) -> None:
    session.files.write(layout.BACKUP_CONFIG, content)
    mark = leave_domain(session)
    assert road(session, mark) == ROAD
    assert restrictions()["ControlCenterList"] == "@Invalid()"


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
    mark = session.events.mark()
    session.daemon.push_policy(EXIT)
    session.events.wait_for(target="restore_config", after=mark)

    session.jump(90)
    assert session.events.all(target="systemctl", after=mark) == []
    session.commands.release("restore_config")
    session.sync()
    session.sync()
    assert road(session, mark) == [*ROAD, ("logind", "Reboot")]


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
    mark = session.events.mark()
    session.daemon.push_policy(EXIT)
    session.events.wait_for(target="identity", member="Set", after=mark, timeout=120)
    assert road(session, mark) == ROAD


def test_script_leaves_a_child_that_does_not_hold_up_the_exit(session: Terminal) -> None:
    session.files.write_restore_script("sleep 600 & disown; restore_config\n")
    mark = leave_domain(session)
    assert road(session, mark) == ROAD


@pytest.mark.parametrize("status", [1, 127])
def test_failing_systemctl_does_not_stop_the_exit(session: Terminal, status: int) -> None:
    session.commands.answer("systemctl", Answer(status))
    mark = leave_domain(session)
    assert road(session, mark) == ROAD


def test_missing_systemctl_does_not_stop_the_exit(terminal: Terminal, tmp_path: Path) -> None:
    for program in ("bash", "restore_config"):
        found = shutil.which(program)
        assert found
        (tmp_path / program).symlink_to(found)
    terminal.start_agent(extra_env={"PATH": str(tmp_path)})
    mark = leave_domain(terminal)
    shell_complains = ("log", "")
    assert road(terminal, mark) == [shell_complains if step[0] == "systemctl" else step for step in ROAD]
    terminal.advance(60)
    assert forced_actions(terminal, mark) == ["Reboot"]


def test_systemctl_that_hangs_delays_the_reboot_to_its_end(session: Terminal) -> None:
    session.commands.hold("systemctl")
    mark = session.events.mark()
    session.daemon.push_policy(EXIT)
    session.events.wait_for(target="systemctl", after=mark)

    session.jump(90)
    session.receive_all()
    assert session.events.all(target="daemon", after=mark) == []
    session.commands.release("systemctl")
    session.sync()
    session.sync()
    assert road(session, mark) == [*ROAD, ("logind", "Reboot")]


@pytest.mark.parametrize("fault", [Fault.fail(), Fault.hang()], ids=lambda fault: fault.kind)
def test_identity_service_that_does_not_introspect_is_switched_off(session: Terminal, fault: Fault) -> None:
    session.identity.faults["Introspect"] = fault
    leave_domain(session)
    assert session.identity.value("Enable") is False


def test_hanging_identity_service_does_not_hold_up_the_agent(session: Terminal) -> None:
    session.identity.fault = Fault.hang()
    mark = leave_domain(session)
    assert road(session, mark) == ROAD
    session.advance(60)
    assert forced_actions(session, mark) == ["Reboot"]


def test_absent_services_do_not_stop_the_exit(session: Terminal) -> None:
    session.identity.leave()
    session.notifications.leave()
    mark = session.events.mark()
    session.daemon.push_policy(EXIT)
    session.events.wait_for(target="daemon", member="onDomainConfig", after=mark)
    session.advance(60)
    assert forced_actions(session, mark) == ["Reboot"]


def test_failing_onDomainConfig_is_not_looked_at(session: Terminal) -> None:
    session.daemon.faults["onDomainConfig"] = Fault.hang()
    mark = leave_domain(session)
    assert road(session, mark) == ROAD


def test_unwritable_home_does_not_stop_the_exit(session: Terminal) -> None:
    (Path.home() / ".config").write_text("a file where the folder should be")
    mark = leave_domain(session)
    assert road(session, mark) == ROAD
