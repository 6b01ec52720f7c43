"""The two buses: their daemons, connections to them, and who is on them."""
