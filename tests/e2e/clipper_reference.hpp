// A reference of the program's whole computation built with Clipper, for the
// end-to-end oracle and the benchmark: per level the rest material grown by
// the offset distance (round joins at the same arc tolerance) and cut to the
// finishing region; then from the deepest level up each level's zones grown
// by the merge radius + 0.04, united with those carried from below, and the
// union shrunk by the merge radius. Levels follow the driver's rules: a
// level reaches the zone builder only with more than 4 records.
#pragma once

#include <polyclipping/clipper.hpp>

#include <algorithm>
#include <cmath>
#include <map>
#include <vector>

namespace zt::e2e {

namespace cl = ClipperLib;

inline constexpr double kClipperScale = 1e5;  // Clipper works on integers
inline constexpr double kArcTolerance = 0.005;
inline constexpr double kMergeMargin = 0.04;

struct RefPt {
  double x, y;
};
using RefPoly = std::vector<RefPt>;  // closed: first point repeated

struct RefLevel {
  float z;
  std::vector<RefPoly> finishing;  // outer counter-clockwise, islands clockwise
  std::vector<RefPoly> rest;       // outer counter-clockwise
};

inline cl::Path to_path(const RefPoly& p) {
  cl::Path out;
  for (std::size_t i = 0; i + 1 < p.size(); ++i)
    out.push_back({static_cast<cl::cInt>(std::llround(p[i].x * kClipperScale)),
                   static_cast<cl::cInt>(std::llround(p[i].y * kClipperScale))});
  return out;
}

inline cl::Paths to_paths(const std::vector<RefPoly>& polys) {
  cl::Paths out;
  for (const RefPoly& p : polys) out.push_back(to_path(p));
  return out;
}

inline cl::Paths round_offset(const cl::Paths& in, double delta) {
  cl::ClipperOffset co(2.0, kArcTolerance * kClipperScale);
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

// Records of a level's range in stock1.bin: its points and the separators
// between its contours.
inline std::size_t level_records(const RefLevel& l) {
  std::size_t n = 0;
  for (const RefPoly& p : l.rest) n += p.size();
  return l.rest.empty() ? 0 : n + l.rest.size() - 1;
}

// Final zones per level z (levels below the deepest one with zones absent).
inline std::map<float, cl::Paths> reference_zones(const std::vector<RefLevel>& levels, double offsetDistance,
                                                  double mergeRadius) {
  std::map<float, cl::Paths> finals;
  cl::Paths carried, last;
  bool any = false;
  for (auto it = levels.rbegin(); it != levels.rend(); ++it) {
    if (level_records(*it) > 4) {
      const cl::Paths zones =
          clip(to_paths(it->finishing), round_offset(to_paths(it->rest), offsetDistance), cl::ctIntersection);
      if (!zones.empty()) {
        carried = clip(carried, round_offset(zones, mergeRadius + kMergeMargin), cl::ctUnion);
        last = round_offset(carried, -mergeRadius);
        any = true;
      }
    }
    if (any) finals[it->z] = last;
  }
  return finals;
}

struct Edge {
  double ax, ay, bx, by;
};

inline double distance_to(double x, double y, const std::vector<Edge>& edges) {
  double best = 1e300;
  for (const Edge& e : edges) {
    const double dx = e.bx - e.ax, dy = e.by - e.ay;
    const double len2 = dx * dx + dy * dy;
    const double t = std::clamp(len2 > 0 ? ((x - e.ax) * dx + (y - e.ay) * dy) / len2 : 0.0, 0.0, 1.0);
    best = std::min(best, std::hypot(x - e.ax - t * dx, y - e.ay - t * dy));
  }
  return best;
}

// Largest distance from a boundary point (vertices and edge midpoints) of
// either side to the other side's boundary.
inline double boundary_distance(const std::vector<RefPoly>& ours, const cl::Paths& ref) {
  std::vector<Edge> a, b;
  for (const RefPoly& p : ours)
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

}  // namespace zt::e2e
