"""The ways in which a service can misbehave."""

from __future__ import annotations

from dataclasses import dataclass
from typing import Any, Literal

Kind = Literal["none", "hang", "fail", "slow", "hold"]


@dataclass(frozen=True)
class Fault:
    """How a service treats the calls that reach it."""

    kind: Kind
    error_name: str = ""
    seconds: float = 0.0

    @staticmethod
    def none() -> Fault:
        """Answer at once."""
        return Fault("none")

    @staticmethod
    def hang() -> Fault:
        """Never answer."""
        return Fault("hang")

    @staticmethod
    def fail(error_name: str = "org.freedesktop.DBus.Error.Failed") -> Fault:
        """Answer with an error and do nothing."""
        return Fault("fail", error_name=error_name)

    @staticmethod
    def slow(seconds: float) -> Fault:
        """Answer after so many real seconds."""
        return Fault("slow", seconds=seconds)

    @staticmethod
    def hold() -> Fault:
        """Keep the calls until `Fake.release`."""
        return Fault("hold")


class FirstCalls(dict[str, Fault]):
    """Faults that apply only to the first call of each member or property."""

    def get(self, name: str, default: Any = None) -> Any:
        """The fault of a call; it is removed."""
        return self.pop(name, default)
