// Helpers of the Voronoi engine tests: point sets and a driver that runs
// the facade and the invariant checker.
#pragma once

#include <gtest/gtest.h>

#include <algorithm>
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

inline std::vector<Pt> UniformPoints(int n, std::uint32_t seed, double scale = 1.0) {
  std::mt19937 rng(seed);
  std::uniform_real_distribution<double> u(0.0, scale);
  std::vector<Pt> pts(n);
  for (Pt& p : pts) p = {u(rng), u(rng)};
  return pts;
}

// A parameterised test's input: a row name and a generator list for Generate
// (or a form the test reads itself); NamedListName names the instance.
struct NamedList {
  const char* name;
  const char* list;
};
inline std::string NamedListName(const ::testing::TestParamInfo<NamedList>& info) { return info.param.name; }

// The points of a generator list, parts separated by ';':
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
//   jitter seed k          moves every coordinate so far by up to k ulps
inline std::vector<Pt> Generate(const std::string& list) {
  std::vector<Pt> pts;
  for (const std::string& part : Parts(list, ';')) {
    const std::vector<std::string> w = Split(part);
    std::vector<double> a;
    for (std::size_t i = 1; i < w.size(); ++i) a.push_back(Num(w[i]));
    const int n = a.empty() ? 0 : static_cast<int>(a[0]);
    std::mt19937 rng(a.size() > 1 ? static_cast<std::uint32_t>(a[1]) : 0);
    if (w.empty()) continue;
    if (w[0] == "points") {
      for (std::size_t i = 0; i + 1 < a.size(); i += 2) pts.push_back({a[i], a[i + 1]});
    } else if (w[0] == "uniform") {
      const std::vector<Pt> more = UniformPoints(n, static_cast<std::uint32_t>(a.at(1)), a.at(2));
      pts.insert(pts.end(), more.begin(), more.end());
    } else if (w[0] == "clustered") {
      std::uniform_real_distribution<double> u(0.0, 1000.0);
      std::normal_distribution<double> spread(0.0, 0.01);
      Pt centres[5];
      for (Pt& c : centres) c = {u(rng), u(rng)};
      for (int i = 0; i < n; ++i) pts.push_back({centres[i % 5].x + spread(rng), centres[i % 5].y + spread(rng)});
    } else if (w[0] == "lattice") {
      for (int i = 0; i < n; ++i)
        for (int j = 0; j < n; ++j) pts.push_back({i * a.at(1), j * a.at(1)});
    } else if (w[0] == "collinear") {
      std::uniform_int_distribution<int> u(0, 1 << 20);
      for (int i = 0; i < n; ++i) {
        const double t = u(rng);
        pts.push_back({3.0 * t + 7.0, 2.0 * t - 5.0});
      }
    } else if (w[0] == "dice") {
      std::uniform_int_distribution<int> u(0, static_cast<int>(a.at(2)));
      for (int i = 0; i < n; ++i) pts.push_back({double(u(rng)), double(u(rng))});
    } else if (w[0] == "blocks") {
      std::uniform_int_distribution<int> far(0, 1 << 20), in(0, static_cast<int>(a.at(2)));
      Pt corners[5];
      for (Pt& c : corners) c = {double(far(rng)), double(far(rng))};
      for (int i = 0; i < n; ++i) pts.push_back({corners[i % 5].x + in(rng), corners[i % 5].y + in(rng)});
    } else if (w[0] == "ring") {
      for (int i = 0; i < n; ++i) pts.push_back({a[1] * std::cos(i * M_PI / (n / 2)), a[1] * std::sin(i * M_PI / (n / 2))});
    } else if (w[0] == "jitter") {
      std::mt19937 jitter(static_cast<std::uint32_t>(n));
      std::uniform_int_distribution<int> ulp(-static_cast<int>(a.at(1)), static_cast<int>(a.at(1)));
      for (Pt& p : pts) {
        for (int k = ulp(jitter); k != 0; k += k > 0 ? -1 : 1) p.x = std::nextafter(p.x, k > 0 ? 10.0 : -10.0);
        for (int k = ulp(jitter); k != 0; k += k > 0 ? -1 : 1) p.y = std::nextafter(p.y, k > 0 ? 10.0 : -10.0);
      }
    } else {
      ADD_FAILURE() << "unknown generator " << w[0];
    }
  }
  return pts;
}

// The larger side of the points' bounding box.
inline double Extent(const std::vector<Pt>& pts) {
  double x0 = INFINITY, x1 = -INFINITY, y0 = INFINITY, y1 = -INFINITY;
  for (const Pt& p : pts) {
    x0 = std::min(x0, p.x), x1 = std::max(x1, p.x);
    y0 = std::min(y0, p.y), y1 = std::max(y1, p.y);
  }
  return std::max(x1 - x0, y1 - y0);
}

// Resets the engine (initialising it once) and stores the points with their
// order number as tag.
inline void Store(const std::vector<Pt>& pts) {
  VD_Initialize();
  VD_Reset();
  for (std::size_t i = 0; i < pts.size(); ++i) API_AddPoint(pts[i].x, pts[i].y, static_cast<std::int32_t>(i));
}

using Contour = std::vector<Pt>;

// Resets the engine and stores closed contours: each point once (tagged
// `pointTag`), a segment from each to the next and back to the first
// (tagged with the contour's number).
inline void StoreContours(const std::vector<Contour>& contours, std::int32_t pointTag = -1) {
  VD_Initialize();
  VD_Reset();
  for (std::size_t c = 0; c < contours.size(); ++c) {
    std::vector<std::int32_t> idx;
    for (const Pt& p : contours[c]) idx.push_back(API_AddPoint(p.x, p.y, pointTag));
    for (std::size_t i = 0; i < idx.size(); ++i)
      API_AddSegment(idx[i], idx[(i + 1) % idx.size()], static_cast<std::int32_t>(c));
  }
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

inline std::string CheckedRun(const std::vector<Pt>& pts) {
  Store(pts);
  return CheckedCompute();
}

}  // namespace zt::test
