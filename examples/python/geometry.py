"""A small geometry module: the demo and the recorded server replies open it."""


def clamp(value, low, high):
    """Limit value to the range from low to high."""
    return max(low, min(value, high))


class Rectangle:
    """An axis-aligned rectangle."""

    def __init__(self, width, height):
        self.width = width
        self.height = height

    def area(self):
        """The rectangle's area."""
        return self.width * self.height

    def scale(self, factor):
        """Grow or shrink both sides by factor, within 0 to 1000."""
        self.width = clamp(self.width * factor, 0, 1000)
        self.height = clamp(self.height * factor, 0, 1000)
