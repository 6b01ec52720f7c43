"""Stand-ins for what makes the root of another release and goes into it."""

from __future__ import annotations

from tests.dev.devtree import Tree

# What is run in namespaces of its own is run here; in the root, in the guest's folder of it.
_UNSHARE = """while [[ $1 == -* ]]; do shift; done
[[ $1 == */enter-root ]] || exec "$@"
cd "$2/home/guest/velks" && shift 3 && exec "$@"
"""
_CHROOT = '[[ $2 != sh ]] || mkdir -p "$1/home/guest"'
_DEBOOTSTRAP = 'mkdir -p "${@: -1}/etc"'


def let_roots_be_made(tree: Tree) -> None:
    """Let roots be made of an empty folder."""
    tree.stand_in("unshare", _UNSHARE)
    tree.stand_in("chroot", _CHROOT)
    tree.stand_in("debootstrap", _DEBOOTSTRAP)
    tree.stand_in("chown")
