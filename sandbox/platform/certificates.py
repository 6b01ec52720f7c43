"""Certificate authorities made on the spot, and the certificates that they issue."""

import os
import re
from dataclasses import dataclass
from datetime import datetime
from pathlib import Path

import trustme

_LONG_AGO = datetime(2001, 1, 1)


@dataclass(frozen=True)
class CertificateFiles:
    """A certificate with its private key, as files: the PEM chain and the PEM key."""

    certificate: Path
    key: Path


class Authority:
    """A certificate authority of its own, whose files are kept in one folder under its name.

    Authorities with different names can share a folder. Issuing again to the same name replaces the files.
    """

    certificate: Path
    """The authority's own certificate, the trust anchor of those who trust it."""

    def __init__(self, folder: Path, name: str) -> None:
        folder.mkdir(parents=True, exist_ok=True)
        self._folder = folder
        self._name = name
        self._authority = trustme.CA(organization_name=name)
        self.certificate = folder / f"{name}.pem"
        self._authority.cert_pem.write_to_path(str(self.certificate))

    def issue_server(self, *hosts: str, expired: bool = False) -> CertificateFiles:
        """A certificate for a server reached by these host names or addresses."""
        leaf = self._authority.issue_cert(*hosts, not_after=_LONG_AGO if expired else None)
        return self._store(leaf, f"{'expired' if expired else 'server'}-{hosts[0]}")

    def issue_client(self, name: str) -> CertificateFiles:
        """A certificate for a client, with the name as its subject's common name."""
        leaf = self._authority.issue_cert("client.invalid", common_name=name)
        return self._store(leaf, f"client-{name}")

    def _store(self, leaf: trustme.LeafCert, label: str) -> CertificateFiles:
        stem = re.sub(r"[^\w.-]", "_", f"{self._name}-{label}")
        identity = CertificateFiles(self._folder / f"{stem}.pem", self._folder / f"{stem}.key")
        identity.certificate.write_bytes(b"".join(blob.bytes() for blob in leaf.cert_chain_pems))
        write_secret(identity.key, leaf.private_key_pem.bytes())
        return identity


def write_secret(path: Path, content: bytes) -> None:
    """Writes a file that only its owner can read, at every moment."""
    path.unlink(missing_ok=True)
    with open(path, "wb", opener=lambda name, flags: os.open(name, flags, 0o600)) as file:
        file.write(content)
