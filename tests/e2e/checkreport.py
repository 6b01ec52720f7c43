"""velks-check in the simulated terminal: its runs, and certificates for it to judge."""

from __future__ import annotations

import json
import subprocess
from dataclasses import dataclass
from datetime import datetime, timedelta, timezone
from pathlib import Path
from typing import Any, Mapping

from cryptography import x509
from cryptography.hazmat.primitives import hashes, serialization
from cryptography.hazmat.primitives.asymmetric import ec
from cryptography.x509.oid import NameOID

from sandbox.machine import layout
from sandbox.machine.commands import Answer
from sandbox.terminal import Terminal


@dataclass(frozen=True)
class Line:
    """What it found of one subject."""

    result: str
    text: str


@dataclass(frozen=True)
class CheckReport:
    """One run with --json."""

    status: int
    result: str
    lines: list[tuple[str, Line]]

    def line(self, subject: str, about: str = "") -> Line:
        """The one line of a subject whose text has `about` in it."""
        (found,) = [line for name, line in self.lines if name == subject and about in line.text]
        return found

    def subjects(self) -> set[str]:
        """All that was looked at."""
        return {name for name, _ in self.lines}

    def worse_than_good(self) -> list[tuple[str, Line]]:
        """The lines that are not good."""
        return [entry for entry in self.lines if entry[1].result != "good"]


@dataclass(frozen=True)
class Pair:
    """A certificate and its key in PEM form."""

    certificate: bytes
    key: bytes


def binary(terminal: Terminal) -> Path:
    """The program that was built, or installed, along with the agent."""
    folder = terminal.agent.binary.parent
    built = folder / "velk" / "check" / "velks-check"
    return built if built.exists() else folder / built.name


def run_check(
    terminal: Terminal, *arguments: str, env: Mapping[str, str] | None = None
) -> subprocess.CompletedProcess[str]:
    """Run it as the session's user, `env` being added to the session's environment."""
    command = ["env", *(f"{name}={value}" for name, value in (env or {}).items()), str(binary(terminal))]
    return subprocess.run([*command, *arguments], capture_output=True, text=True, timeout=100)


def findings(terminal: Terminal, env: Mapping[str, str] | None = None) -> CheckReport:
    """What it finds now."""
    ended = run_check(terminal, "--json", env=env)
    assert ended.stderr == ""
    content = json.loads(ended.stdout)
    lines = [(entry["subject"], Line(entry["result"], entry["text"])) for entry in content["findings"]]
    return CheckReport(ended.returncode, content["result"], lines)


def make_all_well(terminal: Terminal) -> None:
    """A session that lacks nothing: platform, unit and agent."""
    terminal.commands.answer("systemctl", Answer(stdout=b"LoadState=loaded\nActiveState=active\n"))
    if terminal.user.is_domain_user:
        assert terminal.platform.present
    terminal.start_agent()


def pair(begins_in_days: int = -1, ends_in_days: int = 365, password: bytes = b"") -> Pair:
    """A fresh certificate with this time of validity, signed by itself; a password encrypts its key."""
    key: Any = ec.generate_private_key(ec.SECP256R1())  # some stubs lack a method
    name = x509.Name([x509.NameAttribute(NameOID.COMMON_NAME, "terminal")])
    now = datetime.now(timezone.utc)
    certificate = (
        x509.CertificateBuilder()
        .subject_name(name)
        .issuer_name(name)
        .public_key(key.public_key())
        .serial_number(x509.random_serial_number())
        .not_valid_before(now + timedelta(days=begins_in_days))
        .not_valid_after(now + timedelta(days=ends_in_days))
        .sign(key, hashes.SHA256())
    )
    pem = serialization.Encoding.PEM
    encryption = serialization.BestAvailableEncryption(password) if password else serialization.NoEncryption()
    return Pair(
        certificate.public_bytes(pem),
        key.private_bytes(pem, serialization.PrivateFormat.PKCS8, encryption),
    )


def install_pair(terminal: Terminal, fresh: Pair) -> None:
    """Make a certificate and its key those of the terminal."""
    terminal.files.write(layout.CLIENT_CERTIFICATE, fresh.certificate)
    terminal.files.write(layout.CLIENT_KEY, fresh.key)
