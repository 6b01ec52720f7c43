"""The sizes of files and functions are measured as people would."""

from __future__ import annotations

import pytest

from tests.lint.limits import too_large


def function(*lines: str) -> str:
    """A function with these lines."""
    return "\n".join(["def act():", *(f"    {line}" for line in lines), ""])


@pytest.mark.parametrize("name", ["a.py", "a.cpp", "a.h"])
def test_a_file_has_300_lines_at_most(name: str) -> None:
    assert list(too_large(name, "\n" * 300)) == []
    assert list(too_large(name, "\n" * 301)) == [f"{name}: 301 lines; at most 300"]


def test_a_function_has_40_lines_at_most_its_first_among_them() -> None:
    assert list(too_large("a.py", function(*["pass"] * 39))) == []
    assert list(too_large("a.py", function(*["pass"] * 40))) == ["a.py:1: act() has 41 lines; at most 40"]


def test_blocks_nest_three_deep_at_most() -> None:
    three = ("if a:", "    for b in c:", "        with d:", "            pass")
    four = (*three[:3], "            while e:", "                pass")
    assert list(too_large("a.py", function(*three))) == []
    assert list(too_large("a.py", function(*four))) == ["a.py:1: act() nests 4 deep; at most 3"]


@pytest.mark.parametrize(
    "lines",
    [
        ("if a:", "    pass", "elif b:", "    pass", "elif c:", "    pass", "elif d:", "    pass"),
        ("if a:", "    for b in c:", "        with d:", "            def f():", "                if e: pass"),
    ],
    ids=["elif", "function inside"],
)
def test_an_elif_or_a_function_inside_nests_no_deeper(lines: tuple[str, ...]) -> None:
    assert list(too_large("a.py", function(*lines))) == []
