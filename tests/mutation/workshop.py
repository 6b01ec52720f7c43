"""A copy of the tree in which mutants are built and tested."""

from __future__ import annotations

import filecmp
import os
import shutil
import signal
import subprocess
import threading
import time
from pathlib import Path
from typing import Callable, Literal, Sequence

from tests.mutation.areas import Area
from tests.mutation.mutants import Mutant

REPOSITORY = Path(__file__).resolve().parents[2]
FOLDER = REPOSITORY / "build" / "mutate"

Verdict = Literal["caught", "survived", "invalid"]

_BUILD_SECONDS = 1800.0
# What takes longer hangs.
_UNIT_SECONDS = 90.0  # for the unit tests of an area
_TEST_SECONDS = 600.0  # for its end-to-end tests, or for the unit tests of all areas
_NO_TESTS = 5  # exit status of pytest when no test was chosen
_PYTHON = "/usr/bin/python3"
_GLANCE_SECONDS = 0.2  # how often a running program is looked at

_GRACE_SECONDS = 1.0

# Set to end the programs of all workshops, which ignore Ctrl+C.
stopping = threading.Event()


class WorkshopTrouble(Exception):
    """What keeps the check from going on, in a line."""


class Workshop:
    """One copy of the tree, with a build of its own; used by one mutant at a time."""

    def __init__(self, name: str) -> None:
        self._tree = FOLDER / name
        self._build = self._tree / "build" / "mutant"
        self._log = FOLDER / f"{name}.log"
        self._sound: list[Area] = []  # those whose end-to-end tests pass without any change

    def prepare(self, areas: Sequence[Area]) -> None:
        """Bring the copy up to date and build what the tests need; the unit tests must pass as it is."""
        _copy_tree(self._tree)
        if not (self._build / "build.ninja").exists():
            self._configure()
        unit = tuple({test: None for area in areas for test in area.unit})
        if not self._make("velks", *unit):
            raise WorkshopTrouble(f"the tree does not compile; see {self._log}")
        if not self._pass_unit_tests(unit, _TEST_SECONDS):
            raise WorkshopTrouble(f"unit tests fail without any change; see {self._log}")

    def judge(self, mutant: Mutant, area: Area, quick: bool) -> Verdict:
        """What the tests say to a mutant, if `quick` the unit tests alone; a program that hangs is caught.
        WorkshopTrouble if the end-to-end tests fail without it."""
        verdict = self._try(mutant, area, self._meet_unit_tests)
        if verdict != "survived" or quick or not area.e2e:
            return verdict
        self._require_that_e2e_tests_pass(area)
        return self._try(mutant, area, self._meet_e2e_tests)

    def _try(self, mutant: Mutant, area: Area, meet: Callable[[Area], Verdict]) -> Verdict:
        file = self._tree / mutant.file
        original = file.read_text()
        file.write_text(mutant.content)
        try:
            return meet(area)
        finally:
            file.write_text(original)

    def _meet_unit_tests(self, area: Area) -> Verdict:
        if not self._make(*area.unit or ("velks",)):
            return "invalid"
        return "survived" if self._pass_unit_tests(area.unit, _UNIT_SECONDS) else "caught"

    def _meet_e2e_tests(self, area: Area) -> Verdict:
        if not self._make("velks"):
            return "invalid"
        return "survived" if self._pass_e2e_tests(area) else "caught"

    def _require_that_e2e_tests_pass(self, area: Area) -> None:
        if area in self._sound:
            return
        if self._meet_e2e_tests(area) != "survived":
            raise WorkshopTrouble(f"end-to-end tests of {area.file} fail without any change; see {self._log}")
        self._sound.append(area)

    def _configure(self) -> None:
        arguments = [
            *("cmake", "-S", str(self._tree), "-B", str(self._build), "-G", "Ninja"),
            *("-DCMAKE_BUILD_TYPE=None", "-DCMAKE_CXX_FLAGS=-O0 -g0", "-DVELK_WARNINGS_AS_ERRORS=OFF"),
            "-DCMAKE_CXX_COMPILER_LAUNCHER=ccache",
            f"-DCMAKE_PROJECT_INCLUDE={self._tree / 'tests' / 'mutation' / 'precompiled.cmake'}",
        ]
        if self._run(arguments, _BUILD_SECONDS) != 0:
            raise WorkshopTrouble(f"the tree cannot be configured; see {self._log}")

    def _make(self, *targets: str) -> bool:
        return self._run(["ninja", "-C", str(self._build), *targets], _BUILD_SECONDS) == 0

    def _pass_unit_tests(self, names: tuple[str, ...], seconds: float) -> bool:
        if not names:
            return True
        arguments = ["ctest", "--test-dir", str(self._build), "--tests-regex", f"^({'|'.join(names)})$"]
        return self._run([*arguments, "--stop-on-failure", "--output-on-failure"], seconds) == 0

    def _pass_e2e_tests(self, area: Area) -> bool:
        return self._pass_as("domain", area.e2e) and self._pass_as("local", area.local)

    def _pass_as(self, user: str, modules: tuple[str, ...]) -> bool:
        if not modules:
            return True
        files = [f"tests/e2e/test_{module}.py" for module in modules]
        arguments = [str(self._tree / "sandbox" / "in-box"), "--user", user, "--", _PYTHON]
        arguments += ["-m", "pytest", "-q", "-x", "-p", "no:cacheprovider", *files]
        return self._run(arguments, _TEST_SECONDS) in (0, _NO_TESTS)

    def _run(self, arguments: Sequence[str], seconds: float) -> int:
        """Run a program in the copy; its exit status, -1 if it had to be ended."""
        env = {
            **os.environ,
            "VELK_AGENT": str(self._build / "src" / "velks"),
            "CCACHE_SLOPPINESS": "pch_defines,time_macros,include_file_mtime,include_file_ctime",
            "PYTHONDONTWRITEBYTECODE": "1",
        }
        with self._log.open("wb") as log:
            program = subprocess.Popen(
                arguments, cwd=self._tree, env=env, stdout=log, stderr=log, start_new_session=True
            )
            try:
                return _wait(program, time.monotonic() + seconds)
            finally:
                _end(program)


def _end(program: subprocess.Popen[bytes]) -> None:
    """End it if it still runs. ninja forwards the first signal to its children, each in its own group."""
    for number in (signal.SIGTERM, signal.SIGKILL):
        if program.poll() is None:
            os.killpg(program.pid, number)
            try:
                program.wait(_GRACE_SECONDS)
            except subprocess.TimeoutExpired:
                pass


def _wait(program: subprocess.Popen[bytes], deadline: float) -> int:
    while time.monotonic() < deadline:
        if stopping.is_set():
            raise WorkshopTrouble("interrupted")
        try:
            return program.wait(_GLANCE_SECONDS)
        except subprocess.TimeoutExpired:
            pass
    return -1


def _copy_tree(folder: Path) -> None:
    """Copy what git knows or would add; files that are the same already keep their time, so that they are not
    built again."""
    listed = ["git", "ls-files", "-z", "--cached", "--others", "--exclude-standard"]
    names = subprocess.run(listed, cwd=REPOSITORY, capture_output=True, text=True, check=True).stdout
    wanted = {name for name in names.split("\0") if name and (REPOSITORY / name).is_file()}
    for name in sorted(wanted):
        source, target = REPOSITORY / name, folder / name
        if not target.exists() or not filecmp.cmp(source, target, shallow=False):
            target.parent.mkdir(parents=True, exist_ok=True)
            shutil.copy(source, target)
    for file in [file for file in folder.rglob("*") if file.is_file()]:
        name = str(file.relative_to(folder))
        if name not in wanted and not name.startswith("build/"):
            file.unlink()
