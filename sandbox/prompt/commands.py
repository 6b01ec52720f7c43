"""What a person can do at the prompt. A further command is one more decorated function."""

from __future__ import annotations

import json
from typing import Any, Mapping

from rich.table import Table

from sandbox.fakes.base import Peer
from sandbox.fakes.fault import Fault
from sandbox.machine import layout
from sandbox.policies import POLICIES
from sandbox.prompt import application_commands, help_page, platform_commands, software_commands
from sandbox.prompt.desk import Desk, Refused, guess
from sandbox.prompt.registry import COMMANDS, command, number

assert application_commands and software_commands, "importing the modules makes their commands known"

_WAIT_SECONDS = "20"
_LONGEST_ADVANCE = 86_400


def _services(desk: Desk) -> Mapping[str, str]:
    return {name: peer.bus_name for name, peer in desk.terminal.peers.items()}


def _codes(_desk: Desk) -> Mapping[str, str]:
    return {str(code): known.meaning for code, known in POLICIES.items()}


def _on_off(_desk: Desk) -> Mapping[str, str]:
    return {"on": "", "off": ""}


@command("policy", "CODE [UID] | {JSON}", "the daemon pushes a policy to the sessions", _codes)
def policy(desk: Desk, code: str, uid: str | None = None) -> str:
    """A text in braces goes out as it stands, whatever it is; so does a code that lacks its uid."""
    text = code
    if not code.startswith("{"):
        payload: dict[str, Any] = {"type": number(code, int)}
        if uid is not None:
            payload["payload"] = {"uid": number(uid, int)}
        text = json.dumps(payload)
    desk.present("daemon")
    desk.terminal.daemon.push_policy(text)
    return "The daemon has pushed it."


@command("online", "", "the daemon asks the sessions to announce themselves")
def online(desk: Desk) -> str:
    """The daemon must be on the bus for that."""
    desk.present("daemon")
    desk.terminal.daemon.push_online()
    return "The daemon has asked who is there."


@command("lock", "", "the user locks the screen")
def lock(desk: Desk) -> str:
    """Without the session manager nobody will see it."""
    desk.terminal.session_manager.lock()
    return "The screen is locked; the agent looks every five minutes: advance 300"


@command("unlock", "", "the user unlocks the screen")
def unlock(desk: Desk) -> str:
    """The counterpart of `lock`."""
    desk.terminal.session_manager.lock(False)
    return "The screen is unlocked; the agent looks every five minutes: advance 300"


@command("saver", "on|off", "the screen saver starts or ends", _on_off)
def saver(desk: Desk, wanted: str) -> str:
    """Without the screen saver's service nobody will see it."""
    desk.terminal.screensaver.run(_is_on(wanted))
    return f"The screen saver is {wanted}; the agent looks every five minutes: advance 300"


def _come(desk: Desk, peer: Peer) -> None:
    """A daemon knows nobody at first."""
    if peer is desk.terminal.daemon:
        desk.terminal.daemon.appear(announce=True)
    else:
        peer.appear()


@command("leave", "SERVICE", "a service leaves its bus", _services)
def leave(desk: Desk, name: str) -> str:
    """It must be on the bus."""
    desk.present(name).leave()
    return f"{name} has left its bus; it comes back with: appear {name}"


@command("appear", "SERVICE", "a service comes to its bus; a daemon then asks who is there", _services)
def appear(desk: Desk, name: str) -> str:
    """It must not be on the bus yet."""
    peer = desk.peer(name)
    if peer.present:
        raise Refused(f"{name} is on the bus already")
    _come(desk, peer)
    return f"{name} is on its bus."


@command("restart", "SERVICE", "a service leaves its bus and comes back as another connection", _services)
def restart(desk: Desk, name: str) -> str:
    """It must be on the bus."""
    desk.present(name).leave()
    _come(desk, desk.peer(name))
    return f"{name} is another connection now."


@command("hang", "SERVICE", "a service no longer answers", _services)
def hang(desk: Desk, name: str) -> str:
    """Until `well`."""
    desk.peer(name).fault = Fault.hang()
    return f"{name} no longer answers; it does again with: well {name}"


@command("slow", "SERVICE SECONDS", "a service answers late", _services)
def slow(desk: Desk, name: str, seconds: str) -> str:
    """Real seconds, whatever the agent's time."""
    desk.peer(name).fault = Fault.slow(number(seconds, float))
    return f"{name} answers {seconds} s late; it is itself again with: well {name}"


@command("fail", "SERVICE", "a service answers every call with an error", _services)
def fail(desk: Desk, name: str) -> str:
    """Until `well`."""
    desk.peer(name).fault = Fault.fail()
    return f"{name} answers with errors; it is itself again with: well {name}"


@command("well", "SERVICE", "a service does its work again", _services)
def well(desk: Desk, name: str) -> str:
    """Calls that hung before stay without an answer."""
    desk.peer(name).fault = Fault.none()
    return f"{name} does its work."


@command("login", "", "the session ends and begins anew, and the agent with it")
def login(desk: Desk) -> str:
    """Returns at once: what the agent then does shows in the traffic."""
    desk.terminal.agent.stop()
    desk.terminal.start_agent(ready=lambda: None)
    return "Another session begins."


@command("log", "on|off", "show the agent's own log lines or not", _on_off)
def log(desk: Desk, wanted: str) -> str:
    """For the lines to come."""
    desk.timeline.show_log = _is_on(wanted)
    return f"The agent's log lines are {'shown' if desk.timeline.show_log else 'hidden'}."


@command("advance", "SECONDS", "so much of the agent's time passes at once")
def advance(desk: Desk, seconds: str) -> str:
    """What becomes due happens, in its order."""
    wanted = int(number(seconds, int))
    if not 1 <= wanted <= _LONGEST_ADVANCE:
        raise Refused(f"{wanted} s is no time to pass at once (1 to {_LONGEST_ADVANCE})")
    desk.advance(wanted)
    return f"{wanted} s of the agent's time have passed."


@command("wait", "MEMBER [SECONDS]", f"go on once the traffic comes to this ({_WAIT_SECONDS} s at the most)")
def wait(desk: Desk, member: str, seconds: str = _WAIT_SECONDS) -> None:
    """Each wait goes on in the traffic where the one before ended."""
    desk.follow(member, number(seconds, float))


@command("state", "", "the services and the platform: whether they are there, and how they behave")
def state(desk: Desk) -> None:
    """And the agent."""
    table = Table("Service", "Bus", "Name there", "Present", "Behaves", pad_edge=False)
    table.columns[0].no_wrap = True
    table.columns[2].overflow = "fold"
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


@command("help", "[COMMAND]", "what there is, or more about one command", help_page.topics)
def help_table(desk: Desk, name: str | None = None) -> None:
    """By groups."""
    if name is not None and name not in COMMANDS:
        raise Refused(f"there is no command '{name}'; {guess(name, COMMANDS) or 'see: help'}")
    desk.show(help_page.about(desk, COMMANDS[name]) if name else help_page.overview())


@command("quit", "", "end the terminal (Ctrl+D too)")
def end(_desk: Desk) -> None:
    """As the end of the input does."""
    raise EOFError


def _is_on(word: str) -> bool:
    if word not in ("on", "off"):
        raise Refused(f"'{word}' is neither on nor off")
    return word == "on"
