// Helpers of the Voronoi engine tests: the one language in which the tests
// write their inputs (points, contours, segments), storing them through the
// facade, and computing with the invariant checker.
#pragma once

#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdint>
#include <random>
#include <string>
#include <vector>

#include "support/case_rows.hpp"
#include "voronoi/detail/checker.hpp"
#include "voronoi/detail/compute_vd.hpp"
#include "voronoi/detail/input_repair.hpp"
#include "voronoi/detail/engine_state.hpp"
#include "voronoi/engine.hpp"

namespace zt::test {

struct Pt {
  double x, y;
};
using Contour = std::vector<Pt>;

inline std::vector<Pt> UniformPoints(int n, std::uint32_t seed, double scale = 1.0) {
  std::mt19937 rng(seed);
  std::uniform_real_distribution<double> u(0.0, scale);
  std::vector<Pt> pts(n);
  for (Pt& p : pts) p = {u(rng), u(rng)};
  return pts;
}

// A star-shaped polygon about (cx, cy): n angles jittered about even ones
// (every gap below half a turn for n >= 3), each with a radius in
// [rmin, rmax); counter-clockwise unless `clockwise`.
inline Contour Star(std::mt19937& rng, double cx, double cy, double rmin, double rmax, int n, bool clockwise = false) {
  std::uniform_real_distribution<double> radius(rmin, rmax), jitter(-0.3, 0.3);
  Contour c;
  for (int i = 0; i < n; ++i) {
    const double a = 2 * M_PI * (i + 0.5 + jitter(rng)) / n;
    const double r = radius(rng);
    c.push_back({cx + r * std::cos(a), cy + r * std::sin(a)});
  }
  if (clockwise) std::reverse(c.begin(), c.end());
  return c;
}

// Points, and segments between them by order number. A closed contour adds
// its points and a segment from each to the next, tagged with the contour's
// number; `closingDuplicate` stores its first point once more at the end,
// as the zone builder does.
struct Sites {
  std::vector<Pt> pts;
  std::vector<std::array<int, 3>> segs;  // a, b, tag
  std::vector<Contour> contours;
  int Add(double x, double y) {
    pts.push_back({x, y});
    return static_cast<int>(pts.size()) - 1;
  }
  void AddContour(const Contour& c, bool closingDuplicate = false) {
    const int first = static_cast<int>(pts.size()), n = static_cast<int>(c.size()), tag = static_cast<int>(contours.size());
    for (const Pt& p : c) Add(p.x, p.y);
    if (closingDuplicate) Add(c[0].x, c[0].y);
    for (int i = 0; i < n; ++i) segs.push_back({first + i, closingDuplicate || i + 1 < n ? first + i + 1 : first, tag});
    contours.push_back(c);
  }
};

// A random simple polygon: random points, crossings removed by 2-opt moves.
inline Contour RandomSimplePolygon(int n, std::uint32_t seed) {
  const auto o = [](Pt p, Pt q, Pt r) { return (q.x - p.x) * (r.y - p.y) - (q.y - p.y) * (r.x - p.x); };
  const auto cross = [&](Pt a, Pt b, Pt c, Pt d) { return o(a, b, c) * o(a, b, d) < 0 && o(c, d, a) * o(c, d, b) < 0; };
  Contour c = UniformPoints(n, seed);
  for (bool changed = true; changed;) {
    changed = false;
    for (int i = 0; i < n; ++i)
      for (int j = i + 2; j < n; ++j)
        if (!(i == 0 && j == n - 1) && cross(c[i], c[i + 1], c[j], c[(j + 1) % n])) {
          std::reverse(c.begin() + i + 1, c.begin() + j + 1);
          changed = true;
        }
  }
  return c;
}

// The sites of a text, parts separated by ';', applied in order.
// Points:
//   points x y x y ...     the given points
//   uniform n seed scale   UniformPoints
//   clustered n seed       tight clusters far apart: the nearest-point search
//                          must leave the grid
//   lattice side step      a side x side lattice
//   collinear n seed       points on one line
//   dice n seed max        n points of integer coordinates 0 to max
//   blocks n seed side     n integer points in five squares of that side far
//                          apart: the quadtree, with ties and duplicates
//   ring n r               n points evenly on the circle of radius r about the origin
//   neardup n seed [d]     n pairs of points d (default 1e-12) apart in the unit square
//   jitter seed k          moves every coordinate so far by up to k ulps
// Closed contours, reversed when preceded by "rev":
//   poly x y x y ...                  the given points
//   star n seed [cx cy rmin rmax]     Star (default 0.5 0.5 0.2 0.45)
//   simple n seed                     RandomSimplePolygon
//   circle n cx cy r [phase]          n chord points of a circle (default phase 0.1)
//   staircase steps size              a rectilinear staircase
//   dense k size [at]                 a square with k collinear points on each side, corner at (at, at)
//   burst n r0 r1 [wobble]            n points about the origin at radii r0 and r1 by turns, each
//                                     moved out by wobble sin(7.3 i): a star of n/2 spikes
//   comb teeth width                  a comb outline, its first point repeated at the end
// Segments:
//   segs i-j ...                      between points by order number
//   segment x1 y1 x2 y2               between two new points
//   fan cx cy x y ...                 a point, and segments from it to new points
//   random n seed                     n segments between random points of the unit square
inline Sites ParseSites(const std::string& text) {
  Sites s;
  for (const std::string& part : Parts(text, ';')) {
    std::vector<std::string> w = Split(part);
    if (w.empty()) continue;
    const bool reversed = w[0] == "rev";
    if (reversed) w.erase(w.begin());
    std::vector<double> a;
    for (std::size_t i = 1; i < w.size(); ++i) a.push_back(w[0] == "segs" ? 0 : Num(w[i]));
    const auto arg = [&](std::size_t i, double fallback) { return i < a.size() ? a[i] : fallback; };
    const int n = a.empty() ? 0 : static_cast<int>(a[0]);
    std::mt19937 rng(a.size() > 1 ? static_cast<std::uint32_t>(a[1]) : 0);
    const auto u = [&](double lo, double hi) { return std::uniform_real_distribution<double>(lo, hi)(rng); };
    Contour c;
    if (w[0] == "points") {
      for (std::size_t i = 0; i + 1 < a.size(); i += 2) s.Add(a[i], a[i + 1]);
    } else if (w[0] == "uniform") {
      for (const Pt& p : UniformPoints(n, static_cast<std::uint32_t>(a.at(1)), a.at(2))) s.Add(p.x, p.y);
    } else if (w[0] == "clustered") {
      std::normal_distribution<double> spread(0.0, 0.01);
      Pt centres[5];
      for (Pt& q : centres) q.x = u(0, 1000), q.y = u(0, 1000);
      for (int i = 0; i < n; ++i) {
        const double x = centres[i % 5].x + spread(rng);
        s.Add(x, centres[i % 5].y + spread(rng));
      }
    } else if (w[0] == "lattice") {
      for (int i = 0; i < n; ++i)
        for (int j = 0; j < n; ++j) s.Add(i * a.at(1), j * a.at(1));
    } else if (w[0] == "collinear") {
      std::uniform_int_distribution<int> ui(0, 1 << 20);
      for (int i = 0; i < n; ++i) {
        const double t = ui(rng);
        s.Add(3.0 * t + 7.0, 2.0 * t - 5.0);
      }
    } else if (w[0] == "dice") {
      std::uniform_int_distribution<int> ui(0, static_cast<int>(a.at(2)));
      for (int i = 0; i < n; ++i) {
        const double x = ui(rng);
        s.Add(x, ui(rng));
      }
    } else if (w[0] == "blocks") {
      std::uniform_int_distribution<int> far(0, 1 << 20), in(0, static_cast<int>(a.at(2)));
      Pt corners[5];
      for (Pt& q : corners) q.x = far(rng), q.y = far(rng);
      for (int i = 0; i < n; ++i) {
        const double x = corners[i % 5].x + in(rng);
        s.Add(x, corners[i % 5].y + in(rng));
      }
    } else if (w[0] == "ring") {
      for (int i = 0; i < n; ++i) s.Add(a[1] * std::cos(i * M_PI / (n / 2)), a[1] * std::sin(i * M_PI / (n / 2)));
    } else if (w[0] == "neardup") {
      for (int i = 0; i < n; ++i) {
        const double x = u(0, 1), y = u(0, 1);
        s.Add(x, y);
        s.Add(x + arg(2, 1e-12), y);
      }
    } else if (w[0] == "jitter") {
      std::mt19937 jitter(static_cast<std::uint32_t>(n));
      std::uniform_int_distribution<int> ulp(-static_cast<int>(a.at(1)), static_cast<int>(a.at(1)));
      for (Pt& p : s.pts) {
        for (int k = ulp(jitter); k != 0; k += k > 0 ? -1 : 1) p.x = std::nextafter(p.x, k > 0 ? 10.0 : -10.0);
        for (int k = ulp(jitter); k != 0; k += k > 0 ? -1 : 1) p.y = std::nextafter(p.y, k > 0 ? 10.0 : -10.0);
      }
    } else if (w[0] == "poly") {
      for (std::size_t i = 0; i + 1 < a.size(); i += 2) c.push_back({a[i], a[i + 1]});
    } else if (w[0] == "star") {
      c = Star(rng, arg(2, 0.5), arg(3, 0.5), arg(4, 0.2), arg(5, 0.45), n);
    } else if (w[0] == "simple") {
      c = RandomSimplePolygon(n, static_cast<std::uint32_t>(a.at(1)));
    } else if (w[0] == "circle") {
      for (int i = 0; i < n; ++i) {
        const double angle = arg(4, 0.1) + 2 * M_PI * i / n;
        c.push_back({a.at(1) + a.at(3) * std::cos(angle), a.at(2) + a.at(3) * std::sin(angle)});
      }
    } else if (w[0] == "staircase") {
      const double h = a.at(1) / n;
      c.push_back({0, 0});
      for (int i = 0; i < n; ++i) c.insert(c.end(), {{(i + 1) * h, i * h}, {(i + 1) * h, (i + 1) * h}});
      c.push_back({0, a[1]});
    } else if (w[0] == "dense") {
      const double size = a.at(1), at = arg(2, 0.0);
      for (int side = 0; side < 4; ++side)
        for (int i = 0; i < n; ++i) {
          const double t = size * i / n;
          const Pt p = side == 0 ? Pt{t, 0} : side == 1 ? Pt{size, t} : side == 2 ? Pt{size - t, size} : Pt{0, size - t};
          c.push_back({p.x + at, p.y + at});
        }
    } else if (w[0] == "burst") {
      for (int i = 0; i < n; ++i) {
        const double angle = 2 * M_PI * i / n, r = (i % 2 ? a.at(2) : a.at(1)) + arg(3, 0) * std::sin(7.3 * i);
        c.push_back({r * std::cos(angle), r * std::sin(angle)});
      }
    } else if (w[0] == "comb") {
      const double wd = a.at(1);
      c.push_back({0, 0});
      for (int i = 0; i < n; ++i)
        c.insert(c.end(), {{2 * i * wd, 1}, {(2 * i + 1) * wd, 1}, {(2 * i + 1) * wd, 0.5}, {(2 * i + 2) * wd, 0.5}});
      c.back() = {2 * n * wd, 0};
      s.AddContour(c, true);
      continue;
    } else if (w[0] == "segs") {
      for (std::size_t i = 1; i < w.size(); ++i)
        s.segs.push_back({std::stoi(w[i]), std::stoi(w[i].substr(w[i].find('-') + 1)), 0});
    } else if (w[0] == "segment") {
      s.segs.push_back({s.Add(a.at(0), a.at(1)), s.Add(a.at(2), a.at(3)), 0});
    } else if (w[0] == "fan") {
      const int centre = s.Add(a.at(0), a.at(1));
      for (std::size_t i = 2; i + 1 < a.size(); i += 2) s.segs.push_back({centre, s.Add(a[i], a[i + 1]), 0});
    } else if (w[0] == "random") {
      for (int i = 0; i < n; ++i) {
        const int p = s.Add(u(0, 1), u(0, 1));
        s.segs.push_back({p, s.Add(u(0, 1), u(0, 1)), 0});
      }
    } else {
      ADD_FAILURE() << "unknown sites " << w[0];
    }
    if (c.empty()) continue;
    if (reversed) std::reverse(c.begin(), c.end());
    s.AddContour(c);
  }
  return s;
}

inline std::vector<Pt> Generate(const std::string& text) { return ParseSites(text).pts; }

// The larger side of the points' bounding box.
inline double Extent(const std::vector<Pt>& pts) {
  double x0 = INFINITY, x1 = -INFINITY, y0 = INFINITY, y1 = -INFINITY;
  for (const Pt& p : pts) {
    x0 = std::min(x0, p.x), x1 = std::max(x1, p.x);
    y0 = std::min(y0, p.y), y1 = std::max(y1, p.y);
  }
  return std::max(x1 - x0, y1 - y0);
}

// Resets the engine (initialising it once) and stores the sites: each point
// tagged with its order number, then the segments.
inline void Store(const Sites& s) {
  VD_Initialize();
  VD_Reset();
  std::vector<std::int32_t> idx;
  for (std::size_t i = 0; i < s.pts.size(); ++i) idx.push_back(API_AddPoint(s.pts[i].x, s.pts[i].y, static_cast<std::int32_t>(i)));
  for (const auto& [a, b, tag] : s.segs) API_AddSegment(idx.at(a), idx.at(b), tag);
}
inline void Store(const std::vector<Pt>& pts) { Store(Sites{pts, {}, {}}); }
inline Sites StoreContours(const std::vector<Contour>& contours) {
  Sites s;
  for (const Contour& c : contours) s.AddContour(c);
  Store(s);
  return s;
}

inline bool ComputePoints() { return VD_ComputeDiagram(false, 1, true, false, 0, 0, 0.0, 0.0, true); }
inline bool ComputeSegments() { return VD_ComputeDiagram(false, 1, false, false, 0, 0, 0.0, 0.0, true); }

inline std::string FinalCheck(bool bruteForce = true) {
  vd::CheckOptions o;
  o.bruteForce = bruteForce;
  o.complete = true;
  return vd::CheckDiagram(o);
}

// Computes the stored sites with the checker (local emptiness) after
// insertions (every `every`-th, each of the first `allUpTo`; none for 0) and
// in full at the end: "" or the first error.
inline std::string CheckedCompute(bool pointsOnly = true, int every = 1, bool bruteForce = true, int allUpTo = 0) {
  struct Observer {
    std::string error;
    std::int32_t insertions, every, allUpTo;
    static void Hook(void* self, std::int32_t) {
      auto* o = static_cast<Observer*>(self);
      ++o->insertions;
      if (!o->error.empty() || (o->insertions > o->allUpTo && o->insertions % o->every != 0)) return;
      o->error = vd::CheckDiagram();
      if (!o->error.empty()) o->error = "after insertion " + std::to_string(o->insertions) + ": " + o->error;
    }
  } obs{"", 0, every, allUpTo};
  vd::Vd().insertionObserver = every > 0 ? &Observer::Hook : nullptr;
  vd::Vd().insertionObserverContext = &obs;
  const bool computed = VD_ComputeDiagram(false, 1, pointsOnly, false, 0, 0, 0.0, 0.0, true);
  vd::Vd().insertionObserver = nullptr;
  vd::Vd().insertionObserverContext = nullptr;
  if (!computed) return "not computed";
  return obs.error.empty() ? FinalCheck(bruteForce) : obs.error;
}

// The computed diagram as numbers: every node (live, x, y, r) and edge
// (n1, n2, lft, rgt).
inline std::vector<double> Snapshot() {
  std::vector<double> v;
  for (std::int32_t i = 0; i < VD_GetNodeCount(); ++i) {
    const VD_NodeInfo n = VD_GetNode(i);
    v.insert(v.end(), {n.live ? 1.0 : 0.0, n.x, n.y, n.r});
  }
  for (std::int32_t i = 0; i < VD_GetEdgeCount(); ++i) {
    const VD_EdgeInfo e = VD_GetEdge(i);
    v.insert(v.end(), {double(e.n1), double(e.n2), double(e.lft), double(e.rgt)});
  }
  return v;
}

// A parameterised test's input: a row name and a text of ParseSites.
struct NamedList {
  const char* name;
  const char* list;
};
inline std::string NamedListName(const ::testing::TestParamInfo<NamedList>& info) { return info.param.name; }

}  // namespace zt::test
