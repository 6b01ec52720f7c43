"""Changes the agent's sources in single places and looks which changes the tests do not notice.

    ./dev mutate [--limit N] [--seed S] [--jobs N] [--quick] [--again] [FILE...]

Works in copies of the tree under build/mutate. Each mutant is built and meets the unit tests of its file, and
only if it survives them the end-to-end tests (see areas.py).
"""

from __future__ import annotations

import argparse
import sys
from collections import Counter
from concurrent.futures import ThreadPoolExecutor
from dataclasses import dataclass
from queue import SimpleQueue
from random import Random
from typing import Container, Iterable, Literal, Sequence

from sandbox.ending import exit_with
from tests.mutation import explanations
from tests.mutation.areas import Area, area_of, chosen
from tests.mutation.mutants import Mutant, mutants
from tests.mutation.workshop import FOLDER, REPOSITORY, Verdict, Workshop, WorkshopTrouble, stopping

_LEAST_CAUGHT = 90  # per cent of a component's mutants that are not explained
_VERDICTS = FOLDER / "verdicts.txt"  # of the last run, a line each

Outcome = Verdict | Literal["explained"]


@dataclass(frozen=True)
class Task:
    """A mutant with the tests that it has to meet."""

    mutant: Mutant
    area: Area


def tasks_for(areas: Sequence[Area]) -> tuple[list[Task], int]:
    """All mutants of the areas' files, and how many were left out because they change no more than a log."""
    tasks: list[Task] = []
    left_out = 0
    for file in dict.fromkeys(area.file for area in areas):
        found, log_only = mutants(file, (REPOSITORY / file).read_text())
        tasks += [Task(mutant, area_of(file, mutant.function)) for mutant in found]
        left_out += log_only
    return tasks, left_out


def judge_all(
    tasks: Sequence[Task], known: Container[explanations.Key], jobs: int, quick: bool
) -> list[Outcome]:
    """What becomes of each mutant that is not `known` to survive; other survivors are printed at once."""
    FOLDER.mkdir(parents=True, exist_ok=True)
    workshops: SimpleQueue[Workshop] = SimpleQueue()
    for number in range(jobs):
        workshop = Workshop(f"tree-{number}")
        workshop.prepare(list(dict.fromkeys(task.area for task in tasks)))
        workshops.put(workshop)

    def judge(task: Task) -> Outcome:
        if explanations.key_of(task.mutant) in known:
            return "explained"
        workshop = workshops.get()
        try:
            verdict = workshop.judge(task.mutant, task.area, quick)
        finally:
            workshops.put(workshop)
        if verdict == "survived":
            print(task.mutant, flush=True)
        return verdict

    with ThreadPoolExecutor(jobs) as workers:
        try:
            return list(workers.map(judge, tasks))
        except KeyboardInterrupt:
            stopping.set()
            raise


def report(tasks: Sequence[Task], outcomes: Sequence[Outcome], left_out: int, is_sample: bool) -> int:
    """Say what came of each component; the result is the exit status. The share is that of the mutants that
    are not explained; a sample is too small to be judged by it."""
    weak = []
    print(f"\n{'component':16}{'mutants':>9}{'explained':>11}{'caught':>9}{'survived':>10}")
    for component in sorted({task.area.component for task in tasks}):
        pairs = zip(tasks, outcomes)
        count = Counter(outcome for task, outcome in pairs if task.area.component == component)
        caught, survived = count["caught"], count["survived"]
        share = 100 * caught / (caught + survived) if caught + survived else 100.0
        whole = count.total() - count["invalid"]
        print(f"{component:16}{whole:>9}{count['explained']:>11}{caught:>9}{survived:>10}{share:>8.1f} %")
        if share < _LEAST_CAUGHT and not is_sample:
            weak.append(component)
    invalid = outcomes.count("invalid")
    print(f"not counted: {invalid} that do not compile, {left_out} that change no more than a log text")
    if weak:
        print(f"mutate: less than {_LEAST_CAUGHT} % caught: {', '.join(weak)}")
    return 1 if weak else 0


def main() -> int:
    """Entry point; the status is 0 if enough mutants of each component were caught."""
    options = _parser().parse_args()
    try:
        areas = chosen(options.file)
        tasks, left_out = tasks_for(areas)
        known = explanations.read(explanations.FILE.read_text())
        _require_fresh(known, tasks)
        tasks = _selected(tasks, options)
        print(f"{len(tasks)} mutants", flush=True)
        outcomes = judge_all(tasks, known, options.jobs, options.quick)
    except (WorkshopTrouble, ValueError) as trouble:
        print(f"mutate: {trouble}", file=sys.stderr)
        return 1
    _VERDICTS.write_text("".join(f"{outcome} {task.mutant}\n" for task, outcome in zip(tasks, outcomes)))
    return report(tasks, outcomes, left_out, options.limit is not None)


def _require_fresh(known: Iterable[explanations.Key], tasks: Sequence[Task]) -> None:
    stale = explanations.stale(known, [task.mutant for task in tasks])
    if stale:
        lines = "".join(f"\n{key.place}: {key.before} → {key.after}" for key in stale)
        raise WorkshopTrouble(f"{explanations.FILE.name} explains mutants that are gone:{lines}")


def _selected(tasks: list[Task], options: argparse.Namespace) -> list[Task]:
    if options.again:
        verdicts = set(_VERDICTS.read_text().splitlines())
        tasks = [task for task in tasks if f"survived {task.mutant}" in verdicts]
    if options.limit is not None and options.limit < len(tasks):
        kept = sorted(Random(options.seed).sample(range(len(tasks)), options.limit))
        tasks = [tasks[place] for place in kept]
    return tasks


def _parser() -> argparse.ArgumentParser:
    parser = argparse.ArgumentParser(prog="./dev mutate", description="Do the tests notice single changes?")
    parser.add_argument("file", nargs="*", metavar="FILE", help="source files, or patterns for them")
    parser.add_argument("--limit", type=int, metavar="N", help="try N mutants, chosen at random")
    parser.add_argument("--seed", type=int, default=1, metavar="S", help="another choice (default: 1)")
    parser.add_argument("--jobs", type=int, default=1, metavar="N", help="mutants at a time (default: 1)")
    parser.add_argument("--quick", action="store_true", help="only the unit tests")
    parser.add_argument("--again", action="store_true", help="only those that survived the last time")
    return parser


if __name__ == "__main__":
    exit_with(main)
