"""Plots of a report, the same bytes for the same figures."""

from __future__ import annotations

from pathlib import Path
from typing import Any, Sequence

from matplotlib import pyplot
from matplotlib.ticker import FuncFormatter

from bench.days import REQUESTS, USERS
from bench.figures import Figure
from bench.stability import WORST_WRITTEN

_SETTINGS = {"svg.hashsalt": "bench", "svg.fonttype": "none", "font.size": 8, "font.family": "sans-serif"}
_AGENT, _FLOOR, _GOAL = "#1f5fa8", "#999999", "#c0392b"
_SERIES = {
    "forwarding.latency": ("latency of a forwarded policy", "bytes", "µs"),
    "inventory.items": ("inventory", "launcher items", "s"),
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
    """Draw each figure with a limit relative to its floor, and that limit."""
    shown = [figure for figure in figures if _is_shown(figure)][::-1]
    with settings():
        drawing, axes = pyplot.subplots(figsize=(7, 0.22 * len(shown) + 0.8))
        places = range(len(shown))
        ratios = [figure.ratio or float("nan") for figure in shown]
        axes.hlines(places, 1, ratios, color=_AGENT, linewidth=1)
        axes.plot(ratios, places, "o", color=_AGENT, markersize=4)
        for place, figure in zip(places, shown):
            assert figure.goal
            axes.plot([figure.goal.limit] * 2, [place - 0.45, place + 0.45], color=_GOAL, linewidth=2)
        axes.axvline(1, color=_FLOOR, linewidth=1)
        _set_ratio_scale(axes)
        axes.set_yticks(places, [f"{figure.title} ({figure.kind})" for figure in shown])
        axes.set_xlabel(
            "times the floor, twice as far for twice as much; red: the limit, for rates the least"
        )
        axes.spines[["top", "right"]].set_visible(False)
        save(drawing, path)


def _is_shown(figure: Figure) -> bool:
    if figure.goal is None or figure.goal.of != "floor":
        return False
    return figure.uncertainty <= WORST_WRITTEN


def _set_ratio_scale(axes: Any) -> None:
    """Half as much lies as far from the floor as twice as much."""
    axes.set_xscale("log", base=2)
    axes.xaxis.set_major_formatter(FuncFormatter(lambda ratio, _place: f"{ratio:g}"))
    axes.set_xlim(min(axes.get_xlim()[0], 0.5), max(axes.get_xlim()[1], 2))


def draw_series(figures: Sequence[Figure], path: Path) -> None:
    """Draw the growth of some costs with the work, for the agent and for the floor."""
    with settings():
        drawing, all_axes = pyplot.subplots(1, len(_SERIES), figsize=(9, 2.4), layout="constrained")
        for axes, (name, (title, abscissa, unit)) in zip(all_axes, _SERIES.items()):
            points = sorted((figure for figure in figures if figure.series == name), key=lambda one: one.x)
            places = [figure.x for figure in points]
            axes.plot(places, [figure.middle for figure in points], "o-", color=_AGENT, label="agent")
            if not name.startswith("drain"):  # there the floor is the shortest backlog
                axes.plot(
                    places, [figure.floor_middle for figure in points], "s--", color=_FLOOR, label="floor"
                )
            axes.set(title=title, xlabel=abscissa, ylabel=unit, xscale="log")
            axes.set_ylim(0, 1.1 * axes.get_ylim()[1])
            axes.legend(frameon=False)
            axes.spines[["top", "right"]].set_visible(False)
        save(drawing, path)


def draw_day(figures: Sequence[Figure], path: Path) -> None:
    """Processor time and bytes on the network, a bar for each user, by what they are for."""
    known = {figure.name.removeprefix("day."): figure.middle for figure in figures}
    panels: dict[str, dict[str, str]] = {
        "processor time, s": {"tools": "package tools", "cpu": "the agent"},
        "on the network, kB": {f"bytes.{route}": title for route, title in REQUESTS.items()},
    }
    with settings():
        drawing, all_axes = pyplot.subplots(len(panels), 1, figsize=(8, 2.8), layout="constrained")
        for axes, (title, parts) in zip(all_axes, panels.items()):
            _draw_bars(axes, known, parts)
            axes.set_xlabel(title)
        all_axes[0].set_title("an ordinary day")
        save(drawing, path)


def _draw_bars(axes: Any, known: dict[str, float], parts: dict[str, str]) -> None:
    users = list(USERS)[::-1]
    left = [0.0] * len(users)
    for name, title in parts.items():
        widths = [known.get(f"{user}.{name}", 0.0) for user in users]
        axes.barh([USERS[user] for user in users], widths, left=left, height=0.6, label=title)
        left = [before + width for before, width in zip(left, widths)]
    axes.legend(frameon=False, loc="upper left", bbox_to_anchor=(1, 1))
    axes.spines[["top", "right"]].set_visible(False)
