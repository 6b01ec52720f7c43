"""The sizes of files and functions are measured as people would."""

from __future__ import annotations

import pytest

from tests.lint.limits import too_large


# A function's blocks, one in another.
BLOCKS = ["if a:", "    for b in c:", "        with d:", "            while e:", "                pass"]


@pytest.mark.parametrize("name", ["a.py", "a.cpp", "a.h"])
def test_a_file_has_300_lines_at_most(name: str) -> None:
    assert list(too_large(name, "\n" * 300)) == []
    assert list(too_large(name, "\n" * 301)) == [f"{name}: 301 lines; at most 300"]


@pytest.mark.parametrize(
    ("lines", "trouble"),
    [
        (["pass"] * 39, []),
        (["pass"] * 40, ["a.py:1: act() has 41 lines; at most 40"]),
        ([*BLOCKS[:3], "            pass"], []),
        (BLOCKS, ["a.py:1: act() nests 4 deep; at most 3"]),
        ([*BLOCKS[:3], "            def f():", "                if e: pass"], []),
        (["if a:", "    pass", *["elif b:", "    pass"] * 3], []),
    ],
    ids=["40 lines", "41 lines", "three deep", "four deep", "a function inside", "elif"],
)
def test_a_function_has_40_lines_with_its_first_and_nests_three_deep_at_most(
    lines: list[str], trouble: list[str]
) -> None:
    function = "\n".join(["def act():", *(f"    {line}" for line in lines), ""])

    assert list(too_large("a.py", function)) == trouble
