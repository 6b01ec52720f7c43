"""A day in a few minutes names what was lost and what grew; its status says whether anything did."""

from __future__ import annotations

import os
import re
from dataclasses import replace
from pathlib import Path
from typing import Iterator

import pytest
from hypothesis.stateful import RuleBasedStateMachine

from sandbox.agent import default_binary
from sandbox.ending import CannotRun
from sandbox.soak.accounting import FORWARDED, KINDS, MESSAGES, RECEIPTS, Accounting
from sandbox.soak.activity import activity
from sandbox.soak.search import shortest_history
from sandbox.soak.session import Lost, Session
from sandbox.soak.usage import Usage, growth, usage
from sandbox.terminal import Terminal
from tests.sandbox.programs import run_program, talking_agent

FIRST = Usage(resident=20_000, private_dirty=3_000, descriptors=13, threads=2)
ALLOWANCE = 100


def test_after_an_hour_all_has_arrived_and_nothing_has_grown() -> None:
    ended = run_program("soak", "--hours", "1")

    assert (ended.returncode, ended.stderr) == (0, ""), ended.stdout
    assert ended.stdout.endswith("soak: all arrived, nothing grew\n")
    counts = re.findall(r"│ +([\d,]+) │ +([\d,]+) │$", ended.stdout, re.MULTILINE)
    assert len(counts) == len(KINDS)
    assert all(sent == arrived for sent, arrived in counts)


def test_the_same_seed_gives_the_same_day_and_another_one_another() -> None:
    days = [run_program("soak", "--hours", "1", "--seed", seed).stdout for seed in ("2", "2", "3")]

    counts = [re.findall(r"^│.*│$", day, re.MULTILINE) for day in days]
    assert counts[0] == counts[1] != counts[2]


def test_what_arrives_without_being_sent_fails_the_day_and_is_named(tmp_path: Path) -> None:
    real = str(default_binary())
    twice = talking_agent(
        tmp_path,
        f"call_policy_service('{{\"type\":5}}')\nimport os\nos.execv({real!r}, [{real!r}])",
    )

    ended = run_program("soak", "--hours", "1", agent=twice)

    assert ended.returncode == 1
    named = r"""^policies forwarded: \d+ sent, \d+ arrived; 1 too many, such as \('{"type":5}',\)$"""
    assert re.search(named, ended.stdout, re.MULTILINE), ended.stdout
    assert "the shortest that failed: ./dev soak --replay ''\n" in ended.stdout
    assert ended.stdout.endswith("soak: something was lost or grew\n")


def test_memory_beyond_the_allowance_fails_the_day_and_is_named() -> None:
    ended = run_program("soak", "--hours", "1", "--allowance", "-100000")

    assert ended.returncode == 1
    assert re.search(
        r"^resident memory grew from .* KiB; -100,000 KiB are allowed$", ended.stdout, re.MULTILINE
    )


@pytest.fixture
def session() -> Iterator[Session]:
    """A session that begins, in a terminal of its own."""
    begun = Session()
    begun.log_in()
    yield begun
    begun.teardown()


def test_what_is_lost_on_the_way_is_named(session: Session) -> None:
    session.terminal.policy_service.leave()
    session.accounting.patience = 0
    session.push_forwarded(count=3)

    with pytest.raises(Lost) as lost:
        session.nothing_is_lost()
    assert str(lost.value).startswith(f'{FORWARDED}: 3 sent, 0 arrived; 3 missing, such as (\'{{"type": ')


def test_messages_may_wait_for_the_user_and_the_platform(session: Session) -> None:
    session.replay(["go_away", "post_messages:2", "wait:10", "come_back", "stop_platform", "wait:10"])
    assert session.accounting.arrived(MESSAGES) == 0

    session.replay(["start_platform", "wait:10"])
    assert session.accounting.arrived(MESSAGES) == session.accounting.arrived(RECEIPTS) == 2


class Shelf(RuleBasedStateMachine):
    """Loses something when one of two things is taken down again."""

    def __init__(self) -> None:
        super().__init__()
        self.history: list[str] = []
        self.model: set[str] = set()

    @activity(name=lambda model: [name for name in ("book", "clock", "vase") if name not in model])
    def put(self, name: str) -> None:
        self.model.add(name)

    @activity(name=lambda model: sorted(model))
    def take(self, name: str) -> None:
        if len(self.model) == 2:
            raise Lost(name)
        self.model.remove(name)


def test_a_failing_history_is_shortened() -> None:
    assert shortest_history(1, Shelf) == ["put:book", "put:clock", "take:book"]


def test_where_nothing_fails_there_is_no_shortest_history() -> None:
    assert shortest_history(1, seconds=2) is None


@pytest.mark.parametrize("step", ["dance", "come_back", "wait:3", "wait", "go_away:1"])
def test_step_that_cannot_be_replayed_is_named(session: Session, step: str) -> None:
    with pytest.raises(CannotRun) as refused:
        session.replay(["wait:1", step])
    assert str(refused.value) == f"'{step}' is not possible after: wait:1"


def test_another_piece_than_the_one_that_was_sent_counts_as_lost(terminal: Terminal) -> None:
    accounting = Accounting(terminal.events)
    accounting.expect(RECEIPTS, "u1")
    terminal.events.record("velks", "platform", "http", "read", ("PUT", '{"uuid":"u2"}'))

    assert accounting.differences() == [
        f"{RECEIPTS}: 1 sent, 1 arrived; 1 missing, such as ('u1',); 1 too many, such as ('u2',)"
    ]


@pytest.mark.parametrize(
    ("later", "named"),
    [
        ({}, ""),
        ({"resident": 20_100, "private_dirty": 3_100, "descriptors": 12}, ""),
        ({"resident": 20_101}, "resident memory grew from 20,000 to 20,101 KiB; 100 KiB are allowed"),
        ({"private_dirty": 3_101}, "private dirty memory grew from 3,000 to 3,101 KiB; 100 KiB are allowed"),
        ({"descriptors": 14}, "open descriptors grew from 13 to 14"),
        ({"threads": 3}, "threads grew from 2 to 3"),
    ],
)
def test_growth_is_named(later: dict[str, int], named: str) -> None:
    assert growth([FIRST, replace(FIRST, **later)], ALLOWANCE) == ([named] if named else [])


def test_descriptors_that_are_given_back_later_have_grown_all_the_same() -> None:
    assert growth([FIRST, replace(FIRST, descriptors=20), FIRST], ALLOWANCE) == [
        "open descriptors grew from 13 to 20"
    ]


def test_usage_is_that_of_the_process() -> None:
    before = usage(os.getpid())
    opened = [os.open("/dev/null", os.O_RDONLY) for _ in range(3)]
    held = bytearray(os.urandom(4 << 20))
    after = usage(os.getpid())
    for descriptor in opened:
        os.close(descriptor)

    assert after.descriptors == before.descriptors + 3
    assert after.private_dirty - before.private_dirty > len(held) // 1024 // 2
    assert after.resident > after.private_dirty and after.threads >= 1
