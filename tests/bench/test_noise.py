"""Whose the processors were."""

from __future__ import annotations

from pathlib import Path

import pytest

from bench.noise import Noise, processors


def proc(folder: Path, machine: str, process: str) -> Path:
    """A /proc of one process, whose name has blanks and a bracket."""
    (folder / "7").mkdir(exist_ok=True)
    (folder / "stat").write_text(f"cpu  {machine}\ncpu0 1 1 1 1\n")
    (folder / "7" / "stat").write_text(f"7 (a b) c) S 1 7 7 0 -1 0 0 0 0 0 {process} 20 0 1\n")
    return folder


def test_what_neither_the_box_nor_the_host_used_was_others(tmp_path: Path) -> None:
    before = processors(proc(tmp_path, "100 0 0 100 0 0 0 0 0 0", "10 0 10 0"))
    after = processors(proc(tmp_path, "140 10 10 120 10 0 0 10 0 0", "20 10 10 10"))

    assert after.noise_since(before).shares() == pytest.approx({"others": 0.3, "stolen": 0.1})


def test_noises_of_two_boxes_are_one() -> None:
    assert (Noise(10, 1, 2) + Noise(30, 3, 0)).shares() == pytest.approx({"others": 0.1, "stolen": 0.05})


def test_own_time_beyond_the_machines_is_no_noise(tmp_path: Path) -> None:
    before = processors(proc(tmp_path, "100 0 0 100 0 0 0 0 0 0", "0 0 0 0"))
    after = processors(proc(tmp_path, "101 0 0 110 0 0 0 0 0 0", "5 0 0 0"))

    assert after.noise_since(before).others == 0
