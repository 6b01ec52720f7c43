"""The box that contains a terminal: its command line, its first process, and how the host enters it."""
