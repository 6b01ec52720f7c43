"""What a person can do at the prompt. A further command is one more decorated function."""

from __future__ import annotations

import json
from typing import Any, Iterable

from rich.table import Table

from sandbox.fakes.fault import Fault
from sandbox.machine import layout
from sandbox.policies import POLICIES
from sandbox.prompt import application_commands, platform_commands, software_commands
from sandbox.prompt.desk import Desk, Refused
from sandbox.prompt.registry import COMMANDS, command, number

assert application_commands and software_commands, "importing the modules makes their commands known"

_WAIT_SECONDS = "20"


def _services(desk: Desk) -> Iterable[str]:
    return desk.terminal.peers


def _codes(_desk: Desk) -> Iterable[str]:
    return map(str, POLICIES)


def _on_off(_desk: Desk) -> Iterable[str]:
    return ("on", "off")


@command("policy", "CODE [UID] | {JSON}", "the daemon pushes a policy to the sessions", _codes)
def policy(desk: Desk, code: str, uid: str | None = None) -> None:
    """A text in braces goes out as it stands, whatever it is; so does a code that lacks its uid."""
    text = code
    if not code.startswith("{"):
        payload: dict[str, Any] = {"type": number(code, int)}
        if uid is not None:
            payload["payload"] = {"uid": number(uid, int)}
        text = json.dumps(payload)
    desk.present("daemon")
    desk.terminal.daemon.push_policy(text)


@command("online", "", "the daemon asks the sessions to announce themselves")
def online(desk: Desk) -> None:
    """The daemon must be on the bus for that."""
    desk.present("daemon")
    desk.terminal.daemon.push_online()


@command("lock", "", "the user locks the screen")
def lock(desk: Desk) -> None:
    """Without the session manager nobody will see it."""
    desk.terminal.session_manager.lock()


@command("unlock", "", "the user unlocks the screen")
def unlock(desk: Desk) -> None:
    """The counterpart of `lock`."""
    desk.terminal.session_manager.lock(False)


@command("saver", "on|off", "the screen saver starts or ends", _on_off)
def saver(desk: Desk, wanted: str) -> None:
    """Without the screen saver's service nobody will see it."""
    desk.terminal.screensaver.run(_is_on(wanted))


@command("leave", "SERVICE", "a service leaves its bus", _services)
def leave(desk: Desk, name: str) -> None:
    """It must be on the bus."""
    desk.present(name).leave()


@command("appear", "SERVICE", "a service comes to its bus (a fresh daemon then says: online)", _services)
def appear(desk: Desk, name: str) -> None:
    """It must not be on the bus yet."""
    peer = desk.peer(name)
    if peer.present:
        raise Refused(f"{name} is on the bus already")
    peer.appear()


@command("restart", "SERVICE", "a service leaves its bus and comes back as another connection", _services)
def restart(desk: Desk, name: str) -> None:
    """It must be on the bus."""
    desk.present(name).restart()


@command("hang", "SERVICE", "a service no longer answers", _services)
def hang(desk: Desk, name: str) -> None:
    """Until `well`."""
    desk.peer(name).fault = Fault.hang()


@command("slow", "SERVICE SECONDS", "a service answers late", _services)
def slow(desk: Desk, name: str, seconds: str) -> None:
    """Real seconds, whatever the agent's time."""
    desk.peer(name).fault = Fault.slow(number(seconds, float))


@command("fail", "SERVICE", "a service answers every call with an error", _services)
def fail(desk: Desk, name: str) -> None:
    """Until `well`."""
    desk.peer(name).fault = Fault.fail()


@command("well", "SERVICE", "a service does its work again", _services)
def well(desk: Desk, name: str) -> None:
    """Calls that hung before stay without an answer."""
    desk.peer(name).fault = Fault.none()


@command("login", "", "the session ends and begins anew, and the agent with it")
def login(desk: Desk) -> None:
    """Returns at once: what the agent then does shows in the traffic."""
    desk.terminal.agent.stop()
    desk.terminal.start_agent(ready=lambda: None)


@command("log", "on|off", "show the agent's own log lines or not", _on_off)
def log(desk: Desk, wanted: str) -> None:
    """For the lines to come."""
    desk.timeline.show_log = _is_on(wanted)


@command("wait", "MEMBER [SECONDS]", f"go on once the traffic comes to this ({_WAIT_SECONDS} s at the most)")
def wait(desk: Desk, member: str, seconds: str = _WAIT_SECONDS) -> None:
    """Each wait goes on in the traffic where the one before ended."""
    desk.follow(member, number(seconds, float))


@command("state", "", "the services and the platform: whether they are there, and how they behave")
def state(desk: Desk) -> None:
    """And the agent."""
    table = Table("Service", "Bus", "Name there", "Present", "Behaves")
    for name, peer in desk.terminal.peers.items():
        fault = peer.fault
        manner = f"slow ({fault.seconds:g} s)" if fault.kind == "slow" else fault.kind
        manner = "well" if fault.kind == "none" else manner
        table.add_row(name, peer.bus.kind, peer.bus_name, "yes" if peer.present else "no", manner)
    platform = desk.terminal.platform
    address = f"{layout.PLATFORM_HOST}:{platform.port}"
    present = "yes" if platform.present else "no"
    table.add_row("platform", "https", address, present, platform_commands.behaviour(platform))
    desk.show(table)
    running = desk.terminal.agent.alive
    user = desk.terminal.user
    desk.show(f"The agent {'runs' if running else 'has ended'}; the user is {user.name}, uid {user.uid}.")


@command("help", "", "this table")
def help_table(desk: Desk) -> None:
    """All commands."""
    table = Table("Command", "What happens")
    for known in COMMANDS.values():
        table.add_row(known.usage.replace("[", r"\["), known.help)
    desk.show(table)


@command("quit", "", "end the terminal (Ctrl+D too)")
def end(_desk: Desk) -> None:
    """As the end of the input does."""
    raise EOFError


def _is_on(word: str) -> bool:
    if word not in ("on", "off"):
        raise Refused(f"'{word}' is neither on nor off")
    return word == "on"
