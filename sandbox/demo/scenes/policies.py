"""The policies that the daemon pushes."""

from __future__ import annotations

from typing import Any, Mapping

from sandbox.bus.stranger import Stranger
from sandbox.demo.scene import (
    LOGOUT,
    NO_REBOOT,
    NOT_REALLY,
    NOTHING_FORWARDED,
    NOTHING_SHOWN,
    Expectation,
    Scene,
    Step,
    from_agent,
    notice,
)
from sandbox.fakes import daemon
from sandbox.machine.users import DOMAIN_USER as USER
from sandbox.policies import POLICIES
from sandbox.terminal import Terminal

_OTHER_UID = USER.uid + 1
_POLICY = '{"type":2101,"payload":{"wallpaper":"/usr/share/backgrounds/校园.jpg"}}'


def _push(policy: Mapping[str, Any] | str, *then: Expectation) -> Step:
    return Step(lambda terminal: terminal.daemon.push_policy(policy), then)


def _notice_of(code: int) -> Expectation:
    return notice(POLICIES[code].notice)


def _stranger_pushes(terminal: Terminal) -> None:
    args = ("stranger", '{"type":1201}')
    stranger = Stranger(terminal.system_bus)
    terminal.events.record("stranger", "*", "signal", "pushPolicyMsg", args)
    stranger.emit("/com/norix/velk/velkg", daemon.INTERFACE, "pushPolicyMsg", *args, signature="ss")
    # The bus replies after it has delivered the signal.
    stranger.call("org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus", "GetId")
    stranger.close()


FORWARDED = Scene(
    "A policy for the policy service",
    "The agent forwards other policies to the policy service, unchanged.",
    (_push(_POLICY, from_agent("the same text", "policy_service", "onPolicyMsg", _POLICY), NOTHING_SHOWN),),
)

NOTICES = Scene(
    "Shutdown and reboot notices",
    "The agent notifies the user; another program does the shutdown.",
    (
        _push({"type": 1300}, _notice_of(1300), NOTHING_FORWARDED),
        _push({"type": 1301}, _notice_of(1301), NOTHING_FORWARDED),
    ),
)

PASSWORD = Scene(
    "New password rules",
    "The agent asks a domain user to change the password.",
    (_push({"type": 1304}, _notice_of(1304), NOTHING_FORWARDED),),
)

ACCOUNT_DISABLED = Scene(
    "An account is disabled",
    f"First another user's (uid {_OTHER_UID}), which does not affect this session; then this user's.",
    (
        _push({"type": 1203, "payload": {"uid": _OTHER_UID}}, NOTHING_SHOWN, NOTHING_FORWARDED),
        _push(
            {"type": 1203, "payload": {"uid": USER.uid}},
            _notice_of(1203),
            LOGOUT,
            NOTHING_FORWARDED,
            NO_REBOOT,
        ),
    ),
    NOT_REALLY,
)

TERMINAL_DISABLED = Scene(
    "The terminal is disabled",
    "A warning, a minute to save all work, then the forced log-out.",
    (_push({"type": 1201}, _notice_of(1201), LOGOUT, NO_REBOOT),),
    NOT_REALLY,
)

STRANGER = Scene(
    "A stranger pushes a policy",
    "The agent obeys only the daemon; it ignores the same signal from any other program.",
    (Step(_stranger_pushes, (NOTHING_SHOWN, NOTHING_FORWARDED)),),
)
