"""A scripted HTTPS server: the path of a request says how the server answers, or misbehaves.

It makes its certificates in the given folder, listens on ports of 127.0.0.1 that the system picks, and prints
one JSON line with ports and files:

    {"ports": {DOOR: PORT, ...}, "files": {NAME: PATH, ...}}

Each door is a port with a TLS side of its own, see `_doors`; the paths are in https_scripts.py. From then on,
each request received is one more JSON line, printed before the request is answered. The server leaves when
its standard input is closed.
"""

from __future__ import annotations

import argparse
import json
import socket
import ssl
import sys
import threading
import warnings
from pathlib import Path

from cryptography.hazmat.primitives import serialization

sys.path.insert(0, str(Path(__file__).resolve().parents[2]))

from sandbox.platform.certificates import Authority, CertificateFiles, write_secret  # noqa: E402
from sandbox.platform.https import Conversation, Listener, Request, server_context  # noqa: E402
from tests.support.https_scripts import answer  # noqa: E402

_HOST = "127.0.0.1"
_REPORTED_BODY = 16 * 1024  # bytes; the reader of the reports may be waiting for the answer just now

_print_lock = threading.Lock()


def _print_json(value: object) -> None:
    with _print_lock:
        print(json.dumps(value), flush=True)


def _report_and_answer(conversation: Conversation, request: Request) -> None:
    _print_json(
        {
            "line": request.line,
            "headers": request.headers.items(),
            "body": request.body[:_REPORTED_BODY].decode(errors="backslashreplace"),
            "handshake": conversation.handshake,
            "resumed": conversation.tls.session_reused,
            "tls": conversation.tls.version(),
            "protocol": conversation.tls.selected_alpn_protocol(),
            "client": conversation.client,
        }
    )
    answer(conversation, request)


def _older(context: ssl.SSLContext) -> ssl.SSLContext:
    context.maximum_version = ssl.TLSVersion.TLSv1_2
    return context


def _outdated(context: ssl.SSLContext) -> ssl.SSLContext:
    with warnings.catch_warnings():
        warnings.simplefilter("ignore", DeprecationWarning)
        context.minimum_version = context.maximum_version = ssl.TLSVersion.TLSv1_1
    context.set_ciphers("ALL:@SECLEVEL=0")  # without it, OpenSSL offers nothing below TLS 1.2
    return context


def _doors(platform: Authority, stranger: Authority, proper: CertificateFiles) -> dict[str, ssl.SSLContext]:
    """The TLS side of each door on which anything is ever said."""

    def context(identity: CertificateFiles, demand: ssl.VerifyMode = ssl.CERT_OPTIONAL) -> ssl.SSLContext:
        made = server_context(identity, platform.certificate, demand)
        # HTTP/2 is offered first and never spoken: a client that accepts it gets nowhere.
        made.set_alpn_protocols(["h2", "http/1.1"])
        return made

    return {
        "proper": context(proper),
        "demanding": context(proper, ssl.CERT_REQUIRED),
        "demanding older": _older(context(proper, ssl.CERT_REQUIRED)),
        "stranger": context(stranger.issue_server(_HOST)),
        "misnamed": context(platform.issue_server("elsewhere.invalid")),
        "expired": context(platform.issue_server(_HOST, expired=True)),
        "outdated": _outdated(context(proper)),
    }


def _encrypt_key(identity: CertificateFiles) -> Path:
    key = serialization.load_pem_private_key(identity.key.read_bytes(), password=None)
    encrypted = identity.key.with_suffix(".encrypted.key")
    pem = key.private_bytes(
        serialization.Encoding.PEM,
        serialization.PrivateFormat.PKCS8,
        serialization.BestAvailableEncryption(b"secret"),
    )
    write_secret(encrypted, pem)
    return encrypted


def _files(platform: Authority, stranger: Authority, proper: CertificateFiles) -> dict[str, str]:
    client = platform.issue_client("terminal")
    files = {
        "ca": platform.certificate,
        "stranger-ca": stranger.certificate,
        "client": client.certificate,
        "client-key": client.key,
        "encrypted-key": _encrypt_key(client),
        "server": proper.certificate,
        "server-key": proper.key,
    }
    return {name: str(path) for name, path in files.items()}


def main() -> None:
    """Entry point."""
    parser = argparse.ArgumentParser(
        description=__doc__, formatter_class=argparse.RawDescriptionHelpFormatter
    )
    parser.add_argument("folder", type=Path, help="where the certificates and keys go")
    folder = parser.parse_args().folder

    platform, stranger = Authority(folder, "platform"), Authority(folder, "stranger")
    proper = platform.issue_server(_HOST, "localhost")
    doors = _doors(platform, stranger, proper)
    ports = {name: Listener((_HOST, 0), doors[name], _report_and_answer).port for name in doors}
    # Accepts connections and says nothing; and one that refuses them, which no other program gets meanwhile.
    silent, refusing = socket.create_server((_HOST, 0)), socket.socket()
    refusing.bind((_HOST, 0))
    ports |= {"silent": silent.getsockname()[1], "refusing": refusing.getsockname()[1]}

    _print_json({"ports": ports, "files": _files(platform, stranger, proper)})
    sys.stdin.buffer.read()


if __name__ == "__main__":
    main()
