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
    by_default: bool = True


AREAS = (
    Area(
        f"{_FOLDER}message_transfer.cpp",
        "dispatcher",
        ("message_transfer_test",),
        (
            "startup",
            "start_order",
            "policies",
            "daemon_life",
            "session_state",
            "service_life",
            "hung_services",
        ),
        ("local_user", "startup"),
    ),
    Area(
        f"{_FOLDER}message_transfer.cpp",
        "dispatcher",
        ("message_transfer_test", "restore_configuration_test"),
        ("policies", "domain_exit", "restore_script", "hung_services"),
        functions=("leaveDomain", "restoreConfiguration", "rebootTime"),
    ),
    Area(
        f"{_FOLDER}domain_exit.cpp",
        "dispatcher",
        ("restore_configuration_test",),
        ("domain_exit", "restore_script", "hung_services"),
    ),
    Area(
        f"{_FOLDER}session_user.cpp",
        "state report",
        ("message_transfer_test",),
        ("startup", "session_state", "messages"),
        ("local_user",),
    ),
    Area(
        f"{_FOLDER}message_transfer.cpp",
        "state report",
        ("message_transfer_test",),
        ("startup", "start_order", "daemon_life", "session_state", "hung_services"),
        ("local_user", "startup"),
        ("statusOf", "readLoginUser", "startTimers", "reportAgain", "getUserState", "getScreenState"),
    ),
    Area(
        f"{_FOLDER}session_state.cpp",
        "state report",
        ("message_transfer_test",),
        ("startup", "daemon_life", "session_state", "service_life", "hung_services"),
        ("local_user", "startup"),
    ),
    Area(
        f"{_FOLDER}message_transfer.cpp",
        "uploads",
        ("message_transfer_test",),
        ("software_reports", "launcher_life", "start_order"),
        functions=("startSoftwareReports", "onSoftwareChanged", "uploadSoftware", "uploadSoftwareChange"),
    ),
    Area(
        f"{_FOLDER}session_policy.cpp", "dispatcher", ("session_policy_test",), ("policies",), ("local_user",)
    ),
    Area(
        f"{_FOLDER}message_platform.cpp",
        "message client",
        ("message_platform_test", "message_platform_poll_test", "message_platform_drain_test"),
        ("messages", "message_drain", "message_contents", "password", "platform_faults", "startup"),
        ("local_user", "startup", "platform_faults"),
    ),
    Area(
        f"{_FOLDER}follow_ups.cpp",
        "message client",
        ("follow_ups_test", "message_platform_drain_test"),
        ("message_drain",),
    ),
    Area(
        f"{_FOLDER}remote_object.cpp",
        "state report",
        ("remote_object_test",),
        ("session_state", "daemon_life", "domain_exit", "hung_services"),
    ),
    Area(f"{_FOLDER}software_report.cpp", "uploads", ("software_report_test",), ("software_reports",)),
    Area(
        f"{_FOLDER}launcher_guard.cpp",
        "uploads",
        ("launcher_guard_test", "desktop_arrival_test"),
        (
            "launcher_life",
            "software_reports",
            "inventory_files",
            "package_lookups",
            "package_tools",
            "package_tool_calls",
        ),
    ),
    Area(
        f"{_FOLDER}package_tool.cpp",
        "uploads",
        ("package_tool_test",),
        ("package_tools", "package_tool_calls"),
    ),
    Area(f"{_FOLDER}terminal_address.cpp", "uploads", ("terminal_address_test",), ("software_reports",)),
    Area(
        f"{_FOLDER}handleevent.cpp",
        "gateway",
        ("handleevent_notification_test", "handleevent_platform_test"),
        ("password", "messages", "policies", "message_contents"),
        by_default=False,
    ),
    Area(
        f"{_FOLDER}appopenspy.cpp",
        "applications",
        ("appopenspy_test", "desktop_arrival_test"),
        ("applications", "application_windows", "dock_life", "dock_faults"),
        by_default=False,
    ),
    Area(
        f"{_FOLDER}entryinfo.cpp",
        "applications",
        ("entryinfo_test",),
        ("application_windows", "applications", "dock_faults"),
        by_default=False,
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
