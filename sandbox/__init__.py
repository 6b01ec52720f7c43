"""A complete simulated terminal: file view, buses, desktop services and platform around the real agent."""

from pathlib import Path

REPOSITORY = Path(__file__).resolve().parent.parent
