"""The commands of the prompt by name, and how a typed line becomes a call of one."""

from __future__ import annotations

import inspect
import shlex
from dataclasses import dataclass
from typing import Any, Callable, Mapping

from sandbox.prompt.context import Context, CommandRefused, guess

# What may be offered for an argument, each word with its meaning.
Choices = Callable[[Context], Mapping[str, str]]


@dataclass(frozen=True)
class Command:
    """One command: its name, the arguments it takes, what it does, and what may be offered for its first
    argument. `run` gets the context and the words after the name; it may return a line on what it did."""

    name: str
    arguments: str
    help: str
    choices: Choices
    run: Callable[..., str | None]

    @property
    def usage(self) -> str:
        """The command as it is typed."""
        return f"{self.name} {self.arguments}".rstrip()


COMMANDS: dict[str, Command] = {}


def command(
    name: str, arguments: str, help: str, choices: Choices = lambda context: {}
) -> Callable[[Callable[..., str | None]], Callable[..., str | None]]:
    """Make a function of the context and some words a command of the prompt."""

    def register(run: Callable[..., str | None]) -> Callable[..., str | None]:
        COMMANDS[name] = Command(name, arguments, help, choices, run)
        return run

    return register


def run_line(context: Context, line: str) -> None:
    """Carry out a typed line or raise CommandRefused. Empty lines and remarks ("#") do nothing."""
    name, _, rest = line.strip().partition(" ")
    if not name or name.startswith("#"):
        return
    if name not in COMMANDS:
        raise CommandRefused(f"there is no command '{name}'; {guess(name, COMMANDS) or 'see: help'}")
    known = COMMANDS[name]
    words = _words(rest.strip())
    try:
        call = inspect.signature(known.run).bind(context, *words)
    except TypeError:
        raise CommandRefused(f"usage: {known.usage}") from None
    told = known.run(*call.args)
    if told:
        context.tell(told)


def number(text: str, kind: Callable[[str], Any]) -> Any:
    """A word as a number of this kind."""
    try:
        return kind(text)
    except ValueError:
        raise CommandRefused(f"'{text}' is not a number") from None


def _words(rest: str) -> list[str]:
    """The arguments; one that begins with "{" is taken as it stands."""
    if rest.startswith("{"):
        return [rest]
    try:
        return shlex.split(rest)
    except ValueError as error:
        raise CommandRefused(f"cannot read the line: {error}") from None
