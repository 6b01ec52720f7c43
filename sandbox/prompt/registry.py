"""The commands of the prompt by name, and how a typed line becomes a call of one."""

from __future__ import annotations

import inspect
import shlex
from dataclasses import dataclass
from typing import Any, Callable, Mapping

from sandbox.prompt.desk import Desk, Refused, guess

# What may be offered for an argument, each word with its meaning.
Choices = Callable[[Desk], Mapping[str, str]]


@dataclass(frozen=True)
class Command:
    """One command: its name, the arguments it takes, what it does, and what may be offered for its first
    argument. `run` gets the desk and the words after the name; it may return a line on what it did."""

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
    name: str, arguments: str, help: str, choices: Choices = lambda desk: {}
) -> Callable[[Callable[..., str | None]], Callable[..., str | None]]:
    """Make a function of the desk and some words a command of the prompt."""

    def register(run: Callable[..., str | None]) -> Callable[..., str | None]:
        COMMANDS[name] = Command(name, arguments, help, choices, run)
        return run

    return register


def run_line(desk: Desk, line: str) -> None:
    """Carry out a typed line; raises Refused. An empty line and one that begins with "#" do nothing."""
    name, _, rest = line.strip().partition(" ")
    if not name or name.startswith("#"):
        return
    if name not in COMMANDS:
        raise Refused(f"there is no command '{name}'; {guess(name, COMMANDS) or 'see: help'}")
    known = COMMANDS[name]
    words = _words(rest.strip())
    try:
        call = inspect.signature(known.run).bind(desk, *words)
    except TypeError:
        raise Refused(f"usage: {known.usage}") from None
    told = known.run(*call.args)
    if told:
        desk.tell(told)


def number(text: str, kind: Callable[[str], Any]) -> Any:
    """A word as a number of this kind."""
    try:
        return kind(text)
    except ValueError:
        raise Refused(f"'{text}' is not a number") from None


def _words(rest: str) -> list[str]:
    """The arguments; one that begins with "{" is taken as it stands."""
    if rest.startswith("{"):
        return [rest]
    try:
        return shlex.split(rest)
    except ValueError as error:
        raise Refused(f"cannot read the line: {error}") from None
