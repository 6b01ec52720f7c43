"""Measures one group inside a box; prints steps and figures as JSON, one object per line."""

from __future__ import annotations

import argparse
import importlib
import json
import sys
from dataclasses import asdict
from typing import Any

from bench import noise
from bench.plan import Plan


def send(**known: Any) -> None:
    """Send an object to bench.runner on the host."""
    print(json.dumps(known, ensure_ascii=False), flush=True)


def main() -> int:
    """Entry point, for bench.runner."""
    parser = argparse.ArgumentParser()
    parser.add_argument("group")
    parser.add_argument("--runs", type=int, required=True)
    parser.add_argument("--records", type=int, required=True)
    parser.add_argument("--quick", action="store_true")
    arguments = parser.parse_args()
    plan = Plan(arguments.runs, arguments.quick, arguments.records, lambda text: send(step=text))
    before = noise.processors()
    for figure in importlib.import_module(f"bench.groups.{arguments.group}").measure(plan):
        send(figure=asdict(figure))
    send(noise=asdict(noise.processors().noise_since(before)))
    return 0


if __name__ == "__main__":
    sys.exit(main())
