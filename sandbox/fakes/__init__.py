"""The services that the agent talks to on the buses, one module each."""
