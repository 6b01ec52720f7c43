"""The load of a fleet of agents on the platform."""
