"""The prompt's commands about the daemon, the session, the services and the prompt itself. To add a command,
add a decorated function."""

from __future__ import annotations

import json
from typing import Any, Mapping

from rich.table import Table

from sandbox.fakes.base import Fake
from sandbox.fakes.fault import Fault
from sandbox.machine import layout
from sandbox.periods import STATE_REPORT
from sandbox.policies import POLICIES
from sandbox.prompt import application_commands  # noqa: F401  registers its commands
from sandbox.prompt import software_commands  # noqa: F401  registers its commands
from sandbox.prompt import help_page, platform_commands
from sandbox.prompt.context import Context, CommandRefused, guess
from sandbox.prompt.registry import COMMANDS, command, number


_NEXT_REPORT = f"the agent reports the state every five minutes: advance {STATE_REPORT}"
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
    """Text in braces is pushed unchanged and may be invalid; so may a code without the uid that it needs."""
    text = code
    if not code.startswith("{"):
        payload: dict[str, Any] = {"type": number(code, int)}
        if uid is not None:
            payload["payload"] = {"uid": number(uid, int)}
        text = json.dumps(payload)
    context.present("daemon")
    context.terminal.daemon.push_policy(text)
    return "The daemon has pushed it."


@command("online", "", "the daemon asks the sessions to report themselves")
def online(context: Context) -> str:
    """The daemon must be on the bus."""
    context.present("daemon")
    context.terminal.daemon.push_online()
    return "The daemon has asked the sessions to report themselves."


@command("lock", "", "the user locks the screen")
def lock(context: Context) -> str:
    """The agent notices only if the session manager is on the bus."""
    context.terminal.session_manager.lock()
    return f"The screen is locked; {_NEXT_REPORT}"


@command("unlock", "", "the user unlocks the screen")
def unlock(context: Context) -> str:
    """The agent notices only if the session manager is on the bus."""
    context.terminal.session_manager.lock(False)
    return f"The screen is unlocked; {_NEXT_REPORT}"


@command("saver", "on|off", "the screen saver starts or ends", _on_off)
def saver(context: Context, wanted: str) -> str:
    """The agent notices only if the screen saver is on the bus."""
    context.terminal.screensaver.run(_is_on(wanted))
    return f"The screen saver is {wanted}; {_NEXT_REPORT}"


def _come(context: Context, fake: Fake) -> None:
    """Put a fake on the bus; the daemon then asks for the sessions."""
    if fake is context.terminal.daemon:
        context.terminal.daemon.appear(announce=True)
    else:
        fake.appear()


@command("leave", "SERVICE", "a service leaves its bus", _services)
def leave(context: Context, name: str) -> str:
    """The service must be on the bus."""
    context.present(name).leave()
    return f"{name} has left its bus; it comes back with: appear {name}"


@command("appear", "SERVICE", "a service joins its bus; the daemon then asks for the sessions", _services)
def appear(context: Context, name: str) -> str:
    """The service must be off the bus."""
    fake = context.fake(name)
    if fake.present:
        raise CommandRefused(f"{name} is on the bus already")
    _come(context, fake)
    return f"{name} is on its bus."


@command("restart", "SERVICE", "a service leaves its bus and joins it again with a new connection", _services)
def restart(context: Context, name: str) -> str:
    """The service must be on the bus."""
    context.present(name).leave()
    _come(context, context.fake(name))
    return f"{name} has a new connection now."


@command("hang", "SERVICE", "a service no longer answers", _services)
def hang(context: Context, name: str) -> str:
    """It stays so until `recover`."""
    context.fake(name).fault = Fault("hang")
    return f"{name} no longer answers; it does again with: recover {name}"


@command("slow", "SERVICE SECONDS", "a service answers late", _services)
def slow(context: Context, name: str, seconds: str) -> str:
    """The seconds are real time, not agent time."""
    context.fake(name).fault = Fault("slow", seconds=number(seconds, float))
    return f"{name} answers {seconds} s late; it answers normally again with: recover {name}"


@command("fail", "SERVICE", "a service answers every call with an error", _services)
def fail(context: Context, name: str) -> str:
    """It stays so until `recover`."""
    context.fake(name).fault = Fault("fail")
    return f"{name} answers with errors; it answers normally again with: recover {name}"


@command("recover", "SERVICE", "a service works normally again", _services)
def recover(context: Context, name: str) -> str:
    """Calls that hung before remain unanswered."""
    context.fake(name).fault = Fault()
    return f"{name} works normally."


@command("login", "", "the session ends, and a new one begins with a new agent")
def login(context: Context) -> str:
    """The prompt does not wait for the agent's start."""
    context.terminal.agent.stop()
    context.terminal.start_agent(ready=lambda: None)
    return "A new session begins."


@command("log", "on|off", "show or hide the agent's log lines", _on_off)
def log(context: Context, wanted: str) -> str:
    """This applies to later lines."""
    context.timeline.show_log = _is_on(wanted)
    return f"The agent's log lines are {'shown' if context.timeline.show_log else 'hidden'}."


@command("advance", "SECONDS", "move the agent's clock ahead")
def advance(context: Context, seconds: str) -> str:
    """Timers that become due fire in order."""
    wanted = int(number(seconds, int))
    if not 1 <= wanted <= _LONGEST_ADVANCE:
        raise CommandRefused(f"cannot advance by {wanted} s (1 to {_LONGEST_ADVANCE})")
    context.advance(wanted)
    return f"The agent's clock is {wanted} s ahead."


@command("wait", "MEMBER [SECONDS]", f"wait for an event with this member (at most {_WAIT_SECONDS} s)")
def wait(context: Context, member: str, seconds: str = _WAIT_SECONDS) -> None:
    """The search begins after the event that the previous wait found."""
    context.follow(member, number(seconds, float))


@command("state", "", "the services, the platform and the agent: present or not, and how they behave")
def state(context: Context) -> None:
    """A service that is not present has left its bus."""
    table = Table("Service", "Bus", "Bus name", "Present", "Behaviour", pad_edge=False)
    table.columns[0].no_wrap = True
    table.columns[2].overflow = "fold"
    for name, fake in context.terminal.fakes.items():
        fault = fake.fault
        manner = f"slow ({fault.seconds:g} s)" if fault.kind == "slow" else fault.kind
        manner = "ok" if fault.kind == "none" else manner
        table.add_row(name, fake.bus.kind, fake.bus_name, "yes" if fake.present else "no", manner)
    platform = context.terminal.platform
    address = f"{layout.PLATFORM_HOST}:{platform.port}"
    present = "yes" if platform.present else "no"
    table.add_row("platform", "https", address, present, platform_commands.behaviour(platform))
    context.show(table)
    running = context.terminal.agent.alive
    user = context.terminal.user
    context.show(f"The agent {'runs' if running else 'has ended'}; the user is {user.name}, uid {user.uid}.")


@command("help", "[COMMAND]", "all commands, or the details of one", help_page.topics)
def help_table(context: Context, name: str | None = None) -> None:
    """Without a command, the page groups them by subject."""
    if name is not None and name not in COMMANDS:
        raise CommandRefused(f"there is no command '{name}'; {guess(name, COMMANDS) or 'see: help'}")
    context.show(help_page.about(context, COMMANDS[name]) if name else help_page.overview())


@command("quit", "", "end the terminal (Ctrl+D too)")
def end(_context: Context) -> None:
    """The end of a script has the same effect."""
    raise EOFError


def _is_on(word: str) -> bool:
    if word not in ("on", "off"):
        raise CommandRefused(f"'{word}' is neither on nor off")
    return word == "on"
