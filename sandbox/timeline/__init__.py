"""The traffic of a terminal, shown to people line by line while it happens."""
