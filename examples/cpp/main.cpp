// Uses the shape library; the odd layout of Report gives a formatter something to do.
#include <cstdio>

#include "shapes.h"

static void Report(const shapes::Rectangle& rectangle) {
    std::printf("area %d, perimeter %d\n",   rectangle.Area(), rectangle.Perimeter());
}

int main() {
  shapes::Rectangle rectangle(3, 4);
  Report(rectangle);
  rectangle.Scale(2);
  Report(rectangle);
  return shapes::Clamp(rectangle.Area(), 0, 100) == 48 ? 0 : 1;
}
