// Helpers of the Voronoi engine tests: point sets and a driver that runs
// the facade and the invariant checker.
#pragma once

#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <random>
#include <string>
#include <vector>

#include "case_rows.hpp"
#include "voronoi/detail/checker.hpp"
#include "voronoi/detail/compute_vd.hpp"
#include "voronoi/detail/input_repair.hpp"
#include "voronoi/detail/engine_state.hpp"
#include "voronoi/engine.hpp"

namespace zt::vdtest {

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

// Tight clusters far apart: the nearest-point search must leave the grid.
inline std::vector<Pt> ClusteredPoints(int n, std::uint32_t seed) {
  std::mt19937 rng(seed);
  std::uniform_real_distribution<double> u(0.0, 1000.0);
  std::normal_distribution<double> spread(0.0, 0.01);
  std::vector<Pt> centres(5);
  for (Pt& c : centres) c = {u(rng), u(rng)};
  std::vector<Pt> pts(n);
  for (int i = 0; i < n; ++i) pts[i] = {centres[i % 5].x + spread(rng), centres[i % 5].y + spread(rng)};
  return pts;
}

inline std::vector<Pt> LatticePoints(int side, double step = 1.0) {
  std::vector<Pt> pts;
  for (int i = 0; i < side; ++i)
    for (int j = 0; j < side; ++j) pts.push_back({i * step, j * step});
  return pts;
}

inline std::vector<Pt> CollinearPoints(int n, std::uint32_t seed) {
  std::mt19937 rng(seed);
  std::uniform_int_distribution<int> u(0, 1 << 20);
  std::vector<Pt> pts(n);
  for (Pt& p : pts) {
    const double t = u(rng);
    p = {3.0 * t + 7.0, 2.0 * t - 5.0};
  }
  return pts;
}

// The points of a generator list, parts separated by ';':
//   points x y x y ...     the given points
//   uniform n seed scale   UniformPoints
//   clustered n seed       ClusteredPoints
//   lattice side step      LatticePoints
//   collinear n seed       CollinearPoints
//   ring n r               n points evenly on the circle of radius r about the origin
//   jitter seed k          moves every coordinate so far by up to k ulps
inline std::vector<Pt> Generate(const std::string& spec) {
  std::vector<Pt> pts, more;
  std::istringstream s(spec);
  for (std::string part; std::getline(s, part, ';');) {
    std::vector<std::string> w = Words(part);
    if (w.empty()) continue;
    const std::string kind = w[0];
    w.erase(w.begin());
    std::vector<double> a;
    for (const std::string& x : w) a.push_back(Num(x));
    const auto arg = [&](std::size_t i) { return static_cast<int>(a.at(i)); };
    more.clear();
    if (kind == "points") {
      for (std::size_t i = 0; i + 1 < a.size(); i += 2) more.push_back({a[i], a[i + 1]});
    } else if (kind == "uniform") {
      more = UniformPoints(arg(0), arg(1), a.at(2));
    } else if (kind == "clustered") {
      more = ClusteredPoints(arg(0), arg(1));
    } else if (kind == "lattice") {
      more = LatticePoints(arg(0), a.at(1));
    } else if (kind == "collinear") {
      more = CollinearPoints(arg(0), arg(1));
    } else if (kind == "ring") {
      for (int i = 0; i < arg(0); ++i)
        more.push_back({a[1] * std::cos(i * M_PI / (arg(0) / 2)), a[1] * std::sin(i * M_PI / (arg(0) / 2))});
    } else if (kind == "jitter") {
      std::mt19937 rng(arg(0));
      std::uniform_int_distribution<int> ulp(-arg(1), arg(1));
      for (Pt& p : pts) {
        for (int k = ulp(rng); k != 0; k += k > 0 ? -1 : 1) p.x = std::nextafter(p.x, k > 0 ? 10.0 : -10.0);
        for (int k = ulp(rng); k != 0; k += k > 0 ? -1 : 1) p.y = std::nextafter(p.y, k > 0 ? 10.0 : -10.0);
      }
    } else {
      ADD_FAILURE() << "unknown generator " << kind;
    }
    pts.insert(pts.end(), more.begin(), more.end());
  }
  return pts;
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

// Runs the checker after every insertion (local emptiness) and in full
// (brute force) at the end; the first failure is kept.
struct CheckingObserver {
  std::string firstError;
  std::int32_t insertions = 0;
  std::int32_t every = 1;        // check after every `every`-th insertion ...
  std::int32_t allUpTo = 0;      // ... but after each of the first `allUpTo`

  static void Hook(void* self, std::int32_t) {
    auto* o = static_cast<CheckingObserver*>(self);
    ++o->insertions;
    if (!o->firstError.empty()) return;
    if (o->insertions > o->allUpTo && o->insertions % o->every != 0) return;
    o->firstError = vd::CheckDiagram();
    if (!o->firstError.empty()) o->firstError = "after insertion " + std::to_string(o->insertions) + ": " + o->firstError;
  }
  void Attach() {
    vd::Vd().insertionObserver = &Hook;
    vd::Vd().insertionObserverContext = this;
  }
  ~CheckingObserver() {
    vd::Vd().insertionObserver = nullptr;
    vd::Vd().insertionObserverContext = nullptr;
  }
};

inline std::string FinalCheck(bool bruteForce = true) {
  vd::CheckOptions o;
  o.bruteForce = bruteForce;
  o.complete = true;
  return vd::CheckDiagram(o);
}

// Computes the stored sites with the checker after insertions (every
// `every`-th, each of the first `allUpTo`) and in full at the end: "" or the
// first error.
inline std::string CheckedCompute(bool pointsOnly = true, int every = 1, bool bruteForce = true, int allUpTo = 0) {
  CheckingObserver obs;
  obs.every = every;
  obs.allUpTo = allUpTo;
  obs.Attach();
  if (!VD_ComputeDiagram(false, 1, pointsOnly, false, 0, 0, 0.0, 0.0, true)) return "not computed";
  return obs.firstError.empty() ? FinalCheck(bruteForce) : obs.firstError;
}

inline std::string CheckedRun(const std::vector<Pt>& pts) {
  Store(pts);
  return CheckedCompute();
}

}  // namespace zt::vdtest
