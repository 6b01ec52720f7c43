"""Holds the C++ and Python files to the sizes that CONTRIBUTING.md sets.

    python3 tests/lint/limits.py FILE...

names what is too large; the exit status is 1 if anything is. Functions of C++ are clang-tidy's part.
"""

from __future__ import annotations

import ast
import sys
from pathlib import Path
from typing import Iterator

LONGEST_FILE = 300
LONGEST_FUNCTION = 40
DEEPEST_NESTING = 3

_BLOCKS = (ast.If, ast.For, ast.While, ast.With, ast.Try, ast.Match)


def too_large(name: str, source: str) -> Iterator[str]:
    """What is too large in a file, a line for each thing."""
    lines = source.count("\n")
    if lines > LONGEST_FILE:
        yield f"{name}: {lines} lines; at most {LONGEST_FILE}"
    if name.endswith(".py"):
        for function in ast.walk(ast.parse(source)):
            if isinstance(function, ast.FunctionDef):
                yield from _too_large_function(f"{name}:{function.lineno}: {function.name}()", function)


def _too_large_function(place: str, function: ast.FunctionDef) -> Iterator[str]:
    lines = (function.end_lineno or 0) - function.lineno + 1
    if lines > LONGEST_FUNCTION:
        yield f"{place} has {lines} lines; at most {LONGEST_FUNCTION}"
    depth = max(map(_depth, function.body))
    if depth > DEEPEST_NESTING:
        yield f"{place} nests {depth} deep; at most {DEEPEST_NESTING}"


def _depth(node: ast.AST) -> int:
    """How many blocks stand in one another; functions and classes inside are looked at on their own."""
    if isinstance(node, (ast.FunctionDef, ast.ClassDef)):
        return 0
    own = 1 if isinstance(node, _BLOCKS) else 0
    return max(
        (own - _is_elif(node, child) + _depth(child) for child in ast.iter_child_nodes(node)), default=own
    )


def _is_elif(node: ast.AST, child: ast.AST) -> bool:
    return isinstance(node, ast.If) and isinstance(child, ast.If) and node.orelse == [child]


def main() -> int:
    """Entry point."""
    found = [line for name in sys.argv[1:] for line in too_large(name, Path(name).read_text())]
    print("\n".join(found), end="\n" if found else "")
    return 1 if found else 0


if __name__ == "__main__":
    sys.exit(main())
