"""What the agent costs, measured in the simulated terminal against floors that do the bare minimum."""
