"""What a scene of the tour consists of."""

from __future__ import annotations

from dataclasses import dataclass
from typing import Any, Callable

from sandbox.events import Event
from sandbox.terminal import Terminal


@dataclass(frozen=True)
class Expectation:
    """Something that must be seen after a step's cue, or must not.

    `args` are the first arguments, `...` for any value. It must come within `within` seconds of the agent's
    time, beyond the tour's patience. Where it is `forbidden`, `source`, `target` and `member` say what of.
    """

    words: str
    source: str
    target: str
    member: str
    args: tuple[Any, ...] = ()
    within: int = 0
    forbidden: bool = False

    def matches(self, event: Event) -> bool:
        """Whether an event is the expected or forbidden one."""
        same_road = (event.source, event.target, event.member) == (self.source, self.target, self.member)
        enough = len(event.args) >= len(self.args)
        return same_road and enough and all(want in (..., got) for want, got in zip(self.args, event.args))


@dataclass(frozen=True)
class Step:
    """A cue and what must follow it."""

    cue: Callable[[Terminal], object]
    then: tuple[Expectation, ...]


@dataclass(frozen=True)
class Scene:
    """A title, a sentence that explains, the steps one after the other, and a closing remark."""

    title: str
    sentence: str
    steps: tuple[Step, ...]
    remark: str = ""

    @property
    def expectations(self) -> list[Expectation]:
        """Those of all steps."""
        return [expectation for step in self.steps for expectation in step.then]


def from_agent(words: str, target: str, member: str, *args: Any, within: int = 0) -> Expectation:
    """The agent says or does this."""
    return Expectation(words, "velks", target, member, args, within)


def never(words: str, target: str, member: str) -> Expectation:
    """The agent does no such thing."""
    return Expectation(words, "velks", target, member, forbidden=True)


def notice(body: str, *actions: str) -> Expectation:
    """The agent shows a reminder with this text and these actions (key, label, ...)."""
    args = (..., ..., ..., "提醒", body, list(actions))
    return Expectation(f"notification “{body}”", "velks", "notifications", "Notify", args)


NOTHING_SHOWN = never("no notification", "notifications", "Notify")
NOTHING_FORWARDED = never("nothing passed on to the policy service", "policy_service", "onPolicyMsg")
NO_LOGOUT = never("no forced log-out", "logind", "Terminate")
NO_REBOOT = never("no forced reboot", "logind", "Reboot")

_MINUTE = 60
LOGOUT = from_agent("forced log-out after the minute", "logind", "Terminate", within=_MINUTE)
REBOOT = from_agent("forced reboot after the minute", "logind", "Reboot", within=_MINUTE)
NOT_REALLY = "The simulated login manager only takes note: the session goes on, and so does the tour."
