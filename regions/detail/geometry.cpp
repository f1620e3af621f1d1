// Segment intersection and ray crossing, as the overlay uses them.
#include "regions/detail/geometry.hpp"

#include <cmath>
#include <utility>

namespace zt::detail {
namespace {

bool near(const Point2d& a, const Point2d& b, double eps) {
  const double dx = a.x - b.x, dy = a.y - b.y;
  return dx * dx + dy * dy < eps * eps;
}

bool same_strict_side(double d0, double d1) { return (d0 < 0 && d1 < 0) || (d0 > 0 && d1 > 0); }

// An end X of the second segment lies on the first line: it is the meeting
// point when it is (near) an end of the first segment or between them.
int end_on_first_line(const Point2d& x, double tX, const Point2d& p0, const Point2d& p1, Point2d& r1,
                      double eps) {
  if (near(x, p0, eps)) {
    r1 = p0;
  } else if (near(x, p1, eps)) {
    r1 = p1;
  } else if (tX >= 0.0 && tX <= 1.0) {
    r1 = x;
  } else {
    return kRetryReversed;
  }
  return 1;
}

}  // namespace

int segment_intersection(const Point2d& p0, const Point2d& p1, const Point2d& q0, const Point2d& q1,
                         Point2d& r1, Point2d& r2, SegmentDirection& dirA, SegmentDirection& dirB,
                         double eps) {
  const double dAx = p1.x - p0.x, dAy = p1.y - p0.y;
  const double dBx = q1.x - q0.x, dBy = q1.y - q0.y;
  const double lA = std::sqrt(dAx * dAx + dAy * dAy);
  const double lB = std::sqrt(dBx * dBx + dBy * dBy);
  dirA = {dAx, dAy, lA};
  dirB = {dBx, dBy, lB};
  const double uAx = dAx / lA, uAy = dAy / lA;
  const double uBx = dBx / lB, uBy = dBy / lB;

  const double dP0 = uBx * (p0.y - q0.y) - uBy * (p0.x - q0.x);
  const double dP1 = uBx * (p1.y - q0.y) - uBy * (p1.x - q0.x);
  const double dQ0 = uAx * (q0.y - p0.y) - uAy * (q0.x - p0.x);
  const double dQ1 = uAx * (q1.y - p0.y) - uAy * (q1.x - p0.x);

  auto tOnA = [&](const Point2d& x) { return ((x.x - p0.x) * uAx + (x.y - p0.y) * uAy) / lA; };
  auto sOnB = [&](const Point2d& x) { return ((x.x - q0.x) * uBx + (x.y - q0.y) * uBy) / lB; };

  const bool q0On = std::fabs(dQ0) < eps;
  const bool q1On = std::fabs(dQ1) < eps;
  if (q0On && q1On && std::fabs(dP0) < eps && std::fabs(dP1) < eps) {
    // Collinear: the overlap of the second segment's span with [0, 1] on the first.
    double t0 = tOnA(q0), t1 = tOnA(q1);
    Point2d low = q0, high = q1;
    if (t0 > t1) {
      std::swap(t0, t1);
      std::swap(low, high);
    }
    if (near(low, p0, eps)) {
      t0 = 0.0;
    } else if (near(low, p1, eps)) {
      t0 = 1.0;
    }
    if (near(high, p0, eps)) {
      t1 = 0.0;
    } else if (near(high, p1, eps)) {
      t1 = 1.0;
    } else if (t1 < 0.0) {
      return 0;
    }
    if (t0 > 1.0) return 0;
    const double a = t0 > 0.0 ? t0 : 0.0;
    const double b = t1 < 1.0 ? t1 : 1.0;
    r1 = {p0.x + a * dAx, p0.y + a * dAy};
    r2 = {p0.x + b * dAx, p0.y + b * dAy};
    return 2;
  }
  if (q0On) return end_on_first_line(q0, tOnA(q0), p0, p1, r1, eps);
  if (!q1On) {
    if (same_strict_side(dQ0, dQ1)) return 0;
    if (std::fabs(dP0) < eps) {
      const double s = sOnB(p0);
      if (!(s >= 0.0 && s <= 1.0)) return 0;
      r1 = p0;
      return 1;
    }
    if (std::fabs(dP1) < eps) {
      const double s = sOnB(p1);
      if (!(s >= 0.0 && s <= 1.0)) return 0;
      r1 = p1;
      return 1;
    }
    if (same_strict_side(dP0, dP1)) return 0;
    // A proper crossing. For nearly parallel edges the quotient is
    // ill-conditioned; it is held to the first segment so the point found is
    // never off both edges.
    double s = ((q0.x - p0.x) * dBy - dBx * (q0.y - p0.y)) / (dAx * dBy - dBx * dAy);
    if (!(s >= 0.0)) s = 0.0;  // also catches NaN
    if (s > 1.0) s = 1.0;
    r1 = {p0.x + s * dAx, p0.y + s * dAy};
    return 1;
  }
  return end_on_first_line(q1, tOnA(q1), p0, p1, r1, eps);
}

int ray_crossing(double px, double py, double ax, double ay, double bx, double by, double eps) {
  double lowX = ax, lowY = ay, highX = bx, highY = by;
  if (!(by > ay)) {
    lowX = bx, lowY = by, highX = ax, highY = ay;
  }
  // An end within eps of the line lies just above it, where it is: the
  // segment then meets the line at that end. Lifting the end by eps instead
  // would move the meeting point along a shallow segment by eps over its
  // slope, past a vertex of the star the ray starts from (a sliver's end a
  // few eps beside it) and so misread the status there.
  if (std::fabs(lowY - py) <= eps || !(py > lowY)) return 0;
  if (std::fabs(highY - py) <= eps) return highX > px || (highX == px && lowX > px) ? 1 : 0;
  if (highY > py && (py - lowY) / (highY - lowY) * (highX - lowX) > px - lowX) return 1;
  return 0;
}

}  // namespace zt::detail
