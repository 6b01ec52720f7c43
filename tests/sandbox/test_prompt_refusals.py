"""What the prompt refuses: each line with its reason, and without an effect."""

from __future__ import annotations

import pytest

from sandbox.terminal import FAKES
from tests.sandbox.recorded_context import RecordedContext

_POLICY = "usage: policy CODE [UID] | {JSON}"
_PLATFORM = "usage: platform up|down|hang|error STATUS|garbage|cut"
_NOT_ON_DOCK = "there is no application 'mail' on the dock; see: apps"
_NOT_INSTALLED = "mail is not installed; install it with: install mail VERSION"
_AWAY = "daemon is not on the bus; bring it back with: appear daemon"

# By what was typed before.
REFUSED = {
    "": {
        "reboot": "there is no command 'reboot'; see: help",
        "polcy 1300": "there is no command 'polcy'; did you mean policy?",
        "help instal": "there is no command 'instal'; did you mean install?",
        "policy": _POLICY,
        "policy 1203 20001 more": _POLICY,
        "policy soon": "'soon' is not a number",
        "policy 1203 zhang.wei": "'zhang.wei' is not a number",
        'policy "1203': "cannot read the line: No closing quotation",
        "lock now": "usage: lock",
        "saver maybe": "'maybe' is neither on nor off",
        "hang printer": f"there is no service 'printer'; there are: {', '.join(FAKES)}",
        "hang damon": "there is no service 'damon'; did you mean daemon?",
        "slow daemon": "usage: slow SERVICE SECONDS",
        "slow daemon long": "'long' is not a number",
        "appear daemon": "daemon is on the bus already",
        "message title": "usage: message TITLE CONTENT [SENDER]",
        "tip": "usage: tip TEXT|off",
        "platform": _PLATFORM,
        "platform ill": _PLATFORM,
        "platform error": _PLATFORM,
        "platform up 503": _PLATFORM,
        "platform error soon": "'soon' is not a number",
        "platform error 200": "200 is not an error status (400 to 599)",
        "advance 0": "cannot advance by 0 s (1 to 86400)",
        "advance -1": "cannot advance by -1 s (1 to 86400)",
        "advance 86401": "cannot advance by 86401 s (1 to 86400)",
        "open": "usage: open APPLICATION",
        "install mail": "usage: install PACKAGE VERSION",
        "install Editor 1": "no package can be called 'Editor'",
    },
    "open editor": {
        "close mail": _NOT_ON_DOCK,
        "windows mail 1": _NOT_ON_DOCK,
        "undock mail": _NOT_ON_DOCK,
        "windows editor many": "'many' is not a number",
        "windows editor -1": "an application cannot have -1 windows",
    },
    "install editor 2.1": {
        "install editor 3": "editor is installed already; install a new version with: update editor VERSION",
        "update mail 1": _NOT_INSTALLED,
        "uninstall mail": _NOT_INSTALLED,
    },
    "leave daemon": {
        line: _AWAY for line in ("policy 1300", "online", "advance 60", "leave daemon", "restart daemon")
    },
}


@pytest.mark.parametrize(
    ("before", "line"), [(before, line) for before, lines in REFUSED.items() for line in lines]
)
def test_what_cannot_be_done_is_refused_with_a_reason(
    context: RecordedContext, before: str, line: str
) -> None:
    context.run(before)

    assert context.refusal(line) == REFUSED[before][line]
