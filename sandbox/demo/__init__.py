"""A guided tour: shows the agent's main tasks in a simulated terminal."""
