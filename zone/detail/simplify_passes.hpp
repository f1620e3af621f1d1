// The two passes shared by both simplifier forms, independent of where the
// points and keep flags are stored.
#pragma once

#include <cstdint>
#include <utility>
#include <vector>

#include "core/points.hpp"

namespace zt::detail {

inline double squared_distance(const Point2d& a, const Point2d& b) {
  const double dx = a.x - b.x;
  const double dy = a.y - b.y;
  return dx * dx + dy * dy;
}

// Squared distances to the segment a-b, its terms formed once per range. A
// zero-length segment falls into the first branch (s = 0), so there is no
// division by zero.
struct Segment {
  Point2d a, b;
  double dx, dy, len2;
  Segment(const Point2d& from, const Point2d& to)
      : a(from), b(to), dx(to.x - from.x), dy(to.y - from.y), len2(dx * dx + dy * dy) {}

  double squared_distance_to(const Point2d& p) const {
    const double s = (p.x - a.x) * dx + (p.y - a.y) * dy;
    if (s <= 0.0) return squared_distance(p, a);
    if (s >= len2) return squared_distance(p, b);
    const double t = s / len2;
    return squared_distance(p, Point2d{a.x + t * dx, a.y + t * dy});
  }
};

// Radial pass over points[0..n), n >= 2. `append` adds a point to the run,
// `last` returns the run's last point and `replaceLast` overwrites it. A point
// is kept when it lies strictly farther than rho from the last kept one; the
// last input point always ends the run, replacing a close predecessor.
template <typename Append, typename Last, typename ReplaceLast>
void radial_pass(const Point2d* points, std::int32_t n, double rho, Append append, Last last,
                 ReplaceLast replaceLast) {
  const double rho2 = rho * rho;
  append(points[0]);
  for (std::int32_t i = 1; i + 1 < n; ++i) {
    if (squared_distance(points[i], last()) > rho2) append(points[i]);
  }
  const Point2d& end = points[n - 1];
  if (squared_distance(end, last()) > rho2) {
    append(end);
  } else {
    replaceLast(end);
  }
}

// Iterative Douglas-Peucker over run[0..m), m >= 2. The caller has cleared
// every flag; `mark(k)` flags point k. A range keeps its farthest point when
// that lies strictly beyond tau (tau2 = tau squared); of equal maxima the
// first index wins.
template <typename Mark>
void douglas_peucker(const Point2d* run, std::int32_t m, double tau2, Mark mark,
                     std::vector<std::pair<std::int32_t, std::int32_t>>& stack) {
  mark(0);
  mark(m - 1);
  stack.clear();
  stack.emplace_back(0, m - 1);
  while (!stack.empty()) {
    const auto [i, j] = stack.back();
    stack.pop_back();
    const Segment chord(run[i], run[j]);
    double largest = -1.0;
    std::int32_t farthest = -1;
    for (std::int32_t k = i + 1; k < j; ++k) {
      const double d2 = chord.squared_distance_to(run[k]);
      if (d2 > largest) {
        largest = d2;
        farthest = k;
      }
    }
    if (farthest >= 0 && largest > tau2) {
      mark(farthest);
      if (farthest - i > 1) stack.emplace_back(i, farthest);
      if (j - farthest > 1) stack.emplace_back(farthest, j);
    }
  }
}

}  // namespace zt::detail
