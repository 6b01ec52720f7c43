"""Shows the events of a terminal line by line while they happen."""
