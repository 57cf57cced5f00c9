"""Uses the geometry module."""
from geometry import Rectangle, clamp


def report(rectangle):
    print("area", rectangle.area())


rectangle = Rectangle(3, 4)
report(rectangle)
rectangle.scale(2)
print(clamp(rectangle.area(), 0, 100))
