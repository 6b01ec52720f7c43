"""The terminal leaves the domain: warning, restored desktop, reboot. Its script has tests of its own."""

from __future__ import annotations

import shutil
from pathlib import Path

import pytest

from sandbox.fakes.fault import Fault
from sandbox.machine import layout
from sandbox.machine.commands import Answer
from sandbox.policies import POLICIES
from sandbox.terminal import Terminal
from tests.e2e.domainexit import EXIT, EXIT_STEPS, leave_domain, restrictions, steps_seen
from tests.e2e.wire import Notification, comes_in_a_minute, forced_actions, next_notification, push, settled


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


def test_reboot_asks_for_no_password(session: Terminal) -> None:
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


def test_daemon_and_identity_service_are_called_after_the_policy_service_was_stopped(
    session: Terminal,
) -> None:
    session.commands.hold("systemctl")
    mark = push(session, EXIT)
    session.events.wait_for(target="systemctl", after=mark)
    session.receive_all()
    calls = session.events.all(source="velks", kind="call", after=mark)
    assert [call.target for call in calls] == ["notifications"]

    session.commands.release("systemctl")
    session.events.wait_for(target="identity", member="Set", after=mark)


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


def test_exit_without_backup_file_restores_an_empty_list(session: Terminal) -> None:
    Path("/etc/velk/config.ini").unlink()
    mark = leave_domain(session)
    assert steps_seen(session, mark) == EXIT_STEPS
    assert restrictions()["ControlCenterList"] == "@Invalid()"
    assert restrictions()["UsbTrayIconClickable"] == "true"


@pytest.mark.parametrize(
    "content", [b"", b"\0\xff\x80\n", b"{}", b"ControlCenterList=network\n", b"[config\n\xff"], ids=str
)
def test_backup_file_that_is_no_such_file_restores_an_empty_list(session: Terminal, content: bytes) -> None:
    session.files.write(layout.BACKUP_CONFIG, content)
    mark = leave_domain(session)
    assert steps_seen(session, mark) == EXIT_STEPS
    assert restrictions()["ControlCenterList"] == "@Invalid()"


@pytest.mark.parametrize("status", [1, 127])
def test_failing_systemctl_does_not_stop_the_exit(session: Terminal, status: int) -> None:
    session.commands.answer("systemctl", Answer(status))
    mark = leave_domain(session)
    assert steps_seen(session, mark) == EXIT_STEPS


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


def test_systemctl_that_hangs_delays_the_reboot_to_its_end(session: Terminal) -> None:
    session.commands.hold("systemctl")
    mark = push(session, EXIT)
    session.events.wait_for(target="systemctl", after=mark)

    session.jump(90)
    session.receive_all()
    assert session.events.all(target="daemon", after=mark) == []
    session.commands.release("systemctl")
    session.sync()
    session.sync()
    assert steps_seen(session, mark) == [*EXIT_STEPS, ("logind", "Reboot")]


@pytest.mark.parametrize("fault", [Fault.fail(), Fault.hang()], ids=lambda fault: fault.kind)
def test_identity_service_that_does_not_introspect_is_switched_off(session: Terminal, fault: Fault) -> None:
    session.identity.faults["Introspect"] = fault
    leave_domain(session)
    assert session.identity.value("Enable") is False


def test_hanging_identity_service_does_not_hold_up_the_agent(session: Terminal) -> None:
    session.identity.fault = Fault.hang()
    mark = leave_domain(session)
    assert steps_seen(session, mark) == EXIT_STEPS
    session.advance(60)
    assert forced_actions(session, mark) == ["Reboot"]


def test_absent_services_do_not_stop_the_exit(session: Terminal) -> None:
    session.identity.leave()
    session.notifications.leave()
    mark = push(session, EXIT)
    session.events.wait_for(target="daemon", member="onDomainConfig", after=mark)
    session.advance(60)
    assert forced_actions(session, mark) == ["Reboot"]


def test_failing_onDomainConfig_is_not_looked_at(session: Terminal) -> None:
    session.daemon.faults["onDomainConfig"] = Fault.hang()
    mark = leave_domain(session)
    assert steps_seen(session, mark) == EXIT_STEPS


def test_unwritable_home_does_not_stop_the_exit(session: Terminal) -> None:
    (Path.home() / ".config").write_text("a file where the folder should be")
    mark = leave_domain(session)
    assert steps_seen(session, mark) == EXIT_STEPS
