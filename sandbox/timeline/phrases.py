"""The wording of an event: its content and its meaning."""

from __future__ import annotations

import json
from typing import Any, Callable, Sized

from sandbox.events import Event
from sandbox.policies import POLICIES
from sandbox.timeline import translations

_LONGEST = 160
_NAMES = {
    "velks": "agent",
    "*": "everyone",
    "policy_service": "policy service",
    "identity": "identity service",
    "session_manager": "session manager",
    "screensaver": "screen saver",
    "restore_config": "restore script",
}


def who(name: str) -> str:
    """The displayed name of a participant."""
    return _NAMES.get(name, name)


def what(event: Event) -> str:
    """The event's content in one line."""
    known = _WHAT.get(event.member)
    text = known(event) if known else _WHAT_OF_KIND.get(event.kind, _call)(event)
    return text if len(text) <= _LONGEST else text[: _LONGEST - 1] + "…"


def meaning(event: Event) -> str:
    """The event's meaning; empty if the content is clear by itself."""
    if event.kind == "http":
        return translations.REQUESTS.get(event.member, "")
    known = _MEANING.get(event.member)
    return known(event.args) if known else ""


def _call(event: Event) -> str:
    return f"{event.member}({', '.join(_value(arg) for arg in event.args)})"


def _value(value: Any) -> str:
    return json.dumps(value, ensure_ascii=False, default=str)


def _notify(event: Event) -> str:
    actions = [f" [{label}]" for label in event.args[5][1::2]]
    return f"Notify “{event.args[3]}” “{event.args[4]}”{''.join(actions)}"


def _request(event: Event) -> str:
    """Leaves out the query, which is long and in the agent's log, and the body of the daemon's uploads, which
    the event before shows."""
    line, body = event.args
    method, target = line.split()[:2]
    path, query, _ = target.partition("?")
    shown = body.split() if event.source == "velks" else ()
    return " ".join((method, path + ("?…" if query else ""), *shown))


def _reply(event: Event) -> str:
    _, status, body = event.args
    unread = event.detail["headers"].get("X-Total-Count")
    return f"{status} {body}" if unread is None else f"{status}, {unread} unread"


def _property_change(event: Event) -> str:
    _, values, invalidated = event.args
    changes = [f"{name} = {_value(value)}" for name, value in values.items()]
    return ", ".join(changes + [f"{name} has changed" for name in invalidated])


_WHAT: dict[str, Callable[[Event], str]] = {
    "Notify": _notify,
    "pushPolicyMsg": lambda event: f"pushPolicyMsg {event.args[1]}",
    "onPolicyMsg": lambda event: f"onPolicyMsg {event.args[0]}",
    "PropertiesChanged": _property_change,
    "Get": lambda event: f"Get {event.args[1]}",
    "Set": lambda event: f"Set {event.args[1]} = {_value(event.args[2])}",
    "message": lambda event: f"message “{event.args[1]}” “{event.args[2]}”",
    "tip": lambda event: "no tip" if event.args[1] is None else f"tip “{event.args[1]}”",
    "sendAppOpenState": lambda event: f"sendAppOpenState {event.args[0]} “{event.args[1]}”",
    "ItemChanged": lambda event: f"ItemChanged {event.args[0]} “{event.args[1][1]}” {event.args[1][0]}",
    "onUploadFinished": lambda event: f"onUploadFinished {event.args[0].rpartition('/')[2]} {event.args[1]}",
    "tls": lambda event: f"no TLS connection: {event.args[0]}",
    "reply": _reply,
}
_WHAT_OF_KIND: dict[str, Callable[[Event], str]] = {
    "command": lambda event: " ".join((event.member, *event.args)),
    "file": lambda event: f"{event.member} = {event.args[0]}",
    "inbox": lambda event: f"“{event.member}” {', '.join(event.args)}",
    "life": lambda event: event.member,
    "log": lambda event: f"{event.member}: {event.args[0]}",
    "output": lambda event: str(event.args[0]),
    "http": _request,
    "upload": lambda event: f"no upload to {event.args[0]}: {event.args[1]}",
}


def _notice_meaning(args: tuple[Any, ...]) -> str:
    translation = translations.NOTICES.get(args[4], "")
    actions = [f"[{translations.ACTIONS.get(label, label)}]" for label in args[5][1::2]]
    return " ".join(filter(None, (translation, *actions)))


def _policy_meaning(args: tuple[Any, ...]) -> str:
    try:
        policy = json.loads(args[1])
        own = POLICIES.get(policy["type"])
        words = own.meaning if own else "a policy that the agent forwards"
        concerned = policy.get("payload", {}).get("uid")
    except (ValueError, KeyError, TypeError, AttributeError):
        return "not a policy"
    return words if concerned is None else f"{words}: uid {concerned}"


def _change_meaning(args: tuple[Any, ...]) -> str:
    _, values, _ = args
    return "; ".join(_new_value(name, value) for name, value in values.items())


def _new_value(name: str, value: Any) -> str:
    if name == "WindowInfos":
        return _window_count(value)
    if name == "Name":
        return translations.APPLICATIONS.get(value, "")
    return translations.CHANGES.get((name, value), "")


def _application_meaning(args: tuple[Any, ...]) -> str:
    state, name = args
    words = (translations.APPLICATION_STATES.get(state), translations.APPLICATIONS.get(name))
    return ": ".join(filter(None, words))


def _window_count(infos: Sized) -> str:
    return "1 window" if len(infos) == 1 else f"{len(infos)} windows"


_MEANING: dict[str, Callable[[tuple[Any, ...]], str]] = {
    "appears": lambda args: "on the bus",
    "leaves": lambda args: "off the bus",
    "UpdateUserInfo": lambda args: "whose session this is",
    "SendUserStatus": lambda args: translations.STATUSES.get(args[0], ""),
    "pushPolicyMsg": _policy_meaning,
    "pushOnlineMsg": lambda args: "asks all sessions to report themselves",
    "onPolicyMsg": lambda args: "forwarded to the policy service, which carries it out",
    "onDomainConfig": lambda args: "take the terminal out of the domain's configuration",
    "Notify": _notice_meaning,
    "PropertiesChanged": _change_meaning,
    "Get": lambda args: translations.PROPERTIES.get((args[0], args[1]), ""),
    "Set": lambda args: "switched off" if args[2] is False else "",
    "Terminate": lambda args: "forced log-out",
    "Reboot": lambda args: "forced reboot",
    "systemctl": lambda args: "the policy service is stopped for all users" if "stop" in args else "",
    "restore_config": lambda args: "what the daemon changed on the terminal is undone",
    "message": lambda args: f"for {args[0]}, from {args[3]}",
    "tip": lambda args: f"for {args[0]}: the password is about to expire" if args[1] else f"for {args[0]}",
    "EntryAdded": lambda args: "an application was added to the dock",
    "EntryRemoved": lambda args: "an application was removed from the dock",
    "WindowInfosChanged": lambda args: _window_count(args[0]),
    "NameChanged": lambda args: translations.APPLICATIONS.get(args[0], ""),
    "sendAppOpenState": _application_meaning,
    "GetAllItemInfos": lambda args: "which applications are installed?",
    "ItemChanged": lambda args: translations.ITEM_ACTIONS.get(args[0], ""),
    "GetMachineID": lambda args: "which terminal is this?",
    "onUploadFinished": lambda args: "for the platform; the daemon uploads it",
}
