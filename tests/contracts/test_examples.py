"""The JSON contracts are sound, and their examples are valid or invalid as their names say."""

from __future__ import annotations

import json
import subprocess
from pathlib import Path

import pytest
from jsonschema import Draft202012Validator

from sandbox import REPOSITORY, contracts, policies
from sandbox.policies import FORWARDED_CODES, POLICIES, Policy

EXAMPLES = contracts.FOLDER / "examples"


def label(path: Path) -> str:
    """How a test of an example is called."""
    return f"{path.parent.name}/{path.stem}"


@pytest.mark.parametrize("name", contracts.names())
def test_schema_is_a_schema_that_explains_itself(name: str) -> None:
    schema = json.loads(contracts.schema_file(name).read_text())

    Draft202012Validator.check_schema(schema)
    assert schema["$schema"] == Draft202012Validator.META_SCHEMA["$id"]
    assert schema["$id"].endswith(f"/contracts/json/{name}.schema.json")
    assert schema["title"] and schema["description"]
    undescribed = [key for key, value in schema.get("properties", {}).items() if "description" not in value]
    assert undescribed == []


@pytest.mark.parametrize("name", contracts.names())
def test_schema_has_examples_of_both_kinds(name: str) -> None:
    of_schema = {path.name.partition("-")[0] for path in (EXAMPLES / name).iterdir()}
    assert of_schema == {"valid", "invalid"}


def test_examples_belong_to_a_schema() -> None:
    assert {path.name for path in EXAMPLES.iterdir()} <= set(contracts.names())


@pytest.mark.parametrize("example", sorted(EXAMPLES.glob("*/*.json")), ids=label)
def test_example_keeps_to_the_contract_if_it_is_called_valid(example: Path) -> None:
    broken = contracts.violation_of_text(example.parent.name, example.read_text())
    assert (broken is None) == example.name.startswith("valid-"), broken


@pytest.mark.parametrize("code", POLICIES)
def test_code_of_the_agents_own_is_a_policy_and_is_never_forwarded(code: int) -> None:
    message = {"type": code, "payload": {"uid": 20001}}
    assert contracts.violation("policy-message", message) is None
    assert contracts.violation("forwarded-policy", message) is not None


@pytest.mark.parametrize("code", FORWARDED_CODES)
def test_any_other_code_is_forwarded(code: int) -> None:
    assert contracts.violation("policy-message", {"type": code}) is None
    assert contracts.violation("forwarded-policy", {"type": code}) is None


@pytest.mark.parametrize("policy", policies.for_one_account(), ids=lambda policy: policy.code)
def test_policy_for_one_account_must_name_it(policy: Policy) -> None:
    assert contracts.violation("policy-message", {"type": policy.code, "payload": {}}) is not None


def check(*files: Path) -> subprocess.CompletedProcess[str]:
    """What people are told who check their own messages."""
    command = ["/usr/bin/python3", "-m", "sandbox.contracts", "policy-message", *map(str, files)]
    return subprocess.run(command, cwd=REPOSITORY, capture_output=True, text=True)


@pytest.mark.parametrize(
    ("other", "status", "said"),
    [
        ("valid-forwarded", 0, "keeps to the contract"),
        ("invalid-no-type", 1, "'type' is a required property"),
    ],
)
def test_people_can_check_their_own_messages(other: str, status: int, said: str) -> None:
    names = ("valid-terminal-disabled", other)
    ended = check(*(EXAMPLES / "policy-message" / f"{name}.json" for name in names))

    verdicts = [line.rpartition(": ")[2] for line in ended.stdout.splitlines()]
    assert (ended.returncode, verdicts) == (status, ["keeps to the contract", said])


def test_a_message_that_is_not_there_is_named_without_a_traceback() -> None:
    ended = check(Path("/nowhere.json"))

    assert ended.returncode == 2
    assert "cannot read the file" in ended.stderr.splitlines()[-1]
    assert "Traceback" not in ended.stderr
