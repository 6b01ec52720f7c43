"""The terminal's machine: files, users, packages, commands, clock and network."""
