"""The JSON contracts: checks what crosses the terminal's wires against the schemas in contracts/json/.

    /usr/bin/python3 -m sandbox.contracts CONTRACT FILE...

checks your own messages; the exit status is 0 if all of them are valid.
"""

from __future__ import annotations

import argparse
import json
import sys
from collections import Counter
from functools import cache
from pathlib import Path
from typing import Any

from jsonschema import Draft202012Validator
from jsonschema.exceptions import best_match

from sandbox import REPOSITORY
from sandbox.events import Event, Events

FOLDER = REPOSITORY / "contracts" / "json"
_SUFFIX = ".schema.json"
_BYTE_ORDER_MARK = "\ufeff"  # Qt drops it at the beginning of a text

_UPLOADS = {
    "https://%1:%2/uim/v3/client/upinfo_log": "software-change-report",
    "https://%1:%2/uim/v3/client/upload_info": "inventory-report",
}
# By the platform's route; None: the request has no body.
_REQUESTS = {"list": None, "read": "read-receipt", "tips": "password-tips-request"}
_REPLIES = {
    "list": "platform-messages",
    "read": "acknowledgement",
    "tips": "password-tips-reply",
    "software_change": "acknowledgement",
    "inventory": "acknowledgement",
}


def names() -> list[str]:
    """The names of all contracts."""
    return sorted(_schemas())


def schema_file(name: str) -> Path:
    """The file of a contract's schema."""
    return FOLDER / f"{name}{_SUFFIX}"


def violation(name: str, value: Any) -> str | None:
    """How a JSON value breaks a contract; None if it is valid."""
    error = best_match(_validator(name).iter_errors(value))
    return f"{error.json_path}: {error.message}" if error else None


def violation_of_text(name: str, text: str) -> str | None:
    """How a text breaks a contract; None if it is valid JSON that keeps to it."""
    try:
        value = json.loads(text, parse_constant=_no_number)
    except ValueError as error:
        return f"no JSON: {error}"
    return violation(name, value)


def require(name: str, value: Any) -> None:
    """Raise AssertionError if a value made by the sandbox itself breaks its contract."""
    broken = violation(name, value)
    assert broken is None, f"the box breaks the contract {name}: {broken}"


class Contracts:
    """Checks all JSON of the agent, and the platform's own replies, against the contracts; collects the
    `violations`.

    Raw texts and bytes that a test sends through a fake or the platform are not checked.
    """

    def __init__(self, events: Events) -> None:
        self.violations: list[str] = []
        self._allowed: set[str] = set()
        self._pushed: Counter[str] = Counter()
        events.subscribe(self._look_at)

    def allow_violations(self, name: str) -> None:
        """Stop checking this contract, for an agent that has to relay garbage."""
        self._allowed.add(name)

    def _look_at(self, event: Event) -> None:
        # An event with other arguments matches no case; it has already broken its D-Bus contract.
        match event.kind, event.source, event.target, event.member, event.args:
            case "signal", "daemon", _, "pushPolicyMsg", (_, text):
                self._pushed[text.removeprefix(_BYTE_ORDER_MARK)] += 1
            case "call", "velks", "policy_service", "onPolicyMsg", (str(text),):
                self._look_at_forwarded(text)
            case "call", "velks", "daemon", "onUploadFinished", (str(address), str(text)):
                self._look_at_upload(address, text)
            case "http", "velks", _, route, (str(line), str(body)):
                self._look_at_request(route, line, body)
            case "reply", _, _, _, (route, _, str(body)) if event.detail.get("own") and route in _REPLIES:
                self._hold("the platform", _REPLIES[route], body)

    def _look_at_forwarded(self, text: str) -> None:
        if self._pushed[text] < 1:
            self.violations.append(
                f"the agent forwarded a text that was not pushed, or once too often: {text}"
            )
        self._pushed[text] -= 1
        self._hold("the agent", "forwarded-policy", text)

    def _look_at_upload(self, address: str, text: str) -> None:
        if address in _UPLOADS:
            self._hold("the agent", _UPLOADS[address], text)
        else:
            self.violations.append(f"the agent asks for an upload to {address}, which no contract describes")

    def _look_at_request(self, route: str, line: str, body: str) -> None:
        contract = _REQUESTS.get(route)
        if contract:
            self._hold("the agent", contract, body)
        elif route not in _REQUESTS or body:
            self.violations.append(f"the agent's request '{line}' with body '{body}' fits no contract")

    def _hold(self, who: str, contract: str, text: str) -> None:
        broken = None if contract in self._allowed else violation_of_text(contract, text)
        if broken:
            self.violations.append(f"{who} breaks the contract {contract}: {broken}; it said: {text}")


@cache
def _schemas() -> dict[str, Any]:
    files = FOLDER.glob(f"*{_SUFFIX}")
    return {file.name.removesuffix(_SUFFIX): json.loads(file.read_text()) for file in files}


@cache
def _validator(name: str) -> Any:
    """Cached: reading the schemas takes longer than checking a message."""
    schema = _schemas()[name]
    return Draft202012Validator(schema, **_references(schema))


def _references(schema: dict[str, Any]) -> dict[str, Any]:
    """The argument that lets a validator find the other schemas: a registry, or a resolver for libraries
    without registries."""
    known = {each["$id"]: each for each in _schemas().values()}
    try:
        from referencing import Registry
    except ImportError:
        from jsonschema import RefResolver

        return {"resolver": RefResolver(schema["$id"], schema, known)}
    return {"registry": Registry().with_contents(known.items())}


def _no_number(constant: str) -> None:
    raise ValueError(f"{constant} is no JSON number")


def main() -> int:
    """Entry point of the command-line check."""
    parser = argparse.ArgumentParser(prog="python3 -m sandbox.contracts")
    parser.add_argument("contract", choices=names())
    parser.add_argument("file", nargs="+", type=Path)
    arguments = parser.parse_args()
    try:
        broken = {file: violation_of_text(arguments.contract, file.read_text()) for file in arguments.file}
    except (OSError, UnicodeDecodeError) as error:
        parser.error(f"cannot read the file: {error}")
    for file, complaint in broken.items():
        print(f"{file}: {complaint or 'keeps to the contract'}")
    return 1 if any(broken.values()) else 0


if __name__ == "__main__":
    sys.exit(main())
