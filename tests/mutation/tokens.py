"""C++ sources cut into tokens, as far as single changes to them need it."""

from __future__ import annotations

import re
from dataclasses import dataclass

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
_LOG = ("qDebug", "qInfo", "qWarning", "qCritical")


@dataclass(frozen=True)
class Token:
    """A token of a source; `log` if it is part of a log statement."""

    kind: str
    text: str
    start: int
    log: bool

    @property
    def end(self) -> int:
        """Where the next piece begins."""
        return self.start + len(self.text)


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
