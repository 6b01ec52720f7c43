"""The prompt's commands by name, and the parsing of a typed line."""

from __future__ import annotations

import inspect
import shlex
from dataclasses import dataclass
from typing import Any, Callable, Mapping

from rich.text import Text

from sandbox.prompt.context import Context, CommandRefused, guess

# The possible values of an argument, each with its meaning.
Choices = Callable[[Context], Mapping[str, str]]


@dataclass(frozen=True)
class Command:
    """A command, with the choices for its first argument. `run` takes the context and the words after the
    name; it may return a line that states the result. Its docstring is part of the help."""

    name: str
    arguments: str
    help: str
    choices: Choices
    run: Callable[..., str | None]

    @property
    def usage(self) -> str:
        """The command with its arguments."""
        return f"{self.name} {self.arguments}".rstrip()


COMMANDS: dict[str, Command] = {}


def command(
    name: str, arguments: str, help: str, choices: Choices = lambda context: {}
) -> Callable[[Callable[..., str | None]], Callable[..., str | None]]:
    """Register a function as a command."""

    def register(run: Callable[..., str | None]) -> Callable[..., str | None]:
        COMMANDS[name] = Command(name, arguments, help, choices, run)
        return run

    return register


def run_line(context: Context, line: str) -> None:
    """Run a typed line; raises CommandRefused. Empty lines and comments ("#") do nothing."""
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
    result = known.run(*call.args)
    if result:
        context.show(Text(result, "dim"))


def number(text: str, kind: Callable[[str], Any]) -> Any:
    """Parse a word as a number."""
    try:
        return kind(text)
    except ValueError:
        raise CommandRefused(f"'{text}' is not a number") from None


def _words(rest: str) -> list[str]:
    """Split the arguments; a text that begins with "{" is a single one."""
    if rest.startswith("{"):
        return [rest]
    try:
        return shlex.split(rest)
    except ValueError as error:
        raise CommandRefused(f"cannot read the line: {error}") from None
