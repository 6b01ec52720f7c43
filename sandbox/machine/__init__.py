"""What the terminal's machine consists of: files, users, packages, commands, clock and network."""
