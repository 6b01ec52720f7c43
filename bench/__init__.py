"""Measures the agent's costs in the simulated terminal, against floors that do the bare minimum."""
