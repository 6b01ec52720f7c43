"""The simulated terminal with a prompt, for developers who integrate a daemon or a platform with the
agent."""
