"""What a scene of the tour consists of."""

from __future__ import annotations

from dataclasses import dataclass
from types import EllipsisType
from typing import Any, Callable

from sandbox.events import Event
from sandbox.terminal import Terminal


@dataclass(frozen=True)
class Expectation:
    """Something that must be seen after a step's cue, or must not.

    `args` are the first arguments; `...` there or as the member stands for any. It must come within `within`
    seconds of the agent's time, beyond the tour's patience. Where it is `forbidden`, `source`, `target` and
    `member` say what of.
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
        same_road = (event.source, event.target) == (self.source, self.target)
        same_road = same_road and self.member in (..., event.member)
        enough = len(event.args) >= len(self.args)
        return same_road and enough and all(want in (..., got) for want, got in zip(self.args, event.args))


@dataclass(frozen=True)
class Step:
    """A cue and what must follow it, each thing after the one before it if they come `in_order`.

    A step without a cue looks at what else follows the last cue before it.
    """

    cue: Callable[[Terminal], object] | None
    then: tuple[Expectation, ...]
    in_order: bool = False

    @property
    def wanted(self) -> list[Expectation]:
        """What must come."""
        return [expectation for expectation in self.then if not expectation.forbidden]


@dataclass(frozen=True)
class Scene:
    """A title, a sentence that explains, the steps one after the other, and a closing remark; `beforehand`
    does what must be done before the first scene."""

    title: str
    sentence: str
    steps: tuple[Step, ...]
    remark: str = ""
    beforehand: Callable[[Terminal], object] = lambda terminal: None

    @property
    def expectations(self) -> list[Expectation]:
        """Those of all steps."""
        return [expectation for step in self.steps for expectation in step.then]


def from_agent(words: str, target: str, member: str, *args: Any, within: int = 0) -> Expectation:
    """The agent says or does this."""
    return Expectation(words, "velks", target, member, args, within)


def never(words: str, target: str, member: str | EllipsisType) -> Expectation:
    """The agent does no such thing."""
    return Expectation(words, "velks", target, member, forbidden=True)


def notice(body: str, *actions: str, within: int = 0) -> Expectation:
    """The agent shows a reminder with this text and these actions (key, label, ...)."""
    args = (..., ..., ..., "提醒", body, list(actions))
    return Expectation(f"notification “{body}”", "velks", "notifications", "Notify", args, within)


def message_comes(title: str, content: str, within: int) -> tuple[Expectation, ...]:
    """The agent asks for a message of the platform, marks it read and shows it, in this order."""
    shown = (..., ..., ..., title, content, ["_open", "查看"])
    return (
        from_agent("a request for the next message", "platform", "list", within=within),
        from_agent("its receipt", "platform", "read", within=within),
        from_agent(f"notification “{title}” [查看]", "notifications", "Notify", *shown, within=within),
    )


NOTHING_SHOWN = never("no notification", "notifications", "Notify")
NOTHING_FORWARDED = never("nothing passed on to the policy service", "policy_service", "onPolicyMsg")
NOTHING_ASKED = never("nothing asked of the platform", "platform", ...)
NO_LOGOUT = never("no forced log-out", "logind", "Terminate")
NO_REBOOT = never("no forced reboot", "logind", "Reboot")

_MINUTE = 60
LOGOUT = from_agent("forced log-out after the minute", "logind", "Terminate", within=_MINUTE)
REBOOT = from_agent("forced reboot after the minute", "logind", "Reboot", within=_MINUTE)
NOT_REALLY = "The simulated login manager only takes note: the session goes on, and so does the tour."
