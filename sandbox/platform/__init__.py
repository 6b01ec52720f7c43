"""The platform behind the HTTPS wire, and the daemon's uploads to it."""
