"""What a person can do at the prompt. A further command is one more decorated function."""

from __future__ import annotations

import json
from typing import Any, Mapping

from rich.table import Table

from sandbox.fakes.base import Fake
from sandbox.fakes.fault import Fault
from sandbox.machine import layout
from sandbox.policies import POLICIES
from sandbox.prompt import application_commands, help_page, platform_commands, software_commands
from sandbox.prompt.context import Context, CommandRefused, guess
from sandbox.prompt.registry import COMMANDS, command, number

assert application_commands and software_commands, "importing the modules makes their commands known"

_WAIT_SECONDS = "20"
_LONGEST_ADVANCE = 86_400


def _services(context: Context) -> Mapping[str, str]:
    return {name: fake.bus_name for name, fake in context.terminal.fakes.items()}


def _codes(_context: Context) -> Mapping[str, str]:
    return {str(code): known.meaning for code, known in POLICIES.items()}


def _on_off(_context: Context) -> Mapping[str, str]:
    return {"on": "", "off": ""}


@command("policy", "CODE [UID] | {JSON}", "the daemon pushes a policy to the sessions", _codes)
def policy(context: Context, code: str, uid: str | None = None) -> str:
    """A text in braces goes out as it stands, whatever it is; so does a code that lacks its uid."""
    text = code
    if not code.startswith("{"):
        payload: dict[str, Any] = {"type": number(code, int)}
        if uid is not None:
            payload["payload"] = {"uid": number(uid, int)}
        text = json.dumps(payload)
    context.present("daemon")
    context.terminal.daemon.push_policy(text)
    return "The daemon has pushed it."


@command("online", "", "the daemon asks the sessions to announce themselves")
def online(context: Context) -> str:
    """The daemon must be on the bus for that."""
    context.present("daemon")
    context.terminal.daemon.push_online()
    return "The daemon has asked who is there."


@command("lock", "", "the user locks the screen")
def lock(context: Context) -> str:
    """Without the session manager nobody will see it."""
    context.terminal.session_manager.lock()
    return "The screen is locked; the agent looks every five minutes: advance 300"


@command("unlock", "", "the user unlocks the screen")
def unlock(context: Context) -> str:
    """The counterpart of `lock`."""
    context.terminal.session_manager.lock(False)
    return "The screen is unlocked; the agent looks every five minutes: advance 300"


@command("saver", "on|off", "the screen saver starts or ends", _on_off)
def saver(context: Context, wanted: str) -> str:
    """Without the screen saver's service nobody will see it."""
    context.terminal.screensaver.run(_is_on(wanted))
    return f"The screen saver is {wanted}; the agent looks every five minutes: advance 300"


def _come(context: Context, fake: Fake) -> None:
    """A daemon knows nobody at first."""
    if fake is context.terminal.daemon:
        context.terminal.daemon.appear(announce=True)
    else:
        fake.appear()


@command("leave", "SERVICE", "a service leaves its bus", _services)
def leave(context: Context, name: str) -> str:
    """It must be on the bus."""
    context.present(name).leave()
    return f"{name} has left its bus; it comes back with: appear {name}"


@command("appear", "SERVICE", "a service comes to its bus; a daemon then asks who is there", _services)
def appear(context: Context, name: str) -> str:
    """It must not be on the bus yet."""
    fake = context.fake(name)
    if fake.present:
        raise CommandRefused(f"{name} is on the bus already")
    _come(context, fake)
    return f"{name} is on its bus."


@command("restart", "SERVICE", "a service leaves its bus and comes back as another connection", _services)
def restart(context: Context, name: str) -> str:
    """It must be on the bus."""
    context.present(name).leave()
    _come(context, context.fake(name))
    return f"{name} is another connection now."


@command("hang", "SERVICE", "a service no longer answers", _services)
def hang(context: Context, name: str) -> str:
    """Until `well`."""
    context.fake(name).fault = Fault.hang()
    return f"{name} no longer answers; it does again with: well {name}"


@command("slow", "SERVICE SECONDS", "a service answers late", _services)
def slow(context: Context, name: str, seconds: str) -> str:
    """Real seconds, whatever the agent's time."""
    context.fake(name).fault = Fault.slow(number(seconds, float))
    return f"{name} answers {seconds} s late; it is itself again with: well {name}"


@command("fail", "SERVICE", "a service answers every call with an error", _services)
def fail(context: Context, name: str) -> str:
    """Until `well`."""
    context.fake(name).fault = Fault.fail()
    return f"{name} answers with errors; it is itself again with: well {name}"


@command("well", "SERVICE", "a service does its work again", _services)
def well(context: Context, name: str) -> str:
    """Calls that hung before stay without an answer."""
    context.fake(name).fault = Fault.none()
    return f"{name} does its work."


@command("login", "", "the session ends and begins anew, and the agent with it")
def login(context: Context) -> str:
    """Returns at once: what the agent then does shows in the traffic."""
    context.terminal.agent.stop()
    context.terminal.start_agent(ready=lambda: None)
    return "Another session begins."


@command("log", "on|off", "show the agent's own log lines or not", _on_off)
def log(context: Context, wanted: str) -> str:
    """For the lines to come."""
    context.timeline.show_log = _is_on(wanted)
    return f"The agent's log lines are {'shown' if context.timeline.show_log else 'hidden'}."


@command("advance", "SECONDS", "so much of the agent's time passes at once")
def advance(context: Context, seconds: str) -> str:
    """What becomes due happens, in its order."""
    wanted = int(number(seconds, int))
    if not 1 <= wanted <= _LONGEST_ADVANCE:
        raise CommandRefused(f"{wanted} s is no time to pass at once (1 to {_LONGEST_ADVANCE})")
    context.advance(wanted)
    return f"{wanted} s of the agent's time have passed."


@command("wait", "MEMBER [SECONDS]", f"go on once the traffic comes to this ({_WAIT_SECONDS} s at the most)")
def wait(context: Context, member: str, seconds: str = _WAIT_SECONDS) -> None:
    """Each wait goes on in the traffic where the one before ended."""
    context.follow(member, number(seconds, float))


@command("state", "", "the services and the platform: whether they are there, and how they behave")
def state(context: Context) -> None:
    """And the agent."""
    table = Table("Service", "Bus", "Name there", "Present", "Behaves", pad_edge=False)
    table.columns[0].no_wrap = True
    table.columns[2].overflow = "fold"
    for name, fake in context.terminal.fakes.items():
        fault = fake.fault
        manner = f"slow ({fault.seconds:g} s)" if fault.kind == "slow" else fault.kind
        manner = "well" if fault.kind == "none" else manner
        table.add_row(name, fake.bus.kind, fake.bus_name, "yes" if fake.present else "no", manner)
    platform = context.terminal.platform
    address = f"{layout.PLATFORM_HOST}:{platform.port}"
    present = "yes" if platform.present else "no"
    table.add_row("platform", "https", address, present, platform_commands.behaviour(platform))
    context.show(table)
    running = context.terminal.agent.alive
    user = context.terminal.user
    context.show(f"The agent {'runs' if running else 'has ended'}; the user is {user.name}, uid {user.uid}.")


@command("help", "[COMMAND]", "what there is, or more about one command", help_page.topics)
def help_table(context: Context, name: str | None = None) -> None:
    """By groups."""
    if name is not None and name not in COMMANDS:
        raise CommandRefused(f"there is no command '{name}'; {guess(name, COMMANDS) or 'see: help'}")
    context.show(help_page.about(context, COMMANDS[name]) if name else help_page.overview())


@command("quit", "", "end the terminal (Ctrl+D too)")
def end(_context: Context) -> None:
    """As the end of the input does."""
    raise EOFError


def _is_on(word: str) -> bool:
    if word not in ("on", "off"):
        raise CommandRefused(f"'{word}' is neither on nor off")
    return word == "on"
