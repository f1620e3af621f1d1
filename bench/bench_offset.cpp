// Offsetting through the Voronoi engine (diagram + one offset + collection
// into polylines, SlopeDomain::compute as the zone builder runs it) beside
// Clipper's ClipperOffset with round joins at the same arc tolerance, on the
// same input, in the same run:
//   Zigzag   a 100,000-vertex zigzag circle of radius 1000 and amplitude 0.5
//            (every vertex a corner, so the feeding's thinning keeps them
//            all), offset inside by 0.2;
//   Pocket   a 20,000-vertex zigzag pocket with 20 zigzag islands of 1,000
//            vertices each, offset into the material by 0.5.
// Clipper gets the points scaled by 2^20 to integers, once, outside the
// timing.
#include <benchmark/benchmark.h>

#include <polyclipping/clipper.hpp>

#include <cmath>
#include <numbers>
#include <vector>

#include "voronoi/engine.hpp"
#include "zone/slope_domain.hpp"

namespace {

constexpr double kClipperScale = 1048576.0;

using Ring = std::vector<zt::Point2d>;

Ring zigzag(double cx, double cy, double r, double amp, int n, bool clockwise) {
  Ring c;
  for (int k = 0; k < n; ++k) {
    const double a = 2 * std::numbers::pi * (clockwise ? n - k : k) / n;
    const double rr = r + (k % 2 ? amp : -amp);
    c.push_back({cx + rr * std::cos(a), cy + rr * std::sin(a)});
  }
  return c;
}

const std::vector<Ring>& zigzag_circle() {
  static const std::vector<Ring> r{zigzag(0, 0, 1000, 0.5, 100000, false)};
  return r;
}

const std::vector<Ring>& pocket() {
  static const std::vector<Ring> r = [] {
    std::vector<Ring> v{zigzag(0, 0, 100, 0.05, 20000, false)};
    for (int i = 0; i < 20; ++i) {
      const double a = 2 * std::numbers::pi * i / 20;
      const double d = i % 2 ? 40 : 75;
      v.push_back(zigzag(d * std::cos(a), d * std::sin(a), 6, 0.02, 1000, true));
    }
    return v;
  }();
  return r;
}

void to_list(const std::vector<Ring>& rings, zt::TaggedPointList& l) {
  l.Clear();
  for (const Ring& r : rings) {
    for (const zt::Point2d& p : r) l.AddDoubling({0, p.x, p.y});
    l.AddDoubling({0, r[0].x, r[0].y});
    l.AddDoubling(zt::TaggedPoint::separator());
  }
}

ClipperLib::Paths to_paths(const std::vector<Ring>& rings) {
  ClipperLib::Paths ps;
  for (const Ring& r : rings) {
    ClipperLib::Path p;
    for (const zt::Point2d& q : r)
      p.push_back({static_cast<ClipperLib::cInt>(std::llround(q.x * kClipperScale)),
                   static_cast<ClipperLib::cInt>(std::llround(q.y * kClipperScale))});
    ps.push_back(p);
  }
  return ps;
}

void ours(benchmark::State& state, const std::vector<Ring>& rings, double t) {
  zt::VD_Initialize();
  zt::TaggedPointList list;
  std::int32_t points = 0;
  for (auto _ : state) {
    // Every iteration computes: curves remembered from the last one would
    // time a lookup, not an offset.
    state.PauseTiming();
    zt::forget_offset_groups();
    state.ResumeTiming();
    to_list(rings, list);
    zt::SlopeDomain domain(t);
    if (domain.compute(list, zt::kSideLeft) != 0) state.SkipWithError("compute failed");
    points = list.count();
    benchmark::DoNotOptimize(list);
  }
  state.counters["points_out"] = static_cast<double>(points);
}

void clipper(benchmark::State& state, const std::vector<Ring>& rings, double t) {
  const ClipperLib::Paths input = to_paths(rings);
  std::size_t points = 0;
  for (auto _ : state) {
    ClipperLib::ClipperOffset co(2.0, zt::kArcTolerance * kClipperScale);
    co.AddPaths(input, ClipperLib::jtRound, ClipperLib::etClosedPolygon);
    ClipperLib::Paths out;
    co.Execute(out, -t * kClipperScale);  // counter-clockwise outer ring: inwards
    points = 0;
    for (const auto& p : out) points += p.size();
    benchmark::DoNotOptimize(out);
  }
  state.counters["points_out"] = static_cast<double>(points);
}

void BM_Zigzag_Ours(benchmark::State& s) { ours(s, zigzag_circle(), 0.2); }
void BM_Zigzag_Clipper(benchmark::State& s) { clipper(s, zigzag_circle(), 0.2); }
void BM_Pocket_Ours(benchmark::State& s) { ours(s, pocket(), 0.5); }
void BM_Pocket_Clipper(benchmark::State& s) { clipper(s, pocket(), 0.5); }

BENCHMARK(BM_Zigzag_Ours)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_Zigzag_Clipper)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_Pocket_Ours)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_Pocket_Clipper)->Unit(benchmark::kMillisecond);

}  // namespace

BENCHMARK_MAIN();
