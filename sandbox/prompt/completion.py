"""Tab completion at the prompt: commands and their arguments, each shown with its meaning."""

from __future__ import annotations

from typing import Iterator, Mapping

from prompt_toolkit.completion import CompleteEvent, Completer, Completion
from prompt_toolkit.document import Document

from sandbox.prompt.context import Context
from sandbox.prompt.registry import COMMANDS


class CommandCompleter(Completer):
    """Completes the first word to a command, and the second to one of the command's choices."""

    def __init__(self, context: Context) -> None:
        self._context = context

    def get_completions(self, document: Document, _event: CompleteEvent) -> Iterator[Completion]:
        """The possible completions of the line's last word."""
        *before, begun = document.text_before_cursor.split(" ")
        for word, meaning in self._offered(before).items():
            if word.startswith(begun):
                yield Completion(word, -len(begun), display_meta=meaning)

    def _offered(self, before: list[str]) -> Mapping[str, str]:
        if not before:
            return {name: known.help for name, known in COMMANDS.items()}
        if len(before) == 1 and before[0] in COMMANDS:
            return COMMANDS[before[0]].choices(self._context)
        return {}
