// SlopeDomain::approximate_arc: circular arcs of offset curves as chords
// whose sagitta stays within the arc tolerance.
#include <cmath>
#include <numbers>

#include "zone/slope_domain.hpp"

namespace zt {

namespace {

// Cosines closer to +-1 than this are taken as exactly aligned radii.
constexpr double kAlignedCosine = 0.9999999999;
// Bound of the chord count's conversion to 32 bits.
constexpr double kMaxChords = 2147483646.0;

}  // namespace

void SlopeDomain::approximate_arc(const Point2d& s, const Point2d& e, const Point2d& c, bool ccw,
                                  bool withStart, bool withEnd) {
  TaggedPointList& out = *out_;
  const double rs = std::hypot(s.x - c.x, s.y - c.y);
  const double re = std::hypot(e.x - c.x, e.y - c.y);
  const double r = 0.5 * (rs + re);
  // An end point on the centre has no direction to turn from: no chord
  // points, never NaN coordinates.
  if (arcTolerance > r || !(rs > 0.0) || !(re > 0.0) || !std::isfinite(r)) {
    if (withStart) out.Add({0, s.x, s.y});
    if (withEnd) out.Add({0, e.x, e.y});
    return;
  }
  double ux = (s.x - c.x) / rs, uy = (s.y - c.y) / rs;
  const double wx = (e.x - c.x) / re, wy = (e.y - c.y) / re;
  const double cosine = ux * wx + uy * wy;
  double angle = cosine <= -kAlignedCosine  ? std::numbers::pi
                 : cosine >= kAlignedCosine ? 0.0
                                            : std::acos(cosine);
  const double cross = ux * wy - uy * wx;
  if ((ccw && cross < 0.0) || (!ccw && cross > 0.0)) angle = 2.0 * std::numbers::pi - angle;

  const double half = std::acos(1.0 - arcTolerance / r);
  // A radius so large that the chords would not fit an array (or a half
  // angle of 0) is converted without overflow; the array then reports it.
  const double chords = std::floor(angle / (2.0 * half));
  const std::int32_t n =
      chords < kMaxChords ? static_cast<std::int32_t>(chords) + 1 : static_cast<std::int32_t>(kMaxChords);
  make_room(out, n + 1);
  const double delta = (ccw ? 1.0 : -1.0) * angle / n;
  const double cd = std::cos(delta), sd = std::sin(delta);
  if (withStart) out.Add({0, s.x, s.y});
  for (std::int32_t j = 1; j < n; ++j) {
    const double rx = ux * cd - uy * sd;
    uy = ux * sd + uy * cd;
    ux = rx;
    out.Add({0, c.x + r * ux, c.y + r * uy});
  }
  if (withEnd) out.Add({0, e.x, e.y});
}

}  // namespace zt
