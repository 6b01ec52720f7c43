"""The platform as a real web server: nginx, which listens in the machine's own network alone."""

from __future__ import annotations

import json
from dataclasses import dataclass
from pathlib import Path

import trustme

from tests.booted.machine import Machine
from tests.booted.patience import REPOSITORY, wait_for

_PORT = 8443
_FOLDER = "/etc/booted-platform"
_LOG = "/run/booted-platform.log"
_USERINFO = "/etc/velk/userinfo.json"
_UNIT = "booted-platform"
TIPS = "/uim/v3/client/password/tips"
LIST = "/notification/v2/list"
_EXAMPLES = REPOSITORY / "contracts" / "json" / "examples"
MESSAGES = (_EXAMPLES / "platform-messages" / "valid-unread.json").read_text()

_CONFIGURATION = """
daemon off;
error_log stderr;
pid /run/booted-platform.pid;
events {{}}
http {{
    log_format seen '$uri|$status|$server_protocol|$ssl_protocol|$ssl_client_verify|$connection';
    access_log {log} seen;
    server {{
        listen 127.0.0.1:{port} ssl http2;
        ssl_certificate {folder}/server.pem;
        ssl_certificate_key {folder}/server.key;
        ssl_client_certificate {folder}/clients.pem;
        ssl_verify_client on;
        ssl_protocols {protocol};
        keepalive_timeout {keepalive};
        default_type application/json;
        location {tips} {{ return 200 '{{"code": 0, "result": false, "msg": ""}}'; }}
        location {list} {{ add_header X-Total-Count 1; return 200 '{messages}'; }}
        location / {{ return 200 '{{"code": 0}}'; }}
    }}
}}
"""


@dataclass(frozen=True)
class Request:
    """What the server saw of a request."""

    path: str
    status: str
    http: str
    tls: str
    client: str
    connection: str


class Platform:
    """The server, its certificates and those of the terminal, which knows it as its platform."""

    def __init__(self, machine: Machine, folder: Path) -> None:
        self._machine = machine
        self._folder = folder
        self._before = machine.said("cat", _USERINFO)
        machine.overlay.bring_programs("nginx")
        machine.run("mkdir", "-p", "/var/lib/nginx", "/var/log/nginx")
        authority = trustme.CA()
        self._store(authority.issue_cert("127.0.0.1"), f"{_FOLDER}/server.pem", f"{_FOLDER}/server.key")
        machine.write("/etc/velk/clientapi_ca.crt", authority.cert_pem.bytes().decode())
        self._clients = trustme.CA()
        machine.write(f"{_FOLDER}/clients.pem", self._clients.cert_pem.bytes().decode())
        self.give_terminal_a_certificate(self._clients)
        known = {**json.loads(self._before), "server_host": "127.0.0.1", "server_port": str(_PORT)}
        machine.write(_USERINFO, json.dumps(known))

    def give_terminal_a_certificate(self, authority: trustme.CA) -> None:
        """Replace the terminal's certificate by one of this authority."""
        leaf = authority.issue_cert("terminal.invalid")
        self._store(leaf, "/etc/velk/ZEF_Velk.pem", "/etc/velk/.ZEF_Velk.key")

    def start(self, protocol: str = "TLSv1.3", keepalive: str = "75s") -> None:
        """Let the server listen."""
        configuration = _CONFIGURATION.format(
            folder=_FOLDER,
            log=_LOG,
            port=_PORT,
            protocol=protocol,
            keepalive=keepalive,
            tips=TIPS,
            list=LIST,
            messages=MESSAGES,
        )
        self._machine.write(f"{_FOLDER}/nginx.conf", configuration)
        server = ["nginx", "-c", f"{_FOLDER}/nginx.conf"]
        self._machine.run("systemd-run", "--quiet", "--collect", f"--unit={_UNIT}", *server)
        wait_for("the server", lambda: self._machine.said("ss", "-Hltn", f"sport = {_PORT}"))

    def agreed_protocol(self, offered: str) -> str:
        """The protocol that the server chooses of those that a client names, separated by commas."""
        ask = f"openssl s_client -connect 127.0.0.1:{_PORT} -alpn {offered}"
        # What follows the handshake is no text.
        return self._machine.said("sh", "-c", f"{ask} | sed --quiet 's/^ALPN protocol: //p'")

    def freeze(self) -> None:
        """Let the server accept connections and say nothing on them."""
        self._machine.run("systemctl", "kill", "--signal=STOP", _UNIT)

    def connections(self) -> str:
        """The connections of which the terminal's side is established."""
        return self._machine.said("ss", "-Htn", "state", "established", f"dport = {_PORT}")

    def requests(self, path: str) -> list[Request]:
        """What was asked for there, so far."""
        lines = self._machine.said("cat", _LOG).splitlines()
        return [request for request in (Request(*line.split("|")) for line in lines) if request.path == path]

    def close(self) -> None:
        """Leave no platform behind."""
        self._machine.run("systemctl", "kill", "--signal=KILL", _UNIT, check=False)  # a reboot has ended it
        wait_for("the server's end", lambda: not self._machine.said("ss", "-Hltn", f"sport = {_PORT}"))
        self._machine.run("rm", "-rf", _LOG, _FOLDER, "/etc/velk/clientapi_ca.crt")
        self._machine.run("rm", "-f", "/etc/velk/ZEF_Velk.pem", "/etc/velk/.ZEF_Velk.key")
        self._machine.write(_USERINFO, self._before)

    def _store(self, leaf: trustme.LeafCert, certificate: str, key: str) -> None:
        chain = b"".join(part.bytes() for part in leaf.cert_chain_pems)
        self._machine.write(certificate, chain.decode())
        self._machine.write(key, leaf.private_key_pem.bytes().decode())
