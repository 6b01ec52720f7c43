"""A complete simulated terminal: file view, buses, desktop services and platform around the real agent."""
