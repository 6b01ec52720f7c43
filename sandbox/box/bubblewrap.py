"""Builds the bubblewrap command line of a box.

It mounts the parts of the root one by one instead of binding the host's root read-only: a read-only bind
allows no new mount points, and the terminal has its own /etc, /var, /home and /usr/share/velk.
"""

from __future__ import annotations

import os
import shutil
import subprocess
from pathlib import Path
from typing import Collection, Iterator, Mapping, Sequence

from sandbox import REPOSITORY
from sandbox.ending import CannotRun
from sandbox.machine import layout
from sandbox.machine.users import USERS, User

# Parts of the host's /etc that programs need to run and that reveal nothing about the host.
_HOST_ETC = ("alternatives", "ld.so.cache", "ssl/openssl.cnf")
_WRITABLE = ("/etc", "/home", "/run", "/tmp", "/var", str(layout.SHARE), str(layout.APPLICATIONS))
_PASSED_ON = (
    "TERM",
    "COLORTERM",
    "CI",
    "ASAN_OPTIONS",
    "LSAN_OPTIONS",
    "TSAN_OPTIONS",
    "VELK_AGENT",
    "VELK_BUILD_DIR",
)
_NAMESPACES = ("user", "pid", "ipc", "uts")
# A network namespace made by bubblewrap would not belong to the box's user. The first process makes and sets
# up the namespace itself, then drops the capabilities for that (see sandbox/machine/network.py).
_CAPABILITIES = ("CAP_SYS_ADMIN", "CAP_NET_ADMIN")
_OWN_NETWORK = ("/usr/bin/unshare", "--net")
# Tries these capabilities and the namespace; prints the cause if the host refuses them.
_CAN_BOX = REPOSITORY / "sandbox" / "can-box"


def command(
    user: User,
    argv: Sequence[str],
    env: Mapping[str, str] | None = None,
    shown: Mapping[Path, Path] | None = None,
) -> list[str]:
    """The command line that runs `argv` as `user` in a box, with `env` added to the environment and the
    host's files `shown` at the given places.

    It refers to open files of this process, which the child must inherit.
    """
    return [
        "bwrap",
        "--die-with-parent",
        *(f"--unshare-{namespace}" for namespace in _NAMESPACES),
        *("--hostname", "terminal"),
        *("--uid", str(user.uid), "--gid", str(user.uid)),
        *(word for capability in _CAPABILITIES for word in ("--cap-add", capability)),
        *_file_system(),
        *(word for place, file in (shown or {}).items() for word in ("--bind", str(file), str(place))),
        *_environment(user, env or {}),
        *("--chdir", _working_folder()),
        "--",
        *_OWN_NETWORK,
        *("/usr/bin/python3", "-P", "-m", "sandbox", "init", "--"),
        *argv,
    ]


def require() -> None:
    """Raise CannotRun if bubblewrap is missing, the kernel forbids user namespaces, or the agent would
    not be visible in the box."""
    if not shutil.which("bwrap"):
        raise CannotRun("bubblewrap is missing; install it with: apt-get install bubblewrap")
    attempt = subprocess.run([_CAN_BOX], stdin=subprocess.DEVNULL, capture_output=True, text=True)
    if attempt.returncode:
        raise CannotRun(attempt.stdout.strip())
    agent = os.environ.get("VELK_AGENT")
    if agent and not os.access(agent, os.X_OK):
        raise CannotRun(f"VELK_AGENT names no program: {agent}")
    if agent and str(Path(agent).resolve().parent) in ("/", *_WRITABLE):
        raise CannotRun(f"the box has its own {Path(agent).parent}; put the agent into another folder")


def _file_system() -> Iterator[str]:
    yield from ("--proc", "/proc", "--dev", "/dev")
    yield from _children(Path("/usr"), without=("share",))
    yield from _children(layout.SHARE.parent, without=(layout.SHARE.name, layout.APPLICATIONS.name))
    for link in ("bin", "lib", "lib32", "lib64", "libx32", "sbin"):
        if Path("/", link).is_symlink():
            yield from ("--symlink", os.readlink(f"/{link}"), f"/{link}")
    for folder in _WRITABLE:
        yield from ("--tmpfs", folder)
    for name in _HOST_ETC:
        yield from ("--ro-bind-try", f"/etc/{name}", f"/etc/{name}")
    yield from _package_tools()
    yield from _repository()
    yield from ("--remount-ro", "/")


def _children(folder: Path, without: Collection[str]) -> Iterator[str]:
    for child in sorted(folder.iterdir()):
        if child.name in without:
            continue
        if child.is_symlink():
            yield from ("--symlink", os.readlink(child), str(child))
        else:
            yield from ("--ro-bind", str(child), str(child))


def _package_tools() -> Iterator[str]:
    """Writable copies in the places of the real tools."""
    for tool in layout.PACKAGE_TOOLS:
        if tool.exists():
            copied = os.open(tool, os.O_RDONLY)
            os.set_inheritable(copied, True)
            yield from ("--perms", "0755", "--bind-data", str(copied), str(tool))


def _repository() -> Iterator[str]:
    yield from ("--ro-bind", str(REPOSITORY), str(REPOSITORY))
    for folder in _build_folders():
        yield from ("--bind", str(folder), str(folder))


def _build_folders() -> list[Path]:
    """Folders of built programs, writable for coverage counters and test output.

    An installed agent is visible with the rest of /usr, read-only.
    """
    chosen = [Path(os.environ[name]) for name in ("VELK_BUILD_DIR",) if os.environ.get(name)]
    if os.environ.get("VELK_AGENT") and not os.environ["VELK_AGENT"].startswith("/usr/"):
        chosen.append(Path(os.environ["VELK_AGENT"]).parent)
    folders = [REPOSITORY / "build", *chosen]
    return [folder.resolve() for folder in folders if folder.is_dir()]


def _environment(user: User, extra: Mapping[str, str]) -> Iterator[str]:
    session_bus = layout.session_bus_socket(user.uid)
    own = {
        "PATH": f"{layout.COMMANDS}:/usr/bin:/bin",
        "HOME": user.home,
        "USER": user.name,
        "LOGNAME": user.name,
        "LANG": "C.UTF-8",
        "XDG_RUNTIME_DIR": str(layout.runtime_folder(user.uid)),
        "DBUS_SYSTEM_BUS_ADDRESS": f"unix:path={layout.SYSTEM_BUS_SOCKET}",
        "DBUS_SESSION_BUS_ADDRESS": f"unix:path={session_bus}",
        "PYTHONPATH": str(REPOSITORY),
        "PYTHONDONTWRITEBYTECODE": "1",
        "QT_FORCE_STDERR_LOGGING": "1",
        "VELK_BOX_USER": next(kind for kind, known in USERS.items() if known == user),
    }
    passed_on = {name: os.environ[name] for name in _PASSED_ON if name in os.environ}
    yield "--clearenv"
    for name, value in {**own, **passed_on, **extra}.items():
        yield from ("--setenv", name, value)


def _working_folder() -> str:
    here = Path.cwd()
    visible = [REPOSITORY, Path("/usr"), *_build_folders()]
    return str(here if any(here.is_relative_to(folder) for folder in visible) else REPOSITORY)
