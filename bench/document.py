"""Writes docs/performance.md and its plots from a report."""

from __future__ import annotations

from pathlib import Path

from bench import plots
from bench.figures import Report
from bench.page import page
from sandbox import REPOSITORY

DOCS = REPOSITORY / "docs"


def write(report: Report) -> list[Path]:
    """Write the page and its plots; returns their paths."""
    text = DOCS / "performance.md"
    text.write_text(page(report))
    drawings = {"day": plots.draw_day, "ratios": plots.draw_ratios, "growth": plots.draw_series}
    written = [text]
    for name, draw in drawings.items():
        written.append(DOCS / f"performance-{name}.svg")
        draw(report.figures, written[-1])
    return written
