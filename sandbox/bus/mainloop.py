"""The single event loop that all fakes of a box run on."""

from __future__ import annotations

import threading
from concurrent.futures import Future
from functools import partial, wraps
from typing import Any, Callable, ParamSpec, TypeVar

import dbus.mainloop.glib
from gi.repository import GLib

P = ParamSpec("P")
T = TypeVar("T")

_CALL_SECONDS = 60.0


class MainLoop:
    """A GLib loop in its own background thread, started on first use.

    All D-Bus objects are created and used on that thread; `call` runs work there for any other thread, and
    `on_main_loop` makes a function do so.
    """

    _lock = threading.Lock()
    _thread: threading.Thread | None = None
    bus_loop: Any = None

    @classmethod
    def call(cls, function: Callable[..., T], *args: Any) -> T:
        """Run `function` on the loop's thread and wait for its result; its exception is raised here."""
        cls._start()
        if threading.current_thread() is cls._thread:
            return function(*args)
        result: Future[T] = Future()
        GLib.idle_add(_settle, result, function, args, priority=GLib.PRIORITY_DEFAULT)
        return result.result(_CALL_SECONDS)

    @classmethod
    def later(cls, seconds: float, function: Callable[[], None]) -> None:
        """Run `function` once on the loop's thread, after `seconds`."""
        cls._start()
        GLib.timeout_add(int(seconds * 1000), function)

    @classmethod
    def _start(cls) -> None:
        with cls._lock:
            if cls._thread:
                return
            dbus.mainloop.glib.threads_init()
            cls.bus_loop = dbus.mainloop.glib.DBusGMainLoop()
            cls._thread = threading.Thread(target=GLib.MainLoop().run, name="box-loop", daemon=True)
            cls._thread.start()


def on_main_loop(function: Callable[P, T]) -> Callable[P, T]:
    """Run a function on the loop's thread, whichever thread calls it."""

    @wraps(function)
    def run(*args: P.args, **kwargs: P.kwargs) -> T:
        return MainLoop.call(partial(function, *args, **kwargs))

    return run


def _settle(result: Future[T], function: Callable[..., T], args: tuple[Any, ...]) -> None:
    try:
        result.set_result(function(*args))
    except BaseException as error:  # raised in the caller's thread instead
        result.set_exception(error)
