// The shape library's definitions.
#include "shapes.h"

namespace shapes {

Rectangle::Rectangle(int width, int height) : width_(width), height_(height) {}

int Rectangle::Area() const { return width_ * height_; }

int Rectangle::Perimeter() const { return 2 * (width_ + height_); }

void Rectangle::Scale(int factor) {
  width_ = Clamp(width_ * factor, 0, 1000);
  height_ = Clamp(height_ * factor, 0, 1000);
}

int Clamp(int value, int low, int high) {
  if (value < low) return low;
  if (value > high) return high;
  return value;
}

}  // namespace shapes
