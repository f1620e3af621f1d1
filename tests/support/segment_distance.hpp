// Point-to-segment distances for oracles, written apart from the product's
// own geometry so that one fault cannot hide in both.
#pragma once

#include <algorithm>
#include <cmath>

namespace zt::test {

// From (x, y) to the closed segment a-b; a segment of length 0 is its end.
inline double segment_distance(double x, double y, double ax, double ay, double bx, double by) {
  const double dx = bx - ax, dy = by - ay, len2 = dx * dx + dy * dy;
  const double t = std::clamp(len2 > 0 ? ((x - ax) * dx + (y - ay) * dy) / len2 : 0.0, 0.0, 1.0);
  return std::hypot(x - ax - t * dx, y - ay - t * dy);
}

// The same for points of any type with x and y.
template <class P>
double segment_distance(const P& q, const P& a, const P& b) {
  return segment_distance(q.x, q.y, a.x, a.y, b.x, b.y);
}

// From q to the nearest edge of a closed ring (its last point joined to its
// first); infinite for an empty ring.
template <class P, class Ring>
double ring_distance(const P& q, const Ring& r) {
  double best = INFINITY;
  for (std::size_t i = 0; i < r.size(); ++i) best = std::min(best, segment_distance(q, r[i], r[(i + 1) % r.size()]));
  return best;
}

}  // namespace zt::test
