"""The pages in docs/ say what the code does."""

from __future__ import annotations

import re
from pathlib import Path

import pytest
from logcalls import LogLine, log_lines, log_lines_of

from sandbox import contracts, layout

DOCS = layout.REPOSITORY / "docs"
PAGES = sorted(DOCS.glob("*.md"))
_CPP_STRING = re.compile(r'"[^"]*"')


def page(name: str) -> str:
    """Text of a page."""
    return (DOCS / name).read_text()


def catalogued_lines() -> list[LogLine]:
    """What the log catalogue lists."""
    rows = re.findall(r"^\| (debug|info|warning|critical|fatal) \| `(.*?)` \|", page("logs.md"), re.MULTILINE)
    return [LogLine(*row) for row in rows]


def policy_rows() -> dict[int, str]:
    """The policy table of the page, by code."""
    rows = re.findall(r"^\| (\d+) (\|.*)$", page("policy-messages.md"), re.MULTILINE)
    return {int(code): row for code, row in rows}


def policies_of_the_code() -> dict[int, str]:
    """The policy table of the code: what it says of each code."""
    source = (layout.REPOSITORY / "src/velk/velks/session_policy.cpp").read_text()
    entries = re.findall(r"\{(\d+),\s*\{(.*?)\}\}", source, re.DOTALL)
    return {int(code): entry for code, entry in entries}


def named_tests() -> set[tuple[str, str]]:
    """The tests that the failure matrix names, with their files."""
    return set(re.findall(r"`(tests/[\w/]+\.(?:py|cpp))::(\w+)`", page("failures.md")))


@pytest.mark.parametrize(
    ("source", "text"),
    [
        ('qInfo() << "a" << "b:" << value;', "a b: …"),
        ('qInfo() << "a ;" << f(x, ";") << y << ",c" << z;', "a ; … ,c …"),
        ('qInfo() << name << "one "\n    "two";', "… one two"),
        ('qInfo("a %s: %d", x("y"), 3);', "a …: …"),
    ],
)
def test_log_call_is_read_as_the_line_that_it_writes(source: str, text: str) -> None:
    assert list(log_lines(source)) == [LogLine("info", text)]


def test_every_log_line_stands_in_the_catalogue_and_no_other() -> None:
    written = log_lines_of(layout.REPOSITORY / "src", layout.REPOSITORY / "platform")
    catalogued = catalogued_lines()

    assert (written - set(catalogued), set(catalogued) - written) == (set(), set())
    assert len(catalogued) == len(set(catalogued))


def test_policy_page_has_exactly_the_codes_of_the_code_with_their_texts() -> None:
    rows = policy_rows()
    known = policies_of_the_code()

    assert rows.keys() == known.keys()
    for code, entry in known.items():
        for text in _CPP_STRING.findall(entry):
            assert text.strip('"') in rows[code]


def test_policy_contract_has_exactly_the_codes_of_the_code() -> None:
    codes = set(map(int, re.findall(r'"const": (\d+)', contracts.schema_file("policy-message").read_text())))
    assert codes == policies_of_the_code().keys()


@pytest.mark.parametrize(("file", "name"), sorted(named_tests()))
def test_test_that_the_failure_matrix_names_exists(file: str, name: str) -> None:
    prefix = "def " if file.endswith(".py") else "void "
    assert f"{prefix}{name}(" in (layout.REPOSITORY / file).read_text()


@pytest.mark.parametrize("path", PAGES + [contracts.FOLDER.parent / "README.md"], ids=lambda path: path.name)
def test_links_lead_somewhere(path: Path) -> None:
    targets = re.findall(r"\]\((?!https?:)([^)#]+)[^)]*\)", path.read_text())
    assert [target for target in targets if not (path.parent / target).exists()] == []
