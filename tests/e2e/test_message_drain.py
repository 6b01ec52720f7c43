"""Long backlogs: what waits meanwhile, and how much load the platform gets."""

from __future__ import annotations

import re
from pathlib import Path
from typing import Iterator
from uuid import uuid4

import pytest

from sandbox.events import Event
from sandbox.periods import SURELY_NEXT_POLL
from sandbox.policies import POLICIES
from sandbox.platform.server import HttpFault
from sandbox.terminal import Terminal
from tests.e2e.messages import USER, answer_always, as_reply, begin_poll, message, poll, requests, titles
from tests.e2e.wire import FORWARDED_CODE, forced_actions

LESS_THAN_A_REQUEST_MAY_TAKE = 20
AT_FULL_SPEED, MOST_IN_A_SECOND = 1000, 50


def test_count_that_never_falls_does_not_keep_a_log_out_waiting(polling: Terminal) -> None:
    answer_always(polling, as_reply(message()), {"X-Total-Count": "1000"})
    mark = begin_poll(polling, count=60)

    polling.daemon.push_policy({"type": 1201})
    polling.events.wait_for(
        lambda event: event.args[4] == POLICIES[1201].notice,
        target="notifications",
        member="Notify",
        after=mark,
    )
    polling.sync()
    polling.jump(60)
    polling.events.wait_for(target="logind", member="Terminate", after=mark)
    answer_always(polling, b"[]")
    polling.sync()


COUNT_NEVER_FALLS = HttpFault("reply", 200, b"[]", {"X-Total-Count": "1000"})


def policy_goes_before_the_51st_message(terminal: Terminal) -> None:
    """Assert it of a policy that comes now, while the platform holds a list request."""
    marker = str(uuid4())
    terminal.daemon.push_policy({"type": FORWARDED_CODE, "marker": marker})
    terminal.daemon.receive_all_from(terminal.agent.pid)  # its answer comes after it has got the policy
    mark = terminal.events.mark()

    def hold_the_51st(event: Event) -> None:
        if event.member == "list" and len(requests(terminal, "list", mark)) == 50:
            terminal.platform.fault = HttpFault("hang")

    terminal.events.subscribe(hold_the_51st)
    terminal.platform.release(then=COUNT_NEVER_FALLS)
    terminal.events.wait_for(kind="http", member="list", count=51, after=mark)
    terminal.events.wait_for(
        lambda event: marker in event.args[0], target="policy_service", member="onPolicyMsg", after=mark
    )


@pytest.fixture
def held(polling: Terminal) -> Iterator[Terminal]:
    """A terminal whose agent waits for the reply to its first list request."""
    polling.platform.fault = HttpFault("hang")
    begin_poll(polling)
    yield polling
    polling.platform.release()


def test_policies_have_their_turn_after_every_fifty_messages(held: Terminal) -> None:
    policy_goes_before_the_51st_message(held)
    policy_goes_before_the_51st_message(held)


def test_poll_that_falls_into_a_drain_does_not_start_a_second_one_beside_it(held: Terminal) -> None:
    mark = held.events.mark()
    for _ in range(SURELY_NEXT_POLL // LESS_THAN_A_REQUEST_MAY_TAKE + 1):
        held.jump(LESS_THAN_A_REQUEST_MAY_TAKE)
        policy_goes_before_the_51st_message(held)
    held.events.wait_for(lambda event: "screen state-----" in event.args[0], kind="log", after=mark)
    policy_goes_before_the_51st_message(held)


def test_long_drain_needs_no_more_stack_than_a_short_one(polling: Terminal) -> None:
    def stack() -> int:
        status = (Path("/proc") / str(polling.agent.pid) / "status").read_text()
        return int(re.findall(r"VmStk:\s*(\d+) kB", status)[0])

    for number in range(5):
        polling.platform.post_message(USER, f"message {number}", "text")
    poll(polling)
    short = stack()
    for number in range(600):
        polling.platform.post_message(USER, f"message {number}", "text")
    poll(polling)
    polling.events.wait_for(kind="http", member="read", count=605, timeout=60)
    assert stack() - short <= 64


def test_policy_that_waits_during_a_drain_is_carried_out_after_it(polling: Terminal) -> None:
    polling.platform.post_message(USER, "T", "C")
    polling.platform.faults["list"] = HttpFault("hang")
    mark = begin_poll(polling)
    polling.daemon.push_policy({"type": 1201})
    polling.platform.release()
    polling.sync()
    assert titles(polling, mark) == ["T", "提醒"]
    polling.advance(60)
    assert forced_actions(polling, mark) == ["Terminate"]


def test_platform_whose_count_never_falls_is_asked_fifty_times_in_a_second_at_most(polling: Terminal) -> None:
    polling.platform.faults["list"] = COUNT_NEVER_FALLS
    mark = poll(polling)
    polling.events.wait_for(kind="http", member="list", count=AT_FULL_SPEED + 1, after=mark, timeout=60)
    polling.sync()
    assert len(requests(polling, "list", mark)) == AT_FULL_SPEED + 1  # and the poll

    for _ in range(5):
        mark = polling.events.mark()
        polling.advance(1)
        assert 0 < len(requests(polling, "list", mark)) <= MOST_IN_A_SECOND
    answer_always(polling, b"[]")
    polling.advance(1)


def test_backlog_of_more_than_a_thousand_is_drained_to_its_end(polling: Terminal) -> None:
    backlog = AT_FULL_SPEED + MOST_IN_A_SECOND + 20
    for number in range(backlog):
        polling.platform.post_message(USER, f"message {number}", "text")
    mark = poll(polling)
    polling.events.wait_for(kind="http", member="read", count=AT_FULL_SPEED + 1, after=mark, timeout=60)
    polling.advance(1)
    polling.advance(1)
    assert len(requests(polling, "read", mark)) == backlog
    assert all(sent["read_at"] for sent in polling.platform.messages())
