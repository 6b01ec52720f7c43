"""Which tests are to catch the mutants of which source, and what part of the agent it belongs to."""

from __future__ import annotations

from dataclasses import dataclass
from fnmatch import fnmatch
from typing import Sequence

_FOLDER = "src/velk/velks/"


@dataclass(frozen=True)
class Area:
    """Functions of a source file that belong to a component; without any, those that no other area of the
    file names. `unit` names unit tests, `e2e` modules of tests/e2e, the quick ones first, `local` those with
    tests for a local user."""

    file: str
    component: str
    unit: tuple[str, ...] = ()
    e2e: tuple[str, ...] = ()
    local: tuple[str, ...] = ()
    functions: tuple[str, ...] = ()

    @property
    def by_default(self) -> bool:
        """Whether its component is among the most important ones."""
        return self.component not in ("gateway", "applications")


def _area(file: str, component: str, **words: str) -> Area:
    return Area(_FOLDER + file, component, **{name: tuple(known.split()) for name, known in words.items()})


AREAS = (
    _area(
        "message_transfer.cpp",
        "dispatcher",
        unit="message_transfer_test",
        e2e="daemon_life start_order policies session_state service_life hung_services",
        local="local_user daemon_life",
    ),
    _area(
        "message_transfer.cpp",
        "dispatcher",
        unit="message_transfer_test restore_configuration_test",
        e2e="policies domain_exit hung_services",
        functions="leaveDomain restoreConfiguration rebootTime",
    ),
    _area(
        "domain_exit.cpp",
        "dispatcher",
        unit="restore_configuration_test",
        e2e="domain_exit hung_services",
    ),
    _area(
        "session_user.cpp",
        "state report",
        unit="message_platform_test",
        e2e="daemon_life session_state messages",
        local="local_user",
    ),
    _area(
        "message_transfer.cpp",
        "state report",
        unit="message_transfer_test",
        e2e="daemon_life start_order session_state hung_services",
        local="local_user daemon_life",
        functions="statusOf readLoginUser startTimers reportAgain getUserState getScreenState",
    ),
    _area(
        "session_state.cpp",
        "state report",
        unit="message_transfer_test",
        e2e="daemon_life session_state service_life hung_services",
        local="local_user daemon_life",
    ),
    _area(
        "message_transfer.cpp",
        "uploads",
        unit="message_transfer_test",
        e2e="software_reports launcher_life start_order",
        functions="startSoftwareReports onSoftwareChanged uploadSoftware uploadSoftwareChange",
    ),
    _area("session_policy.cpp", "dispatcher", unit="session_policy_test", e2e="policies", local="local_user"),
    _area(
        "message_platform.cpp",
        "message client",
        unit="message_platform_test message_platform_poll_test message_platform_drain_test",
        e2e="messages message_drain message_contents password platform_faults daemon_life",
        local="local_user daemon_life platform_faults",
    ),
    _area(
        "follow_ups.cpp",
        "message client",
        unit="follow_ups_test message_platform_drain_test",
        e2e="message_drain",
    ),
    _area(
        "remote_object.cpp",
        "state report",
        unit="remote_object_test",
        e2e="session_state daemon_life domain_exit hung_services",
    ),
    _area("software_report.cpp", "uploads", unit="software_report_test", e2e="software_reports"),
    _area(
        "launcher_guard.cpp",
        "uploads",
        unit="launcher_guard_test desktop_arrival_test",
        e2e="launcher_life software_reports inventory_files package_lookups package_tools",
    ),
    _area("package_tool.cpp", "uploads", unit="package_tool_test", e2e="package_tools"),
    _area("terminal_address.cpp", "uploads", unit="terminal_address_test", e2e="software_reports"),
    _area(
        "handleevent.cpp",
        "gateway",
        unit="handleevent_notification_test handleevent_platform_test",
        e2e="password messages policies message_contents",
    ),
    _area(
        "appopenspy.cpp",
        "applications",
        unit="appopenspy_test desktop_arrival_test",
        e2e="applications application_windows dock_life dock_faults",
    ),
    _area(
        "entryinfo.cpp",
        "applications",
        unit="entryinfo_test",
        e2e="application_windows applications dock_faults",
    ),
)


def chosen(patterns: Sequence[str]) -> list[Area]:
    """The areas whose file a pattern fits, by default those of the most important components; ValueError for
    a pattern that fits none."""
    for pattern in patterns:
        if not any(_fits(area, pattern) for area in AREAS):
            raise ValueError(f"no tests are known for {pattern}; see tests/mutation/areas.py")
    if not patterns:
        return [area for area in AREAS if area.by_default]
    return [area for area in AREAS if any(_fits(area, pattern) for pattern in patterns)]


def area_of(file: str, function: str) -> Area:
    """The area that a function belongs to."""
    areas = [area for area in AREAS if area.file == file]
    naming = [area for area in areas if function in area.functions]
    return naming[0] if naming else next(area for area in areas if not area.functions)


def _fits(area: Area, pattern: str) -> bool:
    return fnmatch(area.file, pattern) or fnmatch(area.file, f"*/{pattern}")
