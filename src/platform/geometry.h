// Points and rectangles of double-precision coordinates, the shapes the panel helpers of
// liblumeris take and return (font fitting, window capture, point conversion).
//
// Plain values with no invariant: a rectangle may have a negative or zero size. Which way the
// y axis points is said by each function that takes one.
//
// Thread-safety: values; nothing is shared.
#pragma once

namespace lumeris {

struct Point {
  double x = 0;
  double y = 0;
  friend bool operator==(const Point&, const Point&) = default;
};

struct Rect {
  double x = 0;
  double y = 0;
  double width = 0;
  double height = 0;
  // No area: a width or height of zero or less (the empty-rectangle test of the panel code).
  bool IsEmpty() const { return !(width > 0) || !(height > 0); }
  friend bool operator==(const Rect&, const Rect&) = default;
};

}  // namespace lumeris
