"""A policy code that is added as CONTRIBUTING.md says leaves nothing behind."""

from __future__ import annotations

import re
import shutil
import subprocess
import sys
from pathlib import Path
from typing import Iterator

import pytest

from sandbox import REPOSITORY
from sandbox.policies import POLICIES

NOT_COPIED = shutil.ignore_patterns("build", ".*", "__pycache__")
PAGE_TESTS = ("tests/contracts/test_docs.py", "tests/contracts/test_examples.py")
# The action that has a text of its own, and the picture.
SHOWING_ITS_OWN = {"src/velk/velks/handleevent.cpp", "docs/demo.svg"}
# What people at the prompt, the tests, the soak and the fuzzer make of the code.
USES = """
from sandbox.events import Event
from sandbox.policies import FORWARDED_CODES, with_action
from sandbox.timeline import phrases
from tests.fuzz.run import dictionary
print(phrases.meaning(Event(0, "daemon", "*", "signal", "pushPolicyMsg", ("", '{"type": 1399}'))))
print(any(policy.code == 1399 for policy in with_action("Notify")), 1399 in FORWARDED_CODES)
print('"1399"' in dictionary("policy"))
"""


def recipe() -> str:
    """The section of CONTRIBUTING.md."""
    text = (REPOSITORY / "CONTRIBUTING.md").read_text()
    return text.split("## To add a policy code\n")[1].split("\n## ")[0]


def snippet(language: str) -> str:
    """The recipe's example in this language."""
    found = re.search(rf"```{language}\n(.*?)```", recipe(), re.DOTALL)
    assert found
    return found[1].strip()


@pytest.fixture
def tree(tmp_path: Path) -> Path:
    """A copy of the sources, in which the recipe's code is not taken yet."""
    assert 1399 not in POLICIES, "1399 is a policy now: give CONTRIBUTING.md and this test another example"
    copy = tmp_path / "tree"
    shutil.copytree(REPOSITORY, copy, ignore=NOT_COPIED)
    return copy


def add(file: Path, before: str, text: str) -> None:
    """Put a text before the first place where another one stands."""
    content = file.read_text()
    assert before in content
    file.write_text(content.replace(before, text + before, 1))


def schema_of(tree: Path) -> Path:
    """The copy's contract."""
    return tree / "contracts/json/policy-message.schema.json"


def run(tree: Path, *command: str) -> subprocess.CompletedProcess[str]:
    """Run a program in the copy."""
    return subprocess.run(command, cwd=tree, stdout=subprocess.PIPE, stderr=subprocess.STDOUT, text=True)


def page_tests(tree: Path) -> subprocess.CompletedProcess[str]:
    """What `./dev test contracts` says of the copy's pages and examples."""
    return run(tree, sys.executable, "-m", "pytest", "-vv", "-k", "policy or code", *PAGE_TESTS)


def built_unit_test(tree: Path) -> str:
    """The copy's unit test of the policies, the only program that knows them all."""
    sources = tree / "src/velk/velks"
    moc = run(tree, "pkg-config", "--variable=host_bins", "Qt5Core").stdout.strip() + "/moc"
    flags = run(tree, "pkg-config", "--cflags", "--libs", "Qt5Test").stdout.split()
    test = tree / "tests/unit/session_policy_test.cpp"
    for source, output in (
        (test, "session_policy_test.moc"),
        (sources / "session_policy.h", "moc_session_policy.cpp"),
    ):
        assert run(tree, moc, str(source), "-o", output).returncode == 0
    files = [str(test), str(sources / "session_policy.cpp"), "moc_session_policy.cpp"]
    macros = f'-DVELK_SOURCE_DIR="{tree}"'
    options = ["-std=c++17", "-fPIC", macros, f"-I{sources}", "-I.", "-o", "session_policy_test"]
    built = run(tree, "g++", *options, *files, *flags)
    assert built.returncode == 0, built.stdout
    return str(tree / "session_policy_test")


def texts(tree: Path) -> Iterator[tuple[str, str]]:
    """All files of the copy that hold text."""
    for file in tree.rglob("*"):
        if file.suffix in (".cpp", ".h", ".py", ".md", ".json", ".dict", ".dot", ".svg", ".txt"):
            yield str(file.relative_to(tree)), file.read_text()


def test_code_is_added_by_the_recipe_and_nothing_is_left_behind(tree: Path) -> None:
    add(tree / "src/velk/velks/session_policy.cpp", "        {1304,", snippet("cpp"))
    unit_test = built_unit_test(tree)
    assert run(tree, unit_test).returncode != 0, "the agent does what no contract says"

    entry = re.search(r"^ *\{\n *\"const\": 1301,", schema_of(tree).read_text(), re.MULTILINE)
    assert entry
    add(schema_of(tree), entry[0], snippet("json") + ",")
    said = run(tree, unit_test)
    assert said.returncode == 0, said.stdout

    row = re.search(r"'(\| 1399 .*\|)'", page_tests(tree).stdout)
    assert row, "the row for the page is printed"
    add(tree / "docs/policy-messages.md", "| any other", row[1] + "\n")
    said = page_tests(tree)
    assert said.returncode == 0, said.stdout

    used = run(tree, sys.executable, "-c", USES)
    assert used.stdout == "the network will change\nTrue False\nTrue\n"
    lists = [(name, text) for name, text in texts(tree) if all(str(code) in text for code in POLICIES)]
    assert len(lists) >= 3
    assert [name for name, text in lists if "1399" not in text] == []


def test_text_of_a_notice_stands_where_the_recipe_says_and_nowhere_else(tree: Path) -> None:
    found = {name for name, text in texts(tree) if any(policy.notice in text for policy in POLICIES.values())}
    assert found - SHOWING_ITS_OWN == {
        "contracts/json/policy-message.schema.json",
        "docs/policy-messages.md",
        "src/velk/velks/session_policy.cpp",
    }


def test_recipe_names_five_files_at_most() -> None:
    steps = recipe().split("`./dev test` then")[0]
    named = set(re.findall(r"`([\w/.-]+\.(?:json|cpp|h|md|py|dot))`", steps))
    assert 1 <= len(named) <= 5
    assert [name for name in named if not (REPOSITORY / name).exists()] == []
