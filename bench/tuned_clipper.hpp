// The Clipper pipeline as an engineer who tunes it would write it, as a
// benchmark peer of the whole program: the same steps as the plain reference
// (grow the rest material, cut it to the finishing region, then from the
// deepest level up grow, unite, shrink), with three tunings of the offset:
//  - each contour is first thinned by Douglas-Peucker within a tenth of the
//    arc tolerance;
//  - at a turn where the offset edges overlap, their crossing point is used
//    instead of a spike back to the vertex (the spike stays where the clipped
//    edge would run backwards);
//  - at a turn where they part so slightly that the miter point lies within a
//    tenth of the arc tolerance of the arc, the miter point replaces the arc.
// The raw offset curves are then resolved by one union (positive winding).
#pragma once

#include <cmath>
#include <map>
#include <vector>

#include "tests/e2e/clipper_reference.hpp"

namespace zt::bench {

namespace cl = ClipperLib;
using e2e::kArcTolerance;
using e2e::RefLevel;
using test::kClipperScale;

// Thinning and miter bounds of the tuned pipeline, in user units.
inline constexpr double kTunedThinning = kArcTolerance / 10;
inline constexpr double kTunedMiterLimit = kArcTolerance / 10;
// Turns whose sine is below this are straight: one offset point.
inline constexpr double kStraightSine = 1e-12;

struct DPt {
  double x, y;
};

inline double chord_distance(const DPt& p, const DPt& a, const DPt& b) {
  const double dx = b.x - a.x, dy = b.y - a.y, len2 = dx * dx + dy * dy;
  if (len2 == 0) return std::hypot(p.x - a.x, p.y - a.y);
  return std::fabs((p.x - a.x) * dy - (p.y - a.y) * dx) / std::sqrt(len2);
}

// Douglas-Peucker of ring[first..last] (indices modulo n), keeping the ends;
// marks kept points.
inline void dp_mark(const std::vector<DPt>& ring, std::size_t first, std::size_t last, double tol,
                    std::vector<char>& keep) {
  const std::size_t n = ring.size();
  std::vector<std::pair<std::size_t, std::size_t>> stack{{first, last}};
  while (!stack.empty()) {
    const auto [a, b] = stack.back();
    stack.pop_back();
    double worst = tol;
    std::size_t at = a;
    for (std::size_t i = a + 1; i < b; ++i) {
      const double d = chord_distance(ring[i % n], ring[a % n], ring[b % n]);
      if (d > worst) worst = d, at = i;
    }
    if (at != a) {
      keep[at % n] = 1;
      stack.push_back({a, at});
      stack.push_back({at, b});
    }
  }
}

// A closed path thinned within `tol` (anchored at its first point and the
// point farthest from it).
inline std::vector<DPt> thin_ring(const cl::Path& p, double tol) {
  std::vector<DPt> ring;
  ring.reserve(p.size());
  for (const cl::IntPoint& q : p) ring.push_back({q.X / kClipperScale, q.Y / kClipperScale});
  const std::size_t n = ring.size();
  if (n < 4) return ring;
  std::size_t far = 0;
  double best = -1;
  for (std::size_t i = 1; i < n; ++i) {
    const double d = std::hypot(ring[i].x - ring[0].x, ring[i].y - ring[0].y);
    if (d > best) best = d, far = i;
  }
  std::vector<char> keep(n, 0);
  keep[0] = keep[far] = 1;
  dp_mark(ring, 0, far, tol, keep);
  dp_mark(ring, far, n, tol, keep);
  std::vector<DPt> out;
  for (std::size_t i = 0; i < n; ++i)
    if (keep[i]) out.push_back(ring[i]);
  return out;
}

inline cl::IntPoint to_int(double x, double y) {
  return {static_cast<cl::cInt>(std::llround(x * kClipperScale)), static_cast<cl::cInt>(std::llround(y * kClipperScale))};
}

// The raw offset curve of one thinned ring by delta (> 0 grows a
// counter-clockwise ring).
inline cl::Path raw_offset(const std::vector<DPt>& r, double delta, double stepsPerRad) {
  const std::size_t n = r.size();
  cl::Path out;
  if (n < 3) return out;
  std::vector<DPt> nrm(n);
  std::vector<double> len(n);
  for (std::size_t i = 0; i < n; ++i) {
    const DPt &a = r[i], &b = r[(i + 1) % n];
    const double dx = b.x - a.x, dy = b.y - a.y, l = std::hypot(dx, dy);
    len[i] = l;
    nrm[i] = l > 0 ? DPt{dy / l, -dx / l} : DPt{0, 0};
  }
  const double ad = std::fabs(delta);
  // How far each overlapping join's crossing point pulls both edges back.
  std::vector<double> retreat(n, 0.0);
  for (std::size_t i = 0; i < n; ++i) {
    const DPt &n1 = nrm[(i + n - 1) % n], &n2 = nrm[i];
    const double sinA = n1.x * n2.y - n1.y * n2.x, cosA = n1.x * n2.x + n1.y * n2.y;
    if (sinA * delta < 0) retreat[i] = 1 + cosA > 0 ? ad * std::fabs(sinA) / (1 + cosA) : 1e300;
  }
  for (std::size_t i = 0; i < n; ++i) {
    const std::size_t k = (i + n - 1) % n;  // incoming edge
    const DPt& p = r[i];
    const DPt &n1 = nrm[k], &n2 = nrm[i];
    const double sinA = n1.x * n2.y - n1.y * n2.x, cosA = n1.x * n2.x + n1.y * n2.y;
    if (std::fabs(sinA) < kStraightSine && cosA > 0) {
      out.push_back(to_int(p.x + delta * n2.x, p.y + delta * n2.y));
      continue;
    }
    const double denom = 1 + cosA;
    if (sinA * delta < 0) {  // the offset edges overlap: their crossing point
      // Neither clipped edge may run backwards (both of its ends pulled back).
      if (retreat[k] + retreat[i] <= len[k] && retreat[i] + retreat[(i + 1) % n] <= len[i]) {
        out.push_back(to_int(p.x + delta * (n1.x + n2.x) / denom, p.y + delta * (n1.y + n2.y) / denom));
      } else {
        out.push_back(to_int(p.x + delta * n1.x, p.y + delta * n1.y));
        out.push_back(to_int(p.x, p.y));
        out.push_back(to_int(p.x + delta * n2.x, p.y + delta * n2.y));
      }
      continue;
    }
    // The offset edges part: the miter point when it lies close to the arc.
    if (denom > 0) {
      const double miter = ad * std::sqrt(2 / denom);  // |delta| / cos(a/2)
      if (miter - ad <= kTunedMiterLimit) {
        out.push_back(to_int(p.x + delta * (n1.x + n2.x) / denom, p.y + delta * (n1.y + n2.y) / denom));
        continue;
      }
    }
    const double a = std::atan2(sinA, cosA);
    const int steps = std::max(1, static_cast<int>(std::lround(stepsPerRad * std::fabs(a))));
    const double s = std::sin(a / steps), c = std::cos(a / steps);
    double x = n1.x, y = n1.y;
    out.push_back(to_int(p.x + delta * x, p.y + delta * y));
    for (int j = 1; j < steps; ++j) {
      const double nx = x * c - y * s;
      y = x * s + y * c;
      x = nx;
      out.push_back(to_int(p.x + delta * x, p.y + delta * y));
    }
    out.push_back(to_int(p.x + delta * n2.x, p.y + delta * n2.y));
  }
  return out;
}

// The tuned counterpart of ClipperOffset with round joins at the arc tolerance.
inline cl::Paths tuned_offset(const cl::Paths& in, double delta) {
  const double ad = std::fabs(delta);
  const double stepsPerRad = ad > kArcTolerance ? 0.5 / std::acos(1 - kArcTolerance / ad) : 1.0;
  cl::Clipper c;
  for (const cl::Path& p : in) {
    const cl::Path raw = raw_offset(thin_ring(p, kTunedThinning), delta, stepsPerRad);
    if (raw.size() >= 3) c.AddPath(raw, cl::ptSubject, true);
  }
  cl::Paths out;
  c.Execute(cl::ctUnion, out, cl::pftPositive, cl::pftPositive);
  return out;
}

// Final zones per level z, assembled as the reference pipeline assembles them.
inline std::map<float, cl::Paths> tuned_zones(const std::vector<RefLevel>& levels, double offsetDistance,
                                              double mergeRadius, std::size_t minRecords = 5) {
  return e2e::assemble_zones(
      levels, mergeRadius, minRecords,
      [&](const RefLevel& l) {
        return test::clip(e2e::to_paths(l.finishing), tuned_offset(e2e::to_paths(l.rest), offsetDistance),
                          cl::ctIntersection);
      },
      tuned_offset);
}

}  // namespace zt::bench
