"""The mutation check makes the changes it should, and its table keeps up with the sources."""

from __future__ import annotations

import os
import threading
from concurrent.futures import ThreadPoolExecutor
from pathlib import Path

import pytest

from sandbox import REPOSITORY
from tests.mutation import explanations, workshop
from tests.mutation.areas import AREAS, Area, area_of, chosen
from tests.mutation.explanations import Key
from tests.mutation.mutants import Mutant, mutants
from tests.mutation.mutate import Task, report
from tests.mutation.workshop import Workshop, WorkshopTrouble

FUNCTION = "void Thing::act()\n{{\n    {}\n}}\n"


def mutants_of(statement: str) -> list[Mutant]:
    """The mutants of a line in a function."""
    return mutants("thing.cpp", FUNCTION.format(statement))[0]


@pytest.mark.parametrize(
    ("statement", "expected"),
    [
        ("if (a == b) {}", {"if (a != b) {}"}),
        ("if (a < b) {}", {"if (!(a < b)) {}", "if (a <= b) {}"}),
        ("if (a && b) {}", {"if (!(a && b)) {}", "if (a || b) {}"}),
        ("if (!a) {}", {"if (a) {}"}),
        ("if (a) {}", {"if (!(a)) {}"}),
        ("return a > b;", {"return a >= b;"}),
        ("return a ? b : c;", {"return a && false ? b : c;", "return a || true ? b : c;"}),
        ("set(true);", {"set(false);"}),
        ("set(60000);", {"set(59999);", "set(60001);"}),
        ('send("reboot");', {'send("");'}),
        ('send(R"({"uuid":"%1"})");', {'send(R"()");'}),
        ('set(0); // 5 or "b"', {"set(-1);", "set(1);"}),
    ],
)
def test_conditions_and_constants_are_changed_one_at_a_time(statement: str, expected: set[str]) -> None:
    assert {mutant.after for mutant in mutants_of(statement)} == expected


@pytest.mark.parametrize(
    "statement",
    ['send("");', "QList<int> list;", "auto&& all = list;", "call();", "// if (a == b) { true; }"],
)
def test_what_would_change_nothing_is_left_alone(statement: str) -> None:
    assert mutants_of(statement) == []


def test_what_only_changes_a_log_text_is_counted_and_left_out() -> None:
    found, left_out = mutants("thing.cpp", FUNCTION.format('qInfo() << "text" << 5;'))
    assert (found, left_out) == ([], 3)


def test_a_mutant_says_where_it_is() -> None:
    (mutant,) = mutants_of("set(true);")
    assert str(mutant) == "thing.cpp:3: set(true); → set(false);"
    assert mutant.function == "act"
    assert mutant.content == FUNCTION.format("set(false);")


@pytest.mark.parametrize("area", AREAS, ids=lambda area: f"{area.file}, {area.component}")
def test_the_table_names_sources_functions_and_tests_that_exist(area: Area) -> None:
    source = (REPOSITORY / area.file).read_text()
    tests = REPOSITORY / "tests"
    assert [name for name in area.functions if f"{name}(" not in source] == []
    assert [name for name in area.unit if not (tests / "unit" / f"{name}.cpp").exists()] == []
    modules = {name: tests / "e2e" / f"test_{name}.py" for name in (*area.e2e, *area.local)}
    assert [name for name, file in modules.items() if not file.exists()] == []
    assert [name for name in area.local if "local_user" not in modules[name].read_text()] == []


def test_a_function_belongs_to_the_area_that_names_it() -> None:
    file = "src/velk/velks/message_transfer.cpp"
    components = {
        name: area_of(file, name).component for name in ("onPolicyMsg", "statusOf", "uploadSoftware")
    }
    assert components == {
        "onPolicyMsg": "dispatcher",
        "statusOf": "state report",
        "uploadSoftware": "uploads",
    }


def test_sources_are_chosen_by_name_or_pattern() -> None:
    assert {area.file for area in chosen(["software_*.cpp"])} == {"src/velk/velks/software_report.cpp"}
    with pytest.raises(ValueError, match="no tests are known for nothing.cpp"):
        chosen(["nothing.cpp"])


def test_an_explanation_of_a_mutant_that_is_gone_is_found() -> None:
    (mutant,) = mutants_of("set(true);")
    of_it = explanations.key_of(mutant)
    gone = Key("thing.cpp act", "set(false);", "set(true);")
    elsewhere = Key("other.cpp act", "set(false);", "set(true);")
    assert explanations.stale([of_it, gone, elsewhere], [mutant]) == [gone]


def test_an_explanation_is_for_the_mutants_below_it() -> None:
    text = "# remark\nA reason,\nin two lines.\na.cpp\n- a;\n+ b;\na.cpp\n- c;\n+ d;\n\n"
    text += "Another.\nb.cpp\n- e;\n+ f;\n"
    assert explanations.read(text) == {
        ("a.cpp", "a;", "b;"): "A reason, in two lines.",
        ("a.cpp", "c;", "d;"): "A reason, in two lines.",
        ("b.cpp", "e;", "f;"): "Another.",
    }


@pytest.mark.parametrize(("is_sample", "status"), [(False, 1), (True, 0)])
def test_a_sample_is_not_judged(is_sample: bool, status: int) -> None:
    (mutant,) = mutants_of("set(true);")

    assert report([Task(mutant, AREAS[0])], ["survived"], 0, is_sample) == status


def test_what_a_workshop_runs_ends_when_it_is_to_stop(
    tmp_path: Path, monkeypatch: pytest.MonkeyPatch
) -> None:
    monkeypatch.setattr(workshop, "stopping", threading.Event())
    monkeypatch.setattr(workshop, "FOLDER", tmp_path)
    monkeypatch.setattr(workshop, "_copy_tree", Path.mkdir)
    pipe = tmp_path / "pipe"
    os.mkfifo(pipe)
    program = tmp_path / "cmake"
    program.write_text(f"#!/bin/sh\nexec 9>{pipe}; sleep 1000")
    program.chmod(0o755)
    monkeypatch.setenv("PATH", str(tmp_path), prepend=":")

    with ThreadPoolExecutor() as workers:
        preparing = workers.submit(Workshop("tree").prepare, [])
        with pipe.open("rb") as held:
            workshop.stopping.set()
            assert held.read() == b""
        with pytest.raises(WorkshopTrouble, match="interrupted"):
            preparing.result()
