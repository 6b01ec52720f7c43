"""A whole day of a terminal in a few minutes: is anything lost, does anything grow?"""
