"""The command ./dev bench."""

from __future__ import annotations

import argparse
import sys
from pathlib import Path

from rich.console import Console
from rich.progress import BarColumn, MofNCompleteColumn, Progress, TaskID, TextColumn, TimeElapsedColumn

from bench import comparison, figures, runner, table
from bench.figures import Figure, Report
from bench.noise import Noise
from bench.runner import GROUPS, ON_DEMAND, Options
from sandbox import REPOSITORY
from sandbox.ending import exit_with

_BASELINE = Path(__file__).with_name("baseline.json")
_REPORT = REPOSITORY / "build" / "bench" / "report.json"
_QUICK_REPORT = _REPORT.with_name("quick.json")
# What CI judges: the other groups have times only, or take too long.
_QUICK_GROUPS = ("start", "memory", "forwarding", "drain", "dock")


def _parser() -> argparse.ArgumentParser:
    parser = argparse.ArgumentParser(prog="./dev bench", description="Measure the agent against bare floors.")
    parser.add_argument("figures", nargs="*", metavar="FIGURE", help=f"{', '.join(GROUPS)}; else all")
    parser.add_argument("--runs", type=int, default=5, help="least runs of each figure (default: 5)")
    parser.add_argument("--records", type=int, default=100_000, help="length of the inventory file; 0: none")
    parser.add_argument(
        "--quick", action="store_true", help="only instructions and memory, judged by bench/baseline.json"
    )
    parser.add_argument("--json", type=Path, metavar="FILE", help="where the figures go; others there stay")
    parser.add_argument("--compare", type=_report, metavar="FILE", help="show what changed since this run")
    parser.add_argument("--no-measure", action="store_true", help="show the figures of the last run again")
    parser.add_argument("--write-docs", action="store_true", help="write docs/performance.md, docs/scale.md")
    parser.add_argument("--write-baseline", action="store_true", help="let CI judge by this quick run")
    return parser


def _report(name: str) -> Report:
    try:
        return figures.load(Path(name))
    except (OSError, ValueError, KeyError, TypeError) as error:
        raise argparse.ArgumentTypeError(f"{name} is not a report of a run ({error})") from error


def _options(arguments: argparse.Namespace) -> Options:
    default = _QUICK_GROUPS if arguments.quick else tuple(group for group in GROUPS if group not in ON_DEMAND)
    return Options(
        arguments.figures or default,
        1 if arguments.quick else arguments.runs,
        arguments.quick,
        arguments.records,
    )


def _measure(options: Options, report: Report, path: Path, console: Console) -> tuple[Report, list[str]]:
    """The report with the new figures in the place of those of the same groups, saved after each group."""
    failures: list[str] = []
    columns = (TextColumn("{task.description}"), BarColumn(), MofNCompleteColumn(), TimeElapsedColumn())
    with Progress(*columns, console=console) as progress:
        task = progress.add_task("", total=len(options.boxes))
        for group in options.groups:
            measured, noise, failed = _measure_group(options, group, progress, task)
            failures += failed
            circumstances = {**report.circumstances, group: runner.circumstances(noise)}
            report = _merged(report, Report(circumstances, measured))
            report.save(path)
    return report, failures


def _measure_group(
    options: Options, group: str, progress: Progress, task: TaskID
) -> tuple[list[Figure], Noise, list[str]]:
    """The group's figures, what else the machine did, and what went wrong."""
    measured: list[Figure] = []
    noise = Noise()
    failures = []
    for user in GROUPS[group]:
        try:
            found, other = runner.measure(
                options, group, user, lambda step: progress.update(task, description=step)
            )
            measured, noise = [*measured, *found], noise + other
        except runner.Failure as failure:
            failures.append(str(failure))
        progress.advance(task)
    return measured, noise, failures


def _merged(known: Report, fresh: Report) -> Report:
    replaced = {figure.group for figure in fresh.figures}
    kept = [figure for figure in known.figures if figure.group not in replaced]
    prefixes = [group.removesuffix("_agents") for group in GROUPS]
    return Report(
        fresh.circumstances, sorted([*kept, *fresh.figures], key=lambda one: prefixes.index(one.group))
    )


def _judge(report: Report, console: Console) -> int:
    """Whether nothing rose: the exit status."""
    baseline = figures.load(_BASELINE).figures
    changes = [one for one in comparison.changes(report.figures, baseline) if one.is_judged]
    console.print(table.comparison_table(changes))
    gone = comparison.missing(report.figures, baseline)
    for name in gone:
        console.print(f"not measured: {name}")
    rises = [change.figure.title for change in changes if change.is_rise]
    for title in rises:
        console.print(f"more than {comparison.TOLERATED_RISE:.0%} above the committed figure: {title}")
    return 1 if rises or gone else 0


def _steady(report: Report) -> Report:
    steady = [figure for figure in report.figures if figure.kind in comparison.STEADY_KINDS]
    return Report(report.circumstances, steady)


def _refuse(reason: str) -> int:
    print(f"bench: {reason}", file=sys.stderr)
    return 2


def main() -> int:
    """Entry point; the status is 0 if all was measured and nothing rose that is judged."""
    arguments = _parser().parse_args()
    unknown = set(arguments.figures) - set(GROUPS)
    console = Console(highlight=False)
    if unknown:
        return _refuse(f"there is no figure called {', '.join(sorted(unknown))}; see ./dev bench --help")
    options = _options(arguments)
    path = arguments.json or (_QUICK_REPORT if arguments.quick else _REPORT)
    if arguments.no_measure and not path.exists():
        return _refuse(f"there are no figures in {path} yet; measure first")
    report = Report({})
    if path.exists() and (arguments.no_measure or not arguments.quick):
        try:
            report = _report(str(path))
        except argparse.ArgumentTypeError as error:
            return _refuse(f"{error}; remove it")
    failures: list[str] = []
    if not arguments.no_measure:
        report, failures = _measure(options, report, path, console)
    _show(report, options, console)
    status = _after(arguments, report, console)
    for failure in failures:
        console.print(f"failed: {failure}")
    return 1 if failures else status


def _show(report: Report, options: Options, console: Console) -> None:
    """The figures, and how far they can be trusted."""
    for group in dict.fromkeys(figure.group for figure in report.figures):
        console.print(table.terminal_table(report.group(group)))
    measured = [figure for figure in report.figures if figure.kind not in comparison.STEADY_KINDS]
    for line in table.unstable(measured):
        console.print(line)
    for group in options.groups:
        known = report.circumstances.get(group)
        if known:
            others, stolen = (f"{known[name]:.0%}" for name in ("others", "stolen"))
            console.print(
                f"noise, {group}: other programs used {others} of the processors, the host {stolen}"
            )


def _after(arguments: argparse.Namespace, report: Report, console: Console) -> int:
    if arguments.write_docs:
        from bench import document  # the plotting library takes a while to load
        from bench.fleet import page

        written = [*document.write(report), *page.write(report)]
        console.print("written: " + ", ".join(str(path.relative_to(REPOSITORY)) for path in written))
    if arguments.compare:
        console.print(table.comparison_table(comparison.changes(report.figures, arguments.compare.figures)))
    if arguments.write_baseline:
        _steady(report).save(_BASELINE)
        return 0
    return _judge(report, console) if arguments.quick else 0


if __name__ == "__main__":
    exit_with(main)
