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
from itertools import count
from pathlib import Path

from cryptography.hazmat.primitives import serialization

sys.path.insert(0, str(Path(__file__).resolve().parents[2]))

from sandbox.platform.certificates import Authority, CertificateFiles, write_secret  # noqa: E402
from tests.support.https_scripts import Conversation, Over, answer  # noqa: E402

_HOST = "127.0.0.1"
_LISTEN_BACKLOG = 64

_print_lock = threading.Lock()
_handshakes = count(1)


def _converse(raw: socket.socket, context: ssl.SSLContext) -> None:
    try:
        with context.wrap_socket(raw, server_side=True) as tls:
            conversation = Conversation(tls, next(_handshakes))
            while request := conversation.read_request():
                _print_json(conversation.describe(request))
                answer(conversation, request)
    except (OSError, Over):
        pass  # refused certificates and clients that leave are what the scripts are for


def _serve(listener: socket.socket, context: ssl.SSLContext) -> None:
    while True:
        raw, _ = listener.accept()
        raw.setsockopt(socket.IPPROTO_TCP, socket.TCP_NODELAY, 1)
        threading.Thread(target=_converse, args=(raw, context), daemon=True).start()


def _print_json(value: object) -> None:
    with _print_lock:
        print(json.dumps(value), flush=True)


def _context(identity: CertificateFiles, clients: Authority, demand: ssl.VerifyMode) -> ssl.SSLContext:
    context = ssl.SSLContext(ssl.PROTOCOL_TLS_SERVER)
    context.load_cert_chain(identity.certificate, identity.key)
    context.load_verify_locations(clients.certificate)
    context.verify_mode = demand
    # HTTP/2 is offered first and never spoken: a client that accepts it gets nowhere.
    context.set_alpn_protocols(["h2", "http/1.1"])
    return context


def _older_context(identity: CertificateFiles, clients: Authority) -> ssl.SSLContext:
    context = _context(identity, clients, ssl.CERT_REQUIRED)
    context.maximum_version = ssl.TLSVersion.TLSv1_2
    return context


def _outdated_context(identity: CertificateFiles, clients: Authority) -> ssl.SSLContext:
    context = _context(identity, clients, ssl.CERT_OPTIONAL)
    with warnings.catch_warnings():
        warnings.simplefilter("ignore", DeprecationWarning)
        context.minimum_version = context.maximum_version = ssl.TLSVersion.TLSv1_1
    context.set_ciphers("ALL:@SECLEVEL=0")  # without it, OpenSSL offers nothing below TLS 1.2
    return context


def _doors(
    platform: Authority, stranger: Authority, proper: CertificateFiles
) -> dict[str, ssl.SSLContext | None]:
    """The doors' names and TLS sides; None: nothing is ever said there."""
    return {
        "proper": _context(proper, platform, ssl.CERT_OPTIONAL),
        "demanding": _context(proper, platform, ssl.CERT_REQUIRED),
        "demanding older": _older_context(proper, platform),
        "stranger": _context(stranger.issue_server(_HOST), platform, ssl.CERT_OPTIONAL),
        "misnamed": _context(platform.issue_server("elsewhere.invalid"), platform, ssl.CERT_OPTIONAL),
        "expired": _context(platform.issue_server(_HOST, expired=True), platform, ssl.CERT_OPTIONAL),
        "outdated": _outdated_context(proper, platform),
        "silent": None,
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
    sockets = {name: socket.create_server((_HOST, 0), backlog=_LISTEN_BACKLOG) for name in doors}
    for name, context in doors.items():
        if context:
            threading.Thread(target=_serve, args=(sockets[name], context), daemon=True).start()
    # Bound but not listening: connections are refused, and no other program gets the port.
    sockets["refusing"] = socket.socket()
    sockets["refusing"].bind((_HOST, 0))

    ports = {name: listener.getsockname()[1] for name, listener in sockets.items()}
    _print_json({"ports": ports, "files": _files(platform, stranger, proper)})
    sys.stdin.buffer.read()


if __name__ == "__main__":
    main()
