"""The users of a box."""

from __future__ import annotations

import os
from dataclasses import dataclass

FIRST_DOMAIN_UID = 10001


@dataclass(frozen=True)
class User:
    """An account of the terminal; domain accounts have uids above 10000 and names that begin with "@"."""

    name: str
    uid: int

    @property
    def home(self) -> str:
        """Home folder inside the box."""
        return f"/home/{self.name.replace('@', '')}"

    @property
    def is_domain_user(self) -> bool:
        """Whether this is a domain account, not a local one."""
        return self.uid >= FIRST_DOMAIN_UID

    @property
    def plain_name(self) -> str:
        """The name without any "@", as the agent reports it."""
        return self.name.replace("@", "")

    @property
    def passwd_line(self) -> str:
        """The account's line in /etc/passwd."""
        return f"{self.name}:x:{self.uid}:{self.uid}:{self.plain_name}:{self.home}:/bin/bash\n"


DOMAIN_USER = User("@zhang.wei", 20001)
LOCAL_USER = User("operator", 1000)
USERS = {"domain": DOMAIN_USER, "local": LOCAL_USER}


def current_user() -> User:
    """The user that this box was entered as."""
    return User(os.environ["USER"], os.getuid())
