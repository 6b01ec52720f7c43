"""A guided tour: the agent does its main job in a simulated terminal, before the viewer's eyes."""
