"""Writes docs/performance.md and its plots from a report."""

from __future__ import annotations

import re
from pathlib import Path

from bench import plots
from bench.figures import Figure, Report
from bench.table import page_table
from sandbox import REPOSITORY

DOCS = REPOSITORY / "docs"
_TEMPLATE = Path(__file__).with_name("performance.md.in")


def write(report: Report) -> list[Path]:
    """The files written."""
    page = DOCS / "performance.md"
    page.write_text(_page(report))
    written = [page, DOCS / "performance-ratios.svg", DOCS / "performance-growth.svg"]
    plots.draw_ratios(report.figures, written[1])
    plots.draw_series(report.figures, written[2])
    return written


def _page(report: Report) -> str:
    """The template with "@table GROUP@" and "@circumstances@" filled in."""
    text = _TEMPLATE.read_text().replace("@circumstances@", _circumstances(report))
    return re.sub(r"@table (\w+)@", lambda found: page_table(_group(report, found[1])), text)


def _group(report: Report, group: str) -> list[Figure]:
    return [figure for figure in report.figures if figure.name.split(".")[0] == group]


def _circumstances(report: Report) -> str:
    lines = ["| group | measured | runs | load before | on |", "| --- | --- | ---: | ---: | --- |"]
    for group, known in report.circumstances.items():
        machine = f"{known['processors']} × {known['processor']}, Linux {known['kernel']}"
        lines.append(f"| {group} | {known['date']} | {known['runs']} | {known['load']:.1f} | {machine} |")
    return "\n".join(lines)
