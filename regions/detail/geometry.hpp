// The two numeric routines of the overlay: where two segments meet, and
// whether a segment crosses the ray from a point towards +x. Pure functions
// of their arguments; every comparison is made against the tolerance passed.
#pragma once

#include "regions/detail/engine.hpp"

namespace zt::detail {

// Result of segment_intersection asking for the test with the roles exchanged.
inline constexpr int kRetryReversed = -2;

// Meeting points of segment P0-P1 (first) and Q0-Q1 (second): 0, 1 (r1) or 2
// (r1 and r2, an overlap of collinear segments; they may coincide), or
// kRetryReversed when an end of the second lies on the first's line beyond
// the first segment. Every point returned lies on the first segment.
int segment_intersection(const Point2d& p0, const Point2d& p1, const Point2d& q0, const Point2d& q1,
                         Point2d& r1, Point2d& r2, SegmentDirection& dirA, SegmentDirection& dirB,
                         double eps);

// 1 when segment a-b meets the line y = py strictly right of px; endpoints
// within eps of the line count as lying just above it.
int ray_crossing(double px, double py, double ax, double ay, double bx, double by, double eps);

}  // namespace zt::detail
