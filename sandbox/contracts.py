"""The JSON contracts: what crosses a wire of the terminal is held against the schemas of contracts/json/.

    /usr/bin/python3 -m sandbox.contracts CONTRACT FILE...

checks messages of one's own; the status is 0 if all keep to the contract.
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
_BYTE_ORDER_MARK = "\ufeff"  # at the beginning of a text it does not reach the agent

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
    """In what a JSON value breaks a contract, None when it keeps to it."""
    error = best_match(_validator(name).iter_errors(value))
    return f"{error.json_path}: {error.message}" if error else None


def violation_of_text(name: str, text: str) -> str | None:
    """In what a text breaks a contract; one that is no JSON breaks every one."""
    try:
        value = json.loads(text, parse_constant=_no_number)
    except ValueError as error:
        return f"no JSON: {error}"
    return violation(name, value)


def require(name: str, value: Any) -> None:
    """AssertionError if a value that the box itself made up breaks its contract."""
    broken = violation(name, value)
    assert broken is None, f"the box breaks the contract {name}: {broken}"


class Contracts:
    """Watches the terminal's wires. Everything that the agent says in JSON must keep to its contract, and so
    must what the platform answers by itself; what breaks one is kept in `violations`.

    What a test has the services say instead, texts and bytes as they stand, may be anything.
    """

    def __init__(self, events: Events) -> None:
        self.violations: list[str] = []
        self._excused: set[str] = set()
        self._pushed: Counter[str] = Counter()
        events.subscribe(self._look_at)

    def excuse(self, name: str) -> None:
        """From now on the agent may break this contract, as one that relays garbage does."""
        self._excused.add(name)

    def _look_at(self, event: Event) -> None:
        # What fits none of these in the number or type of its arguments breaks the D-Bus contract already.
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
            self.violations.append(f"the agent forwarded what was not pushed, or once too often: {text}")
        self._pushed[text] -= 1
        self._hold("the agent", "forwarded-policy", text)

    def _look_at_upload(self, address: str, text: str) -> None:
        if address in _UPLOADS:
            self._hold("the agent", _UPLOADS[address], text)
        else:
            self.violations.append(f"the agent wants an upload to {address}, which no contract describes")

    def _look_at_request(self, route: str, line: str, body: str) -> None:
        contract = _REQUESTS.get(route)
        if contract:
            self._hold("the agent", contract, body)
        elif route not in _REQUESTS or body:
            self.violations.append(f"the agent's request '{line}' with body '{body}' fits no contract")

    def _hold(self, who: str, contract: str, text: str) -> None:
        broken = None if contract in self._excused else violation_of_text(contract, text)
        if broken:
            self.violations.append(f"{who} breaks the contract {contract}: {broken}; it said: {text}")


@cache
def _schemas() -> dict[str, Any]:
    files = FOLDER.glob(f"*{_SUFFIX}")
    return {file.name.removesuffix(_SUFFIX): json.loads(file.read_text()) for file in files}


@cache
def _validator(name: str) -> Any:
    """Made once: reading and checking the schemas takes longer than checking a message."""
    schema = _schemas()[name]
    return Draft202012Validator(schema, **_references(schema))


def _references(schema: dict[str, Any]) -> dict[str, Any]:
    """The argument that lets a validator find the other schemas: older libraries know no registry, newer ones
    are about to know nothing else."""
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
    """Entry point for people who check their own messages."""
    parser = argparse.ArgumentParser(prog="python3 -m sandbox.contracts")
    parser.add_argument("contract", choices=names())
    parser.add_argument("file", nargs="+", type=Path)
    arguments = parser.parse_args()
    try:
        broken = {file: violation_of_text(arguments.contract, file.read_text()) for file in arguments.file}
    except (OSError, UnicodeDecodeError) as error:
        parser.error(f"cannot read what is to be checked: {error}")
    for file, complaint in broken.items():
        print(f"{file}: {complaint or 'keeps to the contract'}")
    return 1 if any(broken.values()) else 0


if __name__ == "__main__":
    sys.exit(main())
