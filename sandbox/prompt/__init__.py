"""The simulated terminal with a prompt, for people who integrate a daemon or a platform with the agent."""
