"""A broken JSON contract fails the test, whether the agent or the box breaks it."""

from __future__ import annotations

import json
from pathlib import Path
from typing import Any

import pytest

from sandbox import contracts
from sandbox.platform.server import HttpFault
from sandbox.terminal import Terminal
from tests.sandbox import programs

CHANGES = "https://%1:%2/uim/v3/client/upinfo_log"
INVENTORY = "https://%1:%2/uim/v3/client/upload_info"
MESSAGES = "/notification/v2/list"
READ = "/notification/v2/read"
TIPS = "/uim/v3/client/password/tips"


def example(name: str) -> str:
    """One of the contracts' examples, as text."""
    return (contracts.FOLDER / "examples" / f"{name}.json").read_text()


CHANGE = example("software-change-report/valid-installed")
SOFTWARE = example("inventory-report/valid-known-software")
FORWARDED = '{"type": 5, "note": "停用"}'


def upload(address: str, text: str) -> str:
    """What an agent does that hands the daemon a report."""
    return f"call_daemon('onUploadFinished', {address!r}, {text!r})"


def forward(text: str) -> str:
    """What an agent does that forwards a policy."""
    return f"call_policy_service({text!r})"


def request(method: str, path: str, body: str = "") -> str:
    """What an agent does that asks the platform."""
    return f"ask_platform({method!r}, {path!r}, {body!r})"


WELL_DONE = [
    upload(CHANGES, CHANGE),
    upload(INVENTORY, SOFTWARE),
    forward(FORWARDED),
    request("GET", MESSAGES),
    request("PUT", READ, '{"uuid": "u"}'),
    request("GET", TIPS, '{"username": "zhang"}'),
]
BADLY_DONE = [
    (upload(CHANGES, SOFTWARE), "software-change-report"),
    (upload(INVENTORY, CHANGE), "inventory-report"),
    (upload(INVENTORY, SOFTWARE.replace('"arch"', '"architecture"')), "inventory-report"),
    (upload(CHANGES, "no JSON"), "no JSON"),
    (upload(CHANGES.replace("%1", "platform.box"), CHANGE), "no contract"),
    (forward('{"type":5,"note":"停用"}'), "not pushed"),
    (f"{forward(FORWARDED)}; {forward(FORWARDED)}", "once too often"),
    (forward('{"type": 1201}'), "forwarded-policy"),
    (request("GET", MESSAGES, "{}"), "fits no contract"),
    (request("PUT", READ, '{"uuid": 7}'), "read-receipt"),
    (request("PUT", READ), "read-receipt"),
    (request("GET", TIPS, '{"user": "zhang"}'), "password-tips-request"),
    (request("POST", READ, '{"uuid": "u"}'), "fits no contract"),
    (request("POST", "/uim/v3/client/upload_info", SOFTWARE), "fits no contract"),
    (request("GET", "/elsewhere"), "fits no contract"),
]


def play_with_policies(terminal: Terminal, folder: Path, actions: str) -> None:
    """Let an agent do this, with two policies pushed before."""
    assert terminal.platform
    for policy in (FORWARDED, '{"type": 1201}'):
        terminal.daemon.push_policy(policy)
    programs.play(terminal, folder, actions)


def test_an_agent_that_keeps_to_all_contracts_passes(terminal: Terminal, tmp_path: Path) -> None:
    play_with_policies(terminal, tmp_path, "; ".join(WELL_DONE))

    assert len(terminal.events.all(source="velks", kind="call")) == 3
    assert len(terminal.events.all(source="velks", kind="http")) == 3


@pytest.mark.parametrize(("actions", "complaint"), BADLY_DONE, ids=range(len(BADLY_DONE)))
def test_an_agent_that_breaks_a_contract_fails_the_test(tmp_path: Path, actions: str, complaint: str) -> None:
    with pytest.raises(AssertionError, match=f"(?s)^the agent.* {complaint}"), Terminal() as terminal:
        play_with_policies(terminal, tmp_path, actions)


def test_an_agent_that_relays_garbage_can_be_excused(terminal: Terminal, tmp_path: Path) -> None:
    terminal.contracts.allow_violations("read-receipt")

    play_with_policies(terminal, tmp_path, request("PUT", READ, '{"uuid":"""}'))


@pytest.mark.parametrize("policy", [{"type": 1202}, {"type": "1201"}, {"payload": {}}], ids=str)
def test_a_policy_is_pushed_as_a_mapping_only_if_it_keeps_to_its_contract(
    terminal: Terminal, policy: dict[str, Any]
) -> None:
    mark = terminal.events.mark()
    with pytest.raises(AssertionError, match="policy-message"):
        terminal.daemon.push_policy(policy)
    assert not terminal.events.all(after=mark)

    terminal.daemon.push_policy(json.dumps(policy))


def test_the_information_file_keeps_to_its_contract_unless_it_is_given_as_text(terminal: Terminal) -> None:
    with pytest.raises(AssertionError, match="user-info"):
        terminal.files.write_userinfo(server_port=8443)

    terminal.files.write_userinfo('{"server_port": 8443}')


def test_a_platform_that_breaks_a_contract_by_itself_fails_the_test(tmp_path: Path) -> None:
    complaint = "^the platform breaks the contract password-tips-reply"
    with pytest.raises(AssertionError, match=complaint), Terminal() as terminal:
        terminal.platform.password_tip("zhang", 7)  # type: ignore[arg-type]
        play_with_policies(terminal, tmp_path, request("GET", TIPS, '{"username": "zhang"}'))


def test_a_platform_with_a_fault_may_break_a_contract(terminal: Terminal, tmp_path: Path) -> None:
    terminal.platform.faults["tips"] = HttpFault("reply", 200, b'{"code": "0"}')

    play_with_policies(terminal, tmp_path, request("GET", TIPS, '{"username": "zhang"}'))
