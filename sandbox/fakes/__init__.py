"""The fakes of the services that the agent uses on the buses, one module each."""
