"""The installed package on a machine that really boots: see machine.py."""
