"""The policies that the agent carries out itself, read from their contract."""

from __future__ import annotations

import json
from typing import Iterator, NamedTuple

from sandbox import contracts


class Policy(NamedTuple):
    """One entry of the contract; audience and action are named as in the agent's table."""

    code: int
    meaning: str
    audience: str
    action: str
    notice: str
    english_notice: str

    def __str__(self) -> str:
        return f"{self.code}"


def _own_policies() -> Iterator[Policy]:
    groups = json.loads(contracts.schema_file("policy-message").read_text())["$defs"]
    for group in groups["ownCode"]["anyOf"]:
        audience = group["$ref"].rpartition("/")[2]
        for entry in groups[audience]["anyOf"]:
            code, meaning, notice = entry["const"], entry["title"], entry["x-notice"]
            yield Policy(code, meaning, audience, entry["x-action"], notice["zh"], notice["en"])


POLICIES = {policy.code: policy for policy in sorted(_own_policies())}
# A sample of all other codes: the neighbours of the agent's own, and a few more.
FORWARDED_CODES = tuple(
    sorted({0, 5, 1100}.union(*({code - 1, code + 1} for code in POLICIES)) - POLICIES.keys())
)


def with_action(*actions: str) -> list[Policy]:
    """The policies with one of these actions."""
    return [policy for policy in POLICIES.values() if policy.action in actions]


def for_one_account() -> list[Policy]:
    """The policies whose payload names the user concerned."""
    return [policy for policy in POLICIES.values() if policy.audience == "AddressedDomainUser"]


def for_domain_users() -> list[Policy]:
    """The policies that do not apply to local users."""
    return [policy for policy in POLICIES.values() if policy.audience != "EverySession"]
