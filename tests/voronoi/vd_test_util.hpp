// Helpers of the Voronoi engine tests: point sets and a driver that runs
// the facade and the invariant checker.
#pragma once

#include <gtest/gtest.h>

#include <cstdint>
#include <random>
#include <string>
#include <vector>

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

// Resets the engine (initialising it once) and stores the points with their
// order number as tag.
inline void Store(const std::vector<Pt>& pts) {
  VD_Initialize();
  VD_Reset();
  for (std::size_t i = 0; i < pts.size(); ++i) API_AddPoint(pts[i].x, pts[i].y, static_cast<std::int32_t>(i));
}

inline bool ComputePoints() { return VD_ComputeDiagram(false, 1, true, false, 0, 0, 0.0, 0.0, true); }

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
