"""Runs the fuzz targets one after the other, each in a box of its own, with a line on the outcome of each.

What libFuzzer learns stays in the build folder, so that the next run goes on from there. An input that a
target fell over is put into the target's corpus, where the ordinary tests replay it.
"""

from __future__ import annotations

import argparse
import os
import re
import shutil
import subprocess
from pathlib import Path

from sandbox.ending import exit_with
from sandbox.policies import POLICIES

_HERE = Path(__file__).resolve().parent
_REPOSITORY = _HERE.parents[1]
_BUILD = _REPOSITORY / "build" / "fuzz"
_TARGETS = sorted(folder.name for folder in (_HERE / "corpus").iterdir())

_ANSWER_SECONDS = 40  # longer than any limit of the agent: what takes more than that hangs
_MOST_MEMORY_MB = 1024
_LONGEST_INPUT = 4096


def _learnt(target: str) -> Path:
    return _BUILD / "learnt" / target


def _findings(target: str) -> Path:
    return _BUILD / "findings" / target


def dictionary(target: str) -> str:
    """The words that the inputs of a target are made of; the codes of policies come from their contract."""
    words = (_HERE / f"{target}.dict").read_text()
    return words + "".join(f'"{code}"\n' for code in POLICIES) if target == "policy" else words


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


def _environment() -> dict[str, str]:
    return {
        **os.environ,
        # A full quarantine must not look like a leak.
        "ASAN_OPTIONS": "quarantine_size_mb=16",
    }


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
    with path.open("wb") as file:
        status = subprocess.run(
            _command(target, seconds), env=_environment(), stdout=file, stderr=subprocess.STDOUT
        ).returncode
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
    parser.add_argument(
        "targets", nargs="*", metavar="TARGET", help=f"of {', '.join(_TARGETS)} (default: all)"
    )
    options = parser.parse_args()
    for target in options.targets:
        if target not in _TARGETS:
            parser.error(f"there is no target '{target}'; choose from {', '.join(_TARGETS)}")
    stood = [_run(target, options.seconds) for target in options.targets or _TARGETS]
    return 0 if all(stood) else 1


if __name__ == "__main__":
    exit_with(main)
