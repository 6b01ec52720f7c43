"""Writes docs/scale.md and its plot: the load of fleets of different sizes on the platform."""

from __future__ import annotations

from pathlib import Path
from typing import Any

from matplotlib import pyplot

from bench import plots
from bench.figures import Report, number
from bench.fleet.simulation import DAY, KEPT, LATE, Intervals, Load, drawn_intervals, simulate
from bench.programs import bench_program
from sandbox import REPOSITORY

_FLEETS = (1_000, 10_000, 100_000, 1_000_000)
# Within how many seconds all terminals of a fleet start.
_START_SPANS = {"one second": 1, "a minute": 60, "ten minutes": 600, "an hour": 3600}
_LATE_SHARES = (0.0, 0.01, LATE, 0.2)
_SETTLED = 2 * 60 * 60  # seconds after which the start is over
_TEMPLATE = Path(__file__).with_name("scale.md.in")
_DOCS = REPOSITORY / "docs"


def write(report: Report) -> list[Path]:
    """Write docs/scale.md and its plot, with the bytes on the wire from the report; returns their paths."""
    drawn = drawn_intervals(bench_program("intervals"))
    loads = {title: simulate(drawn, span) for title, span in _START_SPANS.items()}
    page, plot = _DOCS / "scale.md", _DOCS / "scale.svg"
    page.write_text(_page(drawn, loads, report))
    _draw(
        loads, {f"{late:.0%}": simulate(drawn, _START_SPANS["an hour"], late) for late in _LATE_SHARES}, plot
    )
    return [page, plot]


def _page(drawn: Intervals, loads: dict[str, Load], report: Report) -> str:
    known = {figure.name: figure.middle for figure in report.figures}
    polls = _mean(loads["an hour"].polls)
    spans: list[tuple[str, ...]] = [
        ("all start within", "starting requests", "polls, first hour", "polls, after two hours")
    ]
    spans += [(title, *_peaks(load)) for title, load in loads.items()]
    values = {
        "fleets": _markdown([("agents", "polls"), *((f"{n:,}", number(n * polls)) for n in _FLEETS)]),
        "handshakes": _markdown(_handshakes(drawn, known)),
        "spans": _markdown(spans),
        "kept": number(known["wire.kept"]),
        "resumed": number(known["wire.resumed"]),
        "full": number(known["wire.full"]),
        "interval": number(1 / polls),
        "even": number(1e6 * polls),
        "late": f"{LATE:.0%}",
    }
    text = _TEMPLATE.read_text()
    for name, value in values.items():
        text = text.replace(f"@{name}@", value)
    return text


def _handshakes(drawn: Intervals, known: dict[str, float]) -> list[tuple[str, ...]]:
    """The load of a million agents per second, by how long the platform keeps connections."""
    rows: list[tuple[str, ...]] = [
        ("connections are kept", "polls with a handshake", "measured", "handshakes", "kB on the wire")
    ]
    for name, kept in KEPT.items():
        load = simulate(drawn, _START_SPANS["an hour"], kept=kept)
        polls, anew = 1e6 * _mean(load.polls), 1e6 * _mean(load.reconnects)
        sent = (polls - anew) * known["wire.kept"] + anew * known["wire.resumed"]
        measured = f"{known[f'wire.handshakes {name}']:.0f}%"
        rows.append((name, f"{anew / polls:.0%}", measured, number(anew), number(sent / 1000)))
    return rows


def _peaks(load: Load) -> tuple[str, str, str]:
    """The requests of a million agents in the busiest seconds."""
    parts = max(load.starts), max(load.polls[:3600]), max(load.polls[_SETTLED:])
    starting, first, settled = (number(1e6 * share) for share in parts)
    return starting, first, settled


def _mean(shares: list[float]) -> float:
    settled = shares[_SETTLED:]
    return sum(settled) / len(settled)


def _markdown(rows: list[tuple[str, ...]]) -> str:
    head, *body = rows
    lines = [head, ("---",) + ("---:",) * (len(head) - 1), *body]
    return "\n".join("| " + " | ".join(line) + " |" for line in lines)


def _draw(by_start: dict[str, Load], by_lateness: dict[str, Load], path: Path) -> None:
    beside: dict[str, Any] = {"frameon": False, "loc": "upper left", "bbox_to_anchor": (1, 1)}
    with plots.settings():
        drawing, (start, day) = pyplot.subplots(1, 2, figsize=(9, 2.8), layout="constrained")
        for title, load in by_start.items():
            _draw_busiest(start, load, 30 * 60, 30, 60, title)
        for title, load in by_lateness.items():
            _draw_busiest(day, load, DAY, 30 * 60, 3600, title)
        start.set(title="the first half hour", xlabel="minutes after the first start", yscale="log")
        day.set(title="a day, all started within an hour", xlabel="hours after the first start", yscale="log")
        start.set_ylabel("polls in the busiest second")
        start.legend(title="a million start within", **beside)
        day.legend(title="late draws", **beside)
        plots.save(drawing, path)


def _draw_busiest(axes: Any, load: Load, seconds: int, step: int, unit: int, title: str) -> None:
    places = range(0, seconds, step)
    busiest = [1e6 * max(load.polls[place : place + step]) or float("nan") for place in places]
    axes.plot([place / unit for place in places], busiest, label=title)
