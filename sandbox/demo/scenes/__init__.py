"""The scenes of the tour; to add one, extend SCENES."""

from __future__ import annotations

from sandbox.demo.scene import Scene
from sandbox.demo.scenes import applications, domain_exit, messages, policies, session, software

# The first scene starts the agent; all others are optional.
SCENES: tuple[Scene, ...] = (
    session.BEGIN,
    messages.PASSWORD_EXPIRES,
    messages.WAITING,
    session.STATES,
    applications.APPLICATIONS,
    software.SOFTWARE,
    policies.FORWARDED,
    policies.NOTICES,
    policies.PASSWORD,
    policies.ACCOUNT_DISABLED,
    policies.TERMINAL_DISABLED,
    session.DAEMON_RESTART,
    policies.STRANGER,
    domain_exit.DOMAIN_EXIT,
)
