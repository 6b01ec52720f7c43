"""The parts of a scene, and expectations that scenes share."""

from __future__ import annotations

from dataclasses import dataclass
from types import EllipsisType
from typing import Any, Callable

from sandbox.events import Event
from sandbox.terminal import Terminal


@dataclass(frozen=True)
class Expectation:
    """An event that must follow a step's cue, or must not if it is `forbidden`.

    `args` are the event's first arguments; `...` as an argument or as the member matches anything. The event
    must come `within` seconds of the agent's time, plus the tour's patience.
    """

    words: str
    source: str
    target: str
    member: str | EllipsisType
    args: tuple[Any, ...] = ()
    within: int = 0
    forbidden: bool = False

    def matches(self, event: Event) -> bool:
        """Whether an event is the expected or forbidden one."""
        same_route = (event.source, event.target) == (self.source, self.target)
        same_route = same_route and self.member in (..., event.member)
        enough = len(event.args) >= len(self.args)
        return same_route and enough and all(want in (..., got) for want, got in zip(self.args, event.args))


@dataclass(frozen=True)
class Step:
    """A cue and the expectations that follow it, `in_order` or in any order.

    A step without a cue continues with the events since the last cue.
    """

    cue: Callable[[Terminal], object] | None
    then: tuple[Expectation, ...]
    in_order: bool = False

    @property
    def wanted(self) -> list[Expectation]:
        """The events that must come."""
        return [expectation for expectation in self.then if not expectation.forbidden]


@dataclass(frozen=True)
class Scene:
    """A title, an explanation, steps and a closing remark; `beforehand` runs before the first scene."""

    title: str
    sentence: str
    steps: tuple[Step, ...]
    remark: str = ""
    beforehand: Callable[[Terminal], object] = lambda terminal: None


def from_agent(words: str, target: str, member: str, *args: Any, within: int = 0) -> Expectation:
    """The agent must send this to `target`."""
    return Expectation(words, "velks", target, member, args, within)


def never(words: str, target: str, member: str | EllipsisType) -> Expectation:
    """The agent must not send this to `target`."""
    return Expectation(words, "velks", target, member, forbidden=True)


def notice(body: str, *actions: str, within: int = 0) -> Expectation:
    """The agent must show a reminder with this text and these actions (key, label, ...)."""
    args = (..., ..., ..., "提醒", body, list(actions))
    return Expectation(f"notification “{body}”", "velks", "notifications", "Notify", args, within)


def message_comes(title: str, content: str, within: int) -> tuple[Expectation, ...]:
    """The agent must request a message from the platform, mark it read and show it, in this order."""
    shown = (..., ..., ..., title, content, ["_open", "查看"])
    return (
        from_agent("a request for the next message", "platform", "list", within=within),
        from_agent("its read receipt", "platform", "read", within=within),
        from_agent(f"notification “{title}” [查看]", "notifications", "Notify", *shown, within=within),
    )


NOTHING_SHOWN = never("no notification", "notifications", "Notify")
NOTHING_FORWARDED = never("nothing forwarded to the policy service", "policy_service", "onPolicyMsg")
NOTHING_ASKED = never("no request to the platform", "platform", ...)
NO_LOGOUT = never("no forced log-out", "logind", "Terminate")
NO_REBOOT = never("no forced reboot", "logind", "Reboot")

_MINUTE = 60
LOGOUT = from_agent("forced log-out after the minute", "logind", "Terminate", within=_MINUTE)
REBOOT = from_agent("forced reboot after the minute", "logind", "Reboot", within=_MINUTE)
NOT_REALLY = "The simulated login manager only records this: the session and the tour continue."
