"""Fixtures of the tests that run inside the simulated terminal.

    sandbox/in-box --user domain -- /usr/bin/python3 -m pytest tests/e2e
    sandbox/in-box --user local -- /usr/bin/python3 -m pytest tests/e2e

Each session runs the tests of the user that its box was entered as. With pytest-xdist the session itself
stays outside and each of its workers gets a box of its own:

    /usr/bin/python3 -m pytest --dist load --tx 2*popen//python=sandbox/in-box-python tests/e2e
"""

from __future__ import annotations

import os
from typing import Any, Generator, Iterator

import pytest

from sandbox.bus.stranger import Stranger
from sandbox.machine import layout
from sandbox.machine.clock import Clock, ManualClock
from sandbox.terminal import Terminal


@pytest.fixture
def terminal(request: pytest.FixtureRequest) -> Iterator[Terminal]:
    """A fresh terminal with every service present, a clock that tests move, and no agent yet.

    The marker `real_time` gives the agent the host's clock instead. The terminal's end fails the test when
    the agent has died or broken the contract of an interface.
    """
    real_time = request.node.get_closest_marker("real_time") is not None
    opened = Terminal(clock=Clock() if real_time else ManualClock())
    yield opened
    opened.close()


@pytest.fixture
def session(terminal: Terminal) -> Terminal:
    """A terminal whose agent is ready."""
    terminal.start_agent()
    return terminal


@pytest.fixture
def on_system(terminal: Terminal) -> Iterator[Stranger]:
    """A stranger on the system bus."""
    stranger = Stranger(terminal.system_bus)
    yield stranger
    stranger.close()


@pytest.fixture
def on_session(terminal: Terminal) -> Iterator[Stranger]:
    """A stranger on the session bus."""
    stranger = Stranger(terminal.session_bus)
    yield stranger
    stranger.close()


def pytest_configure(config: pytest.Config) -> None:
    """Make room for temporary files: a worker is given a folder of the session's, which its box lacks."""
    basetemp = config.getoption("basetemp")
    if layout.inside_box() and basetemp:
        os.makedirs(os.path.dirname(basetemp), exist_ok=True)


def pytest_collection_modifyitems(config: pytest.Config, items: list[pytest.Item]) -> None:
    """Leave the tests of the other user to the session in the other box."""
    if not layout.inside_box():
        pytest.exit("these tests run inside the simulated terminal: sandbox/in-box -- ...", returncode=4)
    local_box = os.environ["VELK_BOX_USER"] == "local"
    others = [item for item in items if (item.get_closest_marker("local_user") is not None) != local_box]
    config.hook.pytest_deselected(items=others)
    items[:] = [item for item in items if item not in others]


@pytest.hookimpl(hookwrapper=True)
def pytest_runtest_makereport(item: pytest.Item) -> Generator[None, Any, None]:
    """Show what happened in the terminal of a test that failed."""
    outcome = yield
    report = outcome.get_result()
    opened = getattr(item, "funcargs", {}).get("terminal")
    if report.failed and report.when == "call" and opened:
        report.sections.append(("terminal", opened.report()))
