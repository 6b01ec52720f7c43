"""What an activity is: a rule of hypothesis that a seed or a replay may choose as well."""

from __future__ import annotations

from dataclasses import dataclass
from random import Random
from typing import Any, Callable, Mapping, Sequence

from hypothesis.stateful import precondition, rule
from hypothesis.strategies import SearchStrategy, builds, integers, runner

_MANY = 2519  # one less than a multiple of every number of choices up to ten

Condition = Callable[[Any], bool]
Choices = Callable[[Any], Sequence[Any]]


@dataclass(frozen=True)
class Activity:
    """Something that can happen in a session if `when` says so of the model, and there is a choice for its
    argument, if it has one."""

    happen: Callable[..., None]
    when: Condition
    choices: Mapping[str, Choices]

    def possible(self, session: Any) -> bool:
        """Whether it can happen now."""
        return self.when(session.model) and all(choose(session.model) for choose in self.choices.values())

    def happen_at_random(self, session: Any, random: Random) -> None:
        """Let it happen, if it is possible, with what a seed chooses."""
        if self.possible(session):
            values = {name: random.choice(choose(session.model)) for name, choose in self.choices.items()}
            self.happen(session, **values)

    def replay(self, session: Any, argument: str) -> bool:
        """Let it happen with an argument of a history; whether that was possible."""
        if not self.possible(session) or bool(argument) != bool(self.choices):
            return False
        values = {
            name: next((value for value in choose(session.model) if str(value) == argument), None)
            for name, choose in self.choices.items()
        }
        if None in values.values():
            return False
        self.happen(session, **values)
        return True


def activity(when: Condition = lambda _: True, **choices: Choices) -> Any:
    """Make a method an activity, with at most one argument, which enters the history when it happens."""

    def decorate(method: Callable[..., None]) -> Any:
        def happen(session: Any, **values: Any) -> None:
            session.history.append(":".join((method.__name__, *map(str, values.values()))))
            method(session, **values)

        happen.__name__, happen.__doc__ = method.__name__, method.__doc__
        described = Activity(happen, when, choices)
        arguments: dict[str, Any] = {name: _strategy(choose) for name, choose in choices.items()}
        as_rule: Any = rule(**arguments)
        made = precondition(described.possible)(as_rule(happen))
        setattr(made, "activity", described)
        return made

    return decorate


def _strategy(choose: Choices) -> SearchStrategy[Any]:
    """The draw has the same range whatever the model holds, or hypothesis could drop few steps before it."""

    def pick(session: Any, number: int) -> Any:
        options = choose(session.model)
        return options[number % len(options)]

    return builds(pick, runner(), integers(0, _MANY))
