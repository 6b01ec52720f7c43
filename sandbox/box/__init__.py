"""The box that a terminal is: its command line, its first process, and the way in from outside."""
