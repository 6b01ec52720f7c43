"""The system and the session bus: real bus daemons on the usual sockets."""

from __future__ import annotations

import os
import select
import signal
import subprocess
from concurrent.futures import Future
from pathlib import Path
from typing import Any, Callable, Iterable, Literal
from xml.etree import ElementTree

import dbus
import dbus.bus

from sandbox.bus.mainloop import MainLoop, on_main_loop
from sandbox.machine import layout
from sandbox.machine.users import User

_CONFIG = """<!DOCTYPE busconfig PUBLIC "-//freedesktop//DTD D-Bus Bus Configuration 1.0//EN"
 "http://www.freedesktop.org/standards/dbus/1.0/busconfig.dtd">
<busconfig>
  <type>{kind}</type>
  <keep_umask/>
  <listen>unix:path={socket}</listen>
  <auth>EXTERNAL</auth>
  <policy context="default">
    <allow user="*"/>
    <allow own="*"/>
    <allow send_type="method_call"/>
    <allow send_type="method_return"/>
    <allow send_type="error"/>
    <allow send_type="signal"/>
    <allow receive_type="method_call"/>
    <allow receive_type="method_return"/>
    <allow receive_type="error"/>
    <allow receive_type="signal"/>
  </policy>
  <servicedir>{services}</servicedir>
  {limits}
</busconfig>
"""
BUS, BUS_PATH = "org.freedesktop.DBus", "/org/freedesktop/DBus"
_STOP_SECONDS = 10
_PING_SECONDS = 60.0

# Never freed: the binding crashes when a connection's end is dispatched after its Python object is gone.
_every_connection: list[Any] = []


BusKind = Literal["system", "session"]


class Bus:
    """One message bus with Debian's limits and no access rules.

    Its state is its socket and its pid file, so any process of the box can stop and restart it. `run` changes
    with each stop, which ends all connections.
    """

    def __init__(self, kind: BusKind, user: User) -> None:
        self.kind = kind
        self.run = 0
        is_system = kind == "system"
        self._socket = layout.SYSTEM_BUS_SOCKET if is_system else layout.session_bus_socket(user.uid)
        self._pid_file = layout.BOX / f"{kind}-bus.pid"
        self._services = layout.BOX / f"{kind}-bus-services"
        self._daemon: subprocess.Popen[bytes] | None = None
        self._control: Any = None
        self._listeners: list[Callable[[], None]] = []
        # Safe to keep: a running bus never reuses a unique name.
        self._processes: dict[str, int] = {}

    @property
    def address(self) -> str:
        """The address that programs connect to."""
        return f"unix:path={self._socket}"

    @property
    def pid(self) -> int | None:
        """Process id of the running bus daemon."""
        try:
            return int(self._pid_file.read_text())
        except (FileNotFoundError, ValueError):
            return None

    def start(self) -> None:
        """Start the bus daemon and return once it accepts connections."""
        for folder in (self._socket.parent, self._pid_file.parent, self._services):
            folder.mkdir(parents=True, exist_ok=True)
        config = self._pid_file.with_suffix(".conf")
        config.write_text(
            _CONFIG.format(
                kind=self.kind, socket=self._socket, services=self._services, limits=_limits(self.kind)
            )
        )
        log = self._pid_file.with_suffix(".log")
        reading, writing = os.pipe()
        with log.open("wb") as log_file:
            self._daemon = subprocess.Popen(
                [
                    "dbus-daemon",
                    f"--config-file={config}",
                    "--nofork",
                    "--nosyslog",
                    f"--print-address={writing}",
                ],
                pass_fds=[writing],
                stdin=subprocess.DEVNULL,
                stdout=subprocess.DEVNULL,
                stderr=log_file,
                # Its own process group: Ctrl+C at a prompt must not end the buses.
                start_new_session=True,
            )
        # The daemon itself would write this file only after it has reported that it is ready.
        self._pid_file.write_text(str(self._daemon.pid))
        os.close(writing)
        with open(reading) as printed:
            if not printed.readline():
                raise RuntimeError(f"the {self.kind} bus did not start: {log.read_text()}")
        for listener in self._listeners:
            listener()

    def stop(self) -> None:
        """End the bus daemon, if it runs, and so every connection."""
        pid = self.pid
        if pid is not None:
            _end(pid)
        MainLoop.call(self._forget)
        if self._daemon:
            self._daemon.wait(_STOP_SECONDS)
            self._daemon = None
        for left in (self._pid_file, self._socket):
            Path(left).unlink(missing_ok=True)

    def restart(self) -> None:
        """Replace the bus daemon by a new one without connections and without services that it can start."""
        self.stop()
        for service in self._services.glob("*.service"):
            service.unlink()
        self.start()

    def offer(self, bus_name: str, command: str) -> None:
        """Let the bus run a command when `bus_name` is called and has no owner."""
        service = self._services / f"{bus_name}.service"
        service.write_text(f"[D-BUS Service]\nName={bus_name}\nExec={command}\n")
        self.ask("ReloadConfig", "")

    def when_started(self, listener: Callable[[], None]) -> None:
        """Call `listener` now (the bus must be running) and again after each start."""
        self._listeners.append(listener)
        listener()

    @on_main_loop
    def connect(self) -> Any:
        """A new private connection; use it on the main loop's thread only."""
        connection = dbus.bus.BusConnection(self.address, mainloop=MainLoop.bus_loop)
        connection.set_exit_on_disconnect(False)
        _every_connection.append(connection)
        return connection

    def owner(self, name: str) -> str | None:
        """Unique name of the connection that owns `name`."""
        try:
            return str(self.ask("GetNameOwner", "s", name))
        except dbus.DBusException as error:
            if error.get_dbus_name() != "org.freedesktop.DBus.Error.NameHasNoOwner":
                raise
            return None

    def names(self) -> list[str]:
        """All names on the bus, unique ones included."""
        return [str(name) for name in self.ask("ListNames", "")]

    def process_of(self, unique_name: str) -> int | None:
        """Process id behind a connection; None if it ended before the first question about it."""
        return self._processes.get(unique_name) or MainLoop.call(self._ask_for_process, unique_name)

    def names_of(self, pid: int) -> list[str]:
        """Unique names of a process's open connections."""
        return [name for name in self.names() if name.startswith(":") and self.process_of(name) == pid]

    def receive_all_from(self, pid: int) -> None:
        """Return once everything that a process has sent so far has reached the bus."""
        await_pings(self._control, self.names_of(pid))

    @on_main_loop
    def ask(self, member: str, signature: str, *args: Any) -> Any:
        """Call a method of the bus itself."""
        if self._control is None:
            self._control = self.connect()
        return self._control.call_blocking(BUS, BUS_PATH, BUS, member, signature, args)

    def _ask_for_process(self, unique_name: str) -> int | None:
        # Another thread may have asked meanwhile, and the connection may have ended since.
        if unique_name not in self._processes:
            try:
                process = int(self.ask("GetConnectionUnixProcessID", "s", unique_name))
            except dbus.DBusException:
                return None
            self._processes[unique_name] = process
        return self._processes[unique_name]

    def _forget(self) -> None:
        """Drop the state of the ended bus. Runs on the main loop's thread, so no call to it is in
        progress."""
        self.run += 1
        self._control = None
        self._processes.clear()


@on_main_loop
def reply_to(connection: Any, *call: Any) -> Future[tuple[Any, ...]]:
    """The values of the reply to a call, which begins at once."""
    reply: Future[tuple[Any, ...]] = Future()
    connection.call_async(*call, lambda *values: reply.set_result(values), reply.set_exception)
    return reply


def await_pings(connection: Any, unique_names: Iterable[str]) -> None:
    """Return once `connection` has received everything that these connections have sent to it so far, and the
    bus everything that they have sent to any destination.

    Their reply to a ping follows on the same connection; D-Bus libraries send it even while their program is
    busy.
    """
    ping = ("/", "org.freedesktop.DBus.Peer", "Ping", "", ())
    for answered in [reply_to(connection, name, *ping) for name in unique_names]:
        answered.result(_PING_SECONDS)


def _end(pid: int) -> None:
    try:
        process = os.pidfd_open(pid)
    except ProcessLookupError:
        return
    try:
        signal.pidfd_send_signal(process, signal.SIGTERM)
        select.select([process], [], [], _STOP_SECONDS)
    finally:
        os.close(process)


def _limits(kind: str) -> str:
    """The limits that Debian's own bus of this kind sets."""
    original = ElementTree.parse(f"/usr/share/dbus-1/{kind}.conf")
    return "".join(ElementTree.tostring(limit, encoding="unicode") for limit in original.iter("limit"))
