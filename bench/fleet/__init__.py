"""What a fleet of agents means for the platform."""
