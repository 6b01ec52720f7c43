"""C++ sources cut into tokens and statements, as far as single changes to them need it."""

from __future__ import annotations

import re
from dataclasses import dataclass, field

_TOKEN = re.compile(
    r"""(?P<blank>\s+)
      | (?P<comment>//[^\n]*|/\*.*?\*/)
      | (?P<directive>(?<=\n)\#[^\n]*|\A\#[^\n]*)
      | (?P<string>R"(?P<delimiter>[^()\s\\]*)\(.*?\)(?P=delimiter)"|"(?:\\.|[^"\\\n])*")
      | (?P<character>'(?:\\.|[^'\\])+')
      | (?P<number>\d[\w.']*)
      | (?P<word>[A-Za-z_]\w*)
      | (?P<operator>==|!=|<=|>=|<<|>>|&&|\|\||->|::|\+\+|--|.)""",
    re.VERBOSE | re.MULTILINE | re.DOTALL,
)
_UNSEEN = ("comment", "directive", "blank")
_SCOPES = ("namespace", "struct", "class", "enum", "union")
_LABELS = ("case", "default", "public", "private", "protected", "Q_SIGNALS")
_LOG = ("qDebug", "qInfo", "qWarning", "qCritical")


@dataclass(frozen=True)
class Token:
    """A piece of a source that means something; `log` if it stands in a log statement."""

    kind: str
    text: str
    start: int
    log: bool

    @property
    def end(self) -> int:
        """Where the next piece begins."""
        return self.start + len(self.text)


@dataclass(frozen=True)
class Statement:
    """A simple statement of a function, up to its semicolon."""

    tokens: tuple[Token, ...]

    @property
    def start(self) -> int:
        """Place of its first character."""
        return self.tokens[0].start

    @property
    def end(self) -> int:
        """Place behind its semicolon."""
        return self.tokens[-1].end

    @property
    def first(self) -> Token:
        """Its first token."""
        return self.tokens[0]


def tokens(source: str) -> list[Token]:
    """All tokens but blanks, comments and directives."""
    found = []
    log = False
    for match in _TOKEN.finditer(source.replace("\t", " ")):
        kind, text = str(match.lastgroup), match[0]
        kind = "string" if kind == "delimiter" else kind
        if kind in _UNSEEN:
            continue
        log = log or text in _LOG
        found.append(Token(kind, text, match.start(), log))
        log = log and text != ";"
    return found


@dataclass
class _Block:
    """What stands between two braces: code, a scope of declarations, or values."""

    kind: str
    parentheses: int = 0
    statement: list[Token] = field(default_factory=list)
    row: list[Statement] = field(default_factory=list)


def rows(all_tokens: list[Token]) -> list[list[Statement]]:
    """The rows of simple statements that follow each other directly in the code of functions."""
    found: list[list[Statement]] = []
    blocks = [_Block("scope")]
    for token in all_tokens:
        block = blocks[-1]
        block.statement.append(token)
        if token.text in ("(", "["):
            block.parentheses += 1
        elif token.text in (")", "]"):
            block.parentheses -= 1
        elif token.text == "{":
            blocks.append(_Block(_kind(block)))
        elif token.text == "}":
            ended = blocks.pop()
            found.append(ended.row)
            blocks[-1].statement += [*ended.statement]
            if ended.kind != "values" and not blocks[-1].parentheses:
                _break_row(blocks[-1], found)
        elif not block.parentheses:
            _end_statement(block, token, found)
    return [row for row in found if row]


def _end_statement(block: _Block, token: Token, found: list[list[Statement]]) -> None:
    if token.text == ";" and block.kind == "code":
        block.row.append(Statement(tuple(block.statement)))
        block.statement = []
    elif token.text == ";" or (token.text == ":" and block.statement[0].text in _LABELS):
        _break_row(block, found)


def _break_row(block: _Block, found: list[list[Statement]]) -> None:
    found.append(block.row)
    block.row, block.statement = [], []


def _kind(block: _Block) -> str:
    """Kind of the block that the statement so far, which ends with a brace, opens."""
    words = [token.text for token in block.statement]
    if words[0] in _SCOPES:
        return "scope"
    before = words[-2] if len(words) > 1 else ""
    is_code = before in (")", "]", "else", "do", "try", "const", "noexcept", "mutable", "override", "")
    return "code" if is_code else "values"
