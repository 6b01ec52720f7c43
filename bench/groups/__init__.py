"""The groups of figures; each module measures one group inside a box (see bench.inside)."""
