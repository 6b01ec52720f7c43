"""Single changes to a C++ source: conditions and constants."""

from __future__ import annotations

import re
from dataclasses import dataclass
from typing import Iterator, NamedTuple

from tests.mutation.tokens import Token, tokens

_OPPOSITES = (("==", "!="), ("<", "<="), (">", ">="), ("&&", "||"), ("true", "false"))
_SWAPPED_TEXTS: dict[str, tuple[str, ...]] = {
    **{text: (other,) for pair in _OPPOSITES for text, other in (pair, pair[::-1])},
    "?": ("&& false ?", "|| true ?"),
}
# Those that do something else without blanks around them: templates, references.
_BETWEEN_BLANKS = ("<", ">", "&&", "?")
_REMARK = re.compile(r"(?<!:)//[^\n]*")
_FUNCTION = re.compile(
    r"^(?!namespace|using|struct|class|enum|const|inline)[^\s#/{}][^;]*?(\w+)\(", re.MULTILINE
)


@dataclass(frozen=True)
class Mutant:
    """A source file with one change. `before` and `after` are the lines that it touches, in one line each."""

    file: str
    line: int
    function: str
    before: str
    after: str
    content: str

    def __str__(self) -> str:
        return f"{self.file}:{self.line}: {self.before} → {self.after}"


class _Change(NamedTuple):
    start: int
    end: int
    text: str
    log: bool = False


def mutants(file: str, source: str) -> tuple[list[Mutant], int]:
    """All changes of a source that make sense, and the number of those left out because they only concern a
    log statement: those texts are held against the log catalogue."""
    all_tokens = tokens(source)
    changes = sorted([*_token_changes(source, all_tokens), *_negations(source, all_tokens)])
    chosen = [_mutant(file, source, change) for change in changes if not change.log]
    return chosen, len(changes) - len(chosen)


def _mutant(file: str, source: str, change: _Change) -> Mutant:
    begin = source.rfind("\n", 0, change.start) + 1
    end = source.find("\n", change.end)
    after = source[begin : change.start] + change.text + source[change.end : end]
    functions = [match[1] for match in _FUNCTION.finditer(source) if match.start() <= change.start]
    return Mutant(
        file,
        source.count("\n", 0, change.start) + 1,
        functions[-1] if functions else "",
        _in_a_line(source[begin:end]),
        _in_a_line(after),
        source[: change.start] + change.text + source[change.end :],
    )


def _in_a_line(text: str) -> str:
    return " ".join(_REMARK.sub("", text).split())


def _token_changes(source: str, all_tokens: list[Token]) -> Iterator[_Change]:
    for token in all_tokens:
        for text in _other_texts(source, token):
            yield _Change(token.start, token.end, text, token.log)


def _other_texts(source: str, token: Token) -> tuple[str, ...]:
    if token.kind == "number" and token.text.isdigit():
        return str(int(token.text) + 1), str(int(token.text) - 1)
    if token.kind == "string":
        empty = 'R"()"' if token.text.startswith("R") else '""'
        return () if token.text == empty else (empty,)
    if token.text == "!":
        return ("",)
    if token.text in _BETWEEN_BLANKS and not _is_between_blanks(source, token):
        return ()
    return _SWAPPED_TEXTS.get(token.text, ())


def _is_between_blanks(source: str, token: Token) -> bool:
    return source[token.start - 1].isspace() and source[token.end].isspace()


def _negations(source: str, all_tokens: list[Token]) -> Iterator[_Change]:
    """Negate whole conditions, except those that another change negates: a single comparison or "!"."""
    for place, token in enumerate(all_tokens):
        if token.text not in ("if", "while"):
            continue
        condition = _in_parentheses(all_tokens, place + 1)
        texts = [inner.text for inner in condition]
        comparisons = [text for text in texts if text in ("==", "!=")]
        is_simple = "&&" not in texts and "||" not in texts
        if is_simple and (comparisons or texts[0] == "!"):
            continue
        start, end = condition[0].start, condition[-1].end
        yield _Change(start, end, f"!({source[start:end]})", token.log)


def _in_parentheses(all_tokens: list[Token], opening: int) -> list[Token]:
    depth = 0
    for place in range(opening, len(all_tokens)):
        depth += {"(": 1, ")": -1}.get(all_tokens[place].text, 0)
        if depth == 0:
            return all_tokens[opening + 1 : place]
    raise ValueError("a parenthesis is never closed")
