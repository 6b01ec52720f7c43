"""The pages in docs/ say what the code does."""

from __future__ import annotations

import re
from pathlib import Path

import pytest

from sandbox import REPOSITORY, contracts
from sandbox.policies import POLICIES, Policy
from tests.contracts.logcalls import LogLine, lines_of, lines_of_all

DOCS = REPOSITORY / "docs"
PAGES = sorted(DOCS.glob("*.md"))
CONTRACTS_PAGE = contracts.FOLDER.parent / "README.md"
AUDIENCES = {
    "EverySession": "every session",
    "DomainUsers": "domain users",
    "AddressedDomainUser": "the domain user whose `uid` the payload names",
}


def page(name: str) -> str:
    """Text of a page."""
    return (DOCS / name).read_text()


def catalogued_lines() -> list[LogLine]:
    """What the log catalogue lists."""
    rows = re.findall(r"^\| (debug|info|warning|critical|fatal) \| `(.*?)` \|", page("logs.md"), re.MULTILINE)
    return [LogLine(*row) for row in rows]


def policy_row(policy: Policy) -> str:
    """A policy's row in the page's table."""
    shown = f"{policy.notice}<br>*{policy.english_notice}*"
    cells = (policy.code, policy.meaning, AUDIENCES[policy.audience], f"`{policy.action}`", shown)
    return f"| {' | '.join(map(str, cells))} |"


def named_tests() -> set[tuple[str, str]]:
    """The tests that the failure matrix names, with their files."""
    return set(re.findall(r"`(tests/[\w/]+\.(?:py|cpp))::(\w+)`", page("failures.md")))


def links(path: Path) -> list[str]:
    """The files that a page links to, as it names them."""
    return re.findall(r"\]\((?!https?:)([^)#]+)[^)]*\)", path.read_text())


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
    assert list(lines_of(source)) == [LogLine("info", text)]


def test_every_log_line_stands_in_the_catalogue_and_no_other() -> None:
    written = lines_of_all(REPOSITORY / "src", REPOSITORY / "platform")
    catalogued = catalogued_lines()

    assert (written - set(catalogued), set(catalogued) - written) == (set(), set())
    assert len(catalogued) == len(set(catalogued))


def test_policy_page_has_a_row_for_each_policy_of_the_contract() -> None:
    rows = re.findall(r"^\| \d+ \|.*", page("policy-messages.md"), re.MULTILINE)
    wanted = [policy_row(policy) for policy in POLICIES.values()]
    assert [row for row in wanted if row not in rows] == []
    assert rows == wanted


def test_policy_page_and_diagram_have_each_action() -> None:
    actions = {"Forward", *(policy.action for policy in POLICIES.values())}
    rows = re.findall(r"^\| `(\w+)` \|", page("policy-messages.md"), re.MULTILINE)

    assert sorted(rows) == sorted(actions)
    for diagram in ("policy.dot", "policy.svg"):
        assert [action for action in actions if action not in page(diagram)] == []


@pytest.mark.parametrize(("file", "name"), sorted(named_tests()))
def test_test_that_the_failure_matrix_names_exists(file: str, name: str) -> None:
    prefix = "def " if file.endswith(".py") else "void "
    assert f"{prefix}{name}(" in (REPOSITORY / file).read_text()


def test_recipes_lead_to_places_that_exist() -> None:
    sections = (REPOSITORY / "CONTRIBUTING.md").read_text().split("\n## ")
    recipes = "".join(section for section in sections if section.startswith("To add "))
    named = set(re.findall(r"`((?:[a-z]\w*/)+[\w.-]*)`", recipes)) - {"contracts/dbus/INTERFACE.xml"}
    assert len(named) > 10
    assert [place for place in named if not (REPOSITORY / place).exists()] == []


def installed_places() -> set[str]:
    """What the package has in its folder of documentation: files and folders, named as in the tree."""
    linked = re.findall(r" usr/share/doc/velk-session-agent/(.*)", (REPOSITORY / "debian/links").read_text())
    return {*(REPOSITORY / "debian/docs").read_text().split(), *linked, "contracts/README.md"}


def test_links_of_installed_pages_lead_to_installed_pages() -> None:
    places = installed_places()
    lost = []
    for path in [*(REPOSITORY / name for name in places if name.endswith(".md")), *PAGES, CONTRACTS_PAGE]:
        for target in links(path):
            place = (path.parent / target).resolve().relative_to(REPOSITORY)
            if places.isdisjoint(map(str, [place, *place.parents])):
                lost.append(f"{path.name}: {target}")
    assert lost == []


@pytest.mark.parametrize("path", [*PAGES, CONTRACTS_PAGE], ids=lambda path: path.name)
def test_links_lead_somewhere(path: Path) -> None:
    assert [target for target in links(path) if not (path.parent / target).exists()] == []
