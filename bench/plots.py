"""Plots of a report, the same bytes for the same figures."""

from __future__ import annotations

from pathlib import Path
from typing import Any, Sequence

from matplotlib import pyplot

from bench.figures import Figure

_SETTINGS = {"svg.hashsalt": "bench", "svg.fonttype": "none", "font.size": 8, "font.family": "sans-serif"}
_AGENT, _FLOOR, _GOAL = "#1f5fa8", "#999999", "#c0392b"
_SERIES = {
    "forwarding.latency": ("latency of a forwarded policy", "bytes", "µs"),
    "inventory.items": ("inventory", "launcher items", "ms"),
    "drain.Rss": ("resident after a drain", "messages", "KiB"),
}


def save(figure: Any, path: Path) -> None:
    """Write a plot as SVG, without a date."""
    figure.savefig(path, format="svg", metadata={"Date": None, "Creator": None}, bbox_inches="tight")
    pyplot.close(figure)
    path.write_text("\n".join(line.rstrip() for line in path.read_text().splitlines()) + "\n")


def settings() -> Any:
    """A context in which plots are drawn."""
    return pyplot.rc_context(_SETTINGS)


def draw_ratios(figures: Sequence[Figure], path: Path) -> None:
    """Each figure that is to stay within a multiple of its floor, with that limit."""
    shown = [figure for figure in figures if figure.goal and figure.goal.of == "floor"][::-1]
    with settings():
        drawing, axes = pyplot.subplots(figsize=(7, 0.22 * len(shown) + 0.8))
        places = range(len(shown))
        axes.barh(places, [figure.ratio or 0 for figure in shown], color=_AGENT, height=0.6)
        for place, figure in zip(places, shown):
            assert figure.goal
            axes.plot([figure.goal.limit] * 2, [place - 0.45, place + 0.45], color=_GOAL, linewidth=2)
        axes.axvline(1, color=_FLOOR, linewidth=1)
        axes.set_yticks(places, [f"{figure.title} ({figure.kind})" for figure in shown])
        axes.set_xlabel("times the floor; red: the limit, from above or, for rates, from below")
        axes.spines[["top", "right"]].set_visible(False)
        save(drawing, path)


def draw_series(figures: Sequence[Figure], path: Path) -> None:
    """How some costs grow with the work, for the agent and for the floor."""
    with settings():
        drawing, all_axes = pyplot.subplots(1, len(_SERIES), figsize=(9, 2.4), layout="constrained")
        for axes, (name, (title, abscissa, unit)) in zip(all_axes, _SERIES.items()):
            points = sorted((figure for figure in figures if figure.series == name), key=lambda one: one.x)
            places = [figure.x for figure in points]
            axes.plot(places, [figure.middle for figure in points], "o-", color=_AGENT, label="agent")
            if not name.startswith("drain"):  # there the floor is the shortest row
                axes.plot(
                    places, [figure.floor_middle for figure in points], "s--", color=_FLOOR, label="floor"
                )
            axes.set(title=title, xlabel=abscissa, ylabel=unit, xscale="log")
            axes.set_ylim(0, 1.1 * axes.get_ylim()[1])
            axes.legend(frameon=False)
            axes.spines[["top", "right"]].set_visible(False)
        save(drawing, path)
