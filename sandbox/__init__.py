"""A complete simulated terminal around the real agent: files, buses, desktop services and platform."""

from pathlib import Path

REPOSITORY = Path(__file__).resolve().parent.parent
