"""The ways in which a service can misbehave."""

from __future__ import annotations

from dataclasses import dataclass
from typing import Any, Literal

Kind = Literal["none", "hang", "fail", "slow", "hold"]


@dataclass(frozen=True)
class Fault:
    """How a service treats the calls that reach it: by default it answers at once.

    "hang" never answers; "fail" answers with an error and does nothing; "slow" answers after so many real
    seconds; "hold" keeps the calls until `Fake.release`.
    """

    kind: Kind = "none"
    error_name: str = "org.freedesktop.DBus.Error.Failed"
    seconds: float = 0.0


class FirstCalls(dict[str, Fault]):
    """Faults that apply only to the first call of each member or property."""

    def get(self, name: str, default: Any = None) -> Any:
        """The fault of a call; it is removed."""
        return self.pop(name, default)
