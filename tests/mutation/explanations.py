"""The survivors that are known, with the reason why no test can or should catch them."""

from __future__ import annotations

from pathlib import Path
from typing import Iterable, NamedTuple, Sequence

from tests.mutation.mutants import Mutant

FILE = Path(__file__).with_name("explained.txt")


class Key(NamedTuple):
    """A mutant as it is known over time: by its function and texts and not by its line."""

    place: str
    before: str
    after: str


def key_of(mutant: Mutant) -> Key:
    """The key of a mutant."""
    return Key(f"{mutant.file} {mutant.function}".rstrip(), mutant.before, mutant.after)


def stale(known: Iterable[Key], mutants: Sequence[Mutant]) -> list[Key]:
    """The keys that fit none of the mutants, though these are all of the key's file."""
    files = {mutant.file for mutant in mutants}
    existing = {key_of(mutant) for mutant in mutants}
    return [key for key in known if key.place.split()[0] in files and key not in existing]


def read(text: str) -> dict[Key, str]:
    """The reasons by mutant.

    An entry is a reason, then the mutants that it is for: each a line with the file and the function, one
    with "- " and the original, one with "+ " and the change. A blank line ends it. Lines with "#" are
    remarks.
    """
    found: dict[Key, str] = {}
    for entry in text.split("\n\n"):
        lines = [line for line in entry.splitlines() if line and not line.startswith("#")]
        changes = [place for place, line in enumerate(lines) if line.startswith("- ")]
        if not lines:
            continue
        if not changes:
            raise ValueError(f"no mutant is named: {lines[0]}")
        reason = " ".join(lines[: changes[0] - 1])
        for place in changes:
            key = Key(lines[place - 1], lines[place].removeprefix("- "), lines[place + 1].removeprefix("+ "))
            found[key] = reason
    return found
