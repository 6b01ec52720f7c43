"""The figures by group; each module measures one group inside a box: see bench.inside."""
