// Clipper as a reference in tests and benchmarks: polygons to its integer
// paths, round offsets, Boolean operations, and the boundary distance that
// the oracles compare results by.
#pragma once

#include <polyclipping/clipper.hpp>

#include <algorithm>
#include <cmath>
#include <utility>
#include <vector>

#include "segment_distance.hpp"  // beside this file: benchmarks include it too

namespace zt::test {

namespace cl = ClipperLib;

inline constexpr double kClipperScale = 1e5;  // Clipper works on integers

// A closed polygon (first point repeated) of any point type with x and y.
template <class Poly>
cl::Path to_path(const Poly& p) {
  cl::Path out;
  for (std::size_t i = 0; i + 1 < p.size(); ++i)
    out.push_back({static_cast<cl::cInt>(std::llround(p[i].x * kClipperScale)),
                   static_cast<cl::cInt>(std::llround(p[i].y * kClipperScale))});
  return out;
}

inline cl::Paths round_offset(const cl::Paths& in, double delta, double arcTolerance) {
  cl::ClipperOffset co(2.0, arcTolerance * kClipperScale);
  co.AddPaths(in, cl::jtRound, cl::etClosedPolygon);
  cl::Paths out;
  co.Execute(out, delta * kClipperScale);
  return out;
}

inline cl::Paths clip(const cl::Paths& a, const cl::Paths& b, cl::ClipType op) {
  cl::Clipper c;
  c.AddPaths(a, cl::ptSubject, true);
  c.AddPaths(b, cl::ptClip, true);
  cl::Paths out;
  c.Execute(op, out, cl::pftNonZero, cl::pftNonZero);
  return out;
}

struct Edge {
  double ax, ay, bx, by;
};

inline double distance_to(double x, double y, const std::vector<Edge>& edges) {
  double best = 1e300;
  for (const Edge& e : edges) best = std::min(best, segment_distance(x, y, e.ax, e.ay, e.bx, e.by));
  return best;
}

// Largest distance from a boundary point (vertices and edge midpoints) of
// either side to the other side's boundary; 1e300 when only one side is empty.
template <class Poly>
double boundary_distance(const std::vector<Poly>& ours, const cl::Paths& ref) {
  std::vector<Edge> a, b;
  for (const Poly& p : ours)
    for (std::size_t i = 0; i + 1 < p.size(); ++i) a.push_back({p[i].x, p[i].y, p[i + 1].x, p[i + 1].y});
  for (const cl::Path& p : ref)
    for (std::size_t i = 0; i < p.size(); ++i) {
      const cl::IntPoint &s = p[i], &e = p[(i + 1) % p.size()];
      b.push_back({s.X / kClipperScale, s.Y / kClipperScale, e.X / kClipperScale, e.Y / kClipperScale});
    }
  if (a.empty() || b.empty()) return a.empty() && b.empty() ? 0.0 : 1e300;
  double worst = 0.0;
  for (const auto& [from, to] : {std::make_pair(&a, &b), std::make_pair(&b, &a)})
    for (const Edge& e : *from) {
      worst = std::max(worst, distance_to(e.ax, e.ay, *to));
      worst = std::max(worst, distance_to(0.5 * (e.ax + e.bx), 0.5 * (e.ay + e.by), *to));
    }
  return worst;
}

}  // namespace zt::test
