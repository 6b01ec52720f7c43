"""Runs the fuzz targets one after the other, each in a box of its own, with a line on the outcome of each.

What libFuzzer learns stays in the build folder, so that the next run goes on from there. An input that a
target fell over is put into the target's corpus, where the ordinary tests replay it.
"""

from __future__ import annotations

import argparse
import json
import os
import re
import shutil
import subprocess
from pathlib import Path
from typing import Any, Iterator

from sandbox import contracts
from sandbox.ending import exit_with
from sandbox.policies import POLICIES

_HERE = Path(__file__).resolve().parent
_REPOSITORY = _HERE.parents[1]
_BUILD = _REPOSITORY / "build" / "fuzz"
_TARGETS = sorted(folder.name for folder in (_HERE / "corpus").iterdir())

# Of the JSON that a target reads.
_CONTRACTS = {
    "information": ["user-info"],
    "inventory": ["software-list"],
    "platform": ["password-tips-reply", "platform-messages"],
    "policy": ["policy-message"],
}

_ANSWER_SECONDS = 40  # longer than any limit of the agent: what takes more than that hangs
_MOST_MEMORY_MB = 1024
_LONGEST_INPUT = 4096


def _learnt(target: str) -> Path:
    return _BUILD / "learnt" / target


def _findings(target: str) -> Path:
    return _BUILD / "findings" / target


def dictionary(target: str) -> str:
    """The words that the inputs of a target are made of: its own, and those of JSON and its contracts."""
    own = _HERE / f"{target}.dict"
    words = [own.read_text()] if own.exists() else []
    if target in _CONTRACTS:
        words.append((_HERE / "json.dict").read_text())
        schemas = [json.loads(contracts.schema_file(name).read_text()) for name in _CONTRACTS[target]]
        words += [f'"\\"{name}\\""\n' for name in sorted(set(_property_names(schemas)))]
    if target == "policy":
        words += [f'"{code}"\n' for code in POLICIES]
    return "".join(words)


def _property_names(schema: Any) -> Iterator[str]:
    if isinstance(schema, dict):
        yield from schema.get("properties", ())
        schema = list(schema.values())
    if isinstance(schema, list):
        for part in schema:
            yield from _property_names(part)


def _dictionary_file(target: str) -> Path:
    file = _BUILD / f"{target}.dict"
    file.write_text(dictionary(target))
    return file


def _command(target: str, seconds: int) -> list[str]:
    return [
        *(str(_REPOSITORY / "sandbox" / "in-box"), "--"),
        str(_BUILD / "tests" / "fuzz" / f"fuzz_{target}"),
        f"-max_total_time={seconds}",
        f"-timeout={_ANSWER_SECONDS}",
        f"-rss_limit_mb={_MOST_MEMORY_MB}",
        f"-max_len={_LONGEST_INPUT}",
        "-print_final_stats=1",
        f"-dict={_dictionary_file(target)}",
        f"-artifact_prefix={_findings(target)}/",
        *(str(_learnt(target)), str(_HERE / "corpus" / target)),
    ]


def _statistic(log: str, name: str) -> str:
    found = re.search(rf"stat::{name}:\s+(\d+)", log)
    return found[1] if found else "?"


def _run(target: str, seconds: int) -> bool:
    """Fuzz one target; whether it stood."""
    shutil.rmtree(_findings(target), ignore_errors=True)
    for folder in (_learnt(target), _findings(target)):
        folder.mkdir(parents=True, exist_ok=True)
    known = len(list(_learnt(target).iterdir()))
    path = _BUILD / f"{target}.log"
    # A full quarantine must not look like a leak.
    env = {**os.environ, "ASAN_OPTIONS": "quarantine_size_mb=16"}
    with path.open("wb") as file:
        command = _command(target, seconds)
        status = subprocess.run(command, env=env, stdout=file, stderr=subprocess.STDOUT).returncode
    log = path.read_text(errors="replace")
    outcome = (
        f"{target}: {_statistic(log, 'number_of_executed_units')} inputs, "
        f"{_statistic(log, 'average_exec_per_sec')}/s, {_statistic(log, 'peak_rss_mb')} MB at most, "
        f"{len(list(_learnt(target).iterdir())) - known} new in the corpus"
    )
    if status == 0:
        print(f"{outcome}, nothing found", flush=True)
        return True
    kept = [shutil.copy(found, _HERE / "corpus" / target) for found in sorted(_findings(target).iterdir())]
    where = " ".join(str(Path(each).relative_to(_REPOSITORY)) for each in kept) or "no input"
    print(f"{outcome}, FELL over {where}; see {path.relative_to(_REPOSITORY)}", flush=True)
    return False


def main() -> int:
    """Entry point; the exit status is 1 if anything was found."""
    parser = argparse.ArgumentParser(prog="dev fuzz", description=__doc__)
    parser.add_argument("--seconds", type=int, default=60, metavar="N", help="time per target (default: 60)")
    among = f"of {', '.join(_TARGETS)} (default: all)"
    parser.add_argument("targets", nargs="*", metavar="TARGET", help=among)
    options = parser.parse_args()
    for target in options.targets:
        if target not in _TARGETS:
            parser.error(f"there is no target '{target}'; choose from {', '.join(_TARGETS)}")
    stood = [_run(target, options.seconds) for target in options.targets or _TARGETS]
    return 0 if all(stood) else 1


if __name__ == "__main__":
    exit_with(main)
