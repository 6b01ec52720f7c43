"""Measures one group inside a box; what it finds goes out as JSON, one object a line."""

from __future__ import annotations

import argparse
import importlib
import json
import sys
from dataclasses import asdict
from typing import Any

from bench.plan import Plan


def tell(**known: Any) -> None:
    """Send an object to the program outside."""
    print(json.dumps(known, ensure_ascii=False), flush=True)


def main() -> int:
    """Entry point, for bench.runner."""
    parser = argparse.ArgumentParser()
    parser.add_argument("group")
    parser.add_argument("--runs", type=int, required=True)
    parser.add_argument("--records", type=int, required=True)
    parser.add_argument("--quick", action="store_true")
    arguments = parser.parse_args()
    plan = Plan(arguments.runs, arguments.quick, arguments.records, lambda text: tell(step=text))
    for figure in importlib.import_module(f"bench.groups.{arguments.group}").measure(plan):
        tell(figure=asdict(figure))
    return 0


if __name__ == "__main__":
    sys.exit(main())
