// A small shape library: the demo and the recorded server replies open these files.
#pragma once

namespace shapes {

// Anything with an area.
class Shape {
 public:
  virtual ~Shape() = default;
  virtual int Area() const = 0;
};

// An axis-aligned rectangle.
class Rectangle : public Shape {
 public:
  Rectangle(int width, int height);

  int Area() const override;
  int Perimeter() const;
  void Scale(int factor);

 private:
  int width_;
  int height_;
};

// Limits value to the range from low to high.
int Clamp(int value, int low, int high);

}  // namespace shapes
