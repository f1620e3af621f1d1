// The diagram of polygons beside Boost.Polygon's segment Voronoi diagram on
// the same integer input in the same run: star-shaped simple polygons of
// 2e4 and 1e5 segments, and a pocket with 20 islands. Each case reports the
// peak memory of one construction (growth of the resident set's high-water
// mark, in a child process) and our restarts, and BM_OursOverBoost runs the
// two in turn and reports the ratio of times.
//
// Beside them, ours against itself: 25,000 squares stored as the zone
// builder stores contours (the closing point once more, an exact duplicate)
// over the same squares closed on their own first index
// (BM_ZoneFeedOverOwnIndex, ratio_median); and wavy polygons of 1e5 to 4e5
// segments, whose nearly collinear neighbours give copied nodes
// (BM_Wavy, and BM_WavyGrowth: 4e5 over 1e5 segments, ratio_median).
#include <benchmark/benchmark.h>

#include <boost/polygon/segment_data.hpp>
#include <boost/polygon/voronoi.hpp>
#include <cmath>
#include <map>
#include <random>
#include <string>
#include <vector>

#include "bench/common.hpp"
#include "voronoi/engine.hpp"

namespace {

using BPoint = boost::polygon::point_data<int>;
using BSegment = boost::polygon::segment_data<int>;
using Polygon = std::vector<BPoint>;

// Jittered even angles keep every gap below half a turn: simple polygons.
Polygon Star(int n, std::mt19937& rng, double cx, double cy, double rmin, double rmax, bool reverse) {
  std::uniform_real_distribution<double> ua(0.0, 0.8), ur(rmin, rmax);
  Polygon p;
  for (int i = 0; i < n; ++i) {
    const double a = 2 * M_PI * (i + ua(rng)) / n, r = ur(rng);
    const BPoint q(int(std::lround(cx + r * std::cos(a))), int(std::lround(cy + r * std::sin(a))));
    if (p.empty() || !(q == p.back())) p.push_back(q);
  }
  if (reverse) std::reverse(p.begin(), p.end());
  return p;
}

std::vector<Polygon> Make(int kind, int n) {
  std::mt19937 rng(kind * 7 + n);
  if (kind == 0) return {Star(n, rng, 0, 0, 4e6, 8e6, false)};
  // Pocket: an outer star and 20 islands (4 x 5) of n/40 vertices each.
  std::vector<Polygon> polys{Star(n / 2, rng, 0, 0, 7.5e6, 8e6, false)};
  for (int i = 0; i < 4; ++i)
    for (int j = 0; j < 5; ++j)
      polys.push_back(Star(n / 40, rng, -3.6e6 + 2.4e6 * i, -4e6 + 2e6 * j, 4e5, 8e5, true));
  return polys;
}

const std::vector<Polygon>& Input(int kind, int n) {
  static std::map<std::pair<int, int>, std::vector<Polygon>> cache;
  auto& v = cache[{kind, n}];
  if (v.empty()) v = Make(kind, n);
  return v;
}

void RunOurs(const std::vector<Polygon>& polys) {
  zt::VD_Initialize();
  zt::VD_Reset();
  std::vector<std::int32_t> idx;
  for (const Polygon& p : polys) {
    idx.clear();
    for (const BPoint& q : p) idx.push_back(zt::API_AddPoint(q.x(), q.y(), 0));
    for (std::size_t i = 0; i < idx.size(); ++i) zt::API_AddSegment(idx[i], idx[(i + 1) % idx.size()], 0);
  }
  if (!zt::VD_ComputeDiagram(false, 1, false, false, 0, 0, 0.0, 0.0, true)) std::abort();
}

void RunBoost(const std::vector<Polygon>& polys) {
  std::vector<BSegment> segs;
  for (const Polygon& p : polys)
    for (std::size_t i = 0; i < p.size(); ++i) segs.emplace_back(p[i], p[(i + 1) % p.size()]);
  boost::polygon::voronoi_diagram<double> vd;
  boost::polygon::construct_voronoi(segs.begin(), segs.end(), &vd);
  benchmark::DoNotOptimize(vd.num_vertices());
}

void BM_Ours(benchmark::State& state) {
  const auto& polys = Input(static_cast<int>(state.range(0)), static_cast<int>(state.range(1)));
  zt::bench::timed_case(state, zt::VD_Terminate, [&] { RunOurs(polys); });
  state.counters["restarts"] = zt::VD_GetRestartCount();
  state.counters["recovery"] = zt::VD_InRecoveryMode();
}

void BM_Boost(benchmark::State& state) {
  const auto& polys = Input(static_cast<int>(state.range(0)), static_cast<int>(state.range(1)));
  zt::bench::timed_case(state, zt::VD_Terminate, [&] { RunBoost(polys); });
}

void BM_OursOverBoost(benchmark::State& state) {
  const auto& polys = Input(static_cast<int>(state.range(0)), static_cast<int>(state.range(1)));
  zt::bench::paired_case(state, zt::VD_Terminate, [&] { RunOurs(polys); }, [&] { RunBoost(polys); });
}

// Closed contours of user coordinates, stored with a segment from each
// point to the next; `zoneFeed` stores the first point once more at the end
// (as the zone builder does) instead of closing on the first index.
using Ring = std::vector<std::pair<double, double>>;

void RunRings(const std::vector<Ring>& rings, bool zoneFeed) {
  zt::VD_Initialize();
  zt::VD_Reset();
  std::vector<std::int32_t> idx;
  for (const Ring& r : rings) {
    idx.clear();
    for (const auto& [x, y] : r) idx.push_back(zt::API_AddPoint(x, y, 0));
    if (zoneFeed) idx.push_back(zt::API_AddPoint(r[0].first, r[0].second, 0));
    const std::size_t n = r.size();
    for (std::size_t i = 0; i < n; ++i) zt::API_AddSegment(idx[i], zoneFeed ? idx[i + 1] : idx[(i + 1) % n], 0);
  }
  if (!zt::VD_ComputeDiagram(false, 1, false, false, 0, 0, 0.0, 0.0, true)) std::abort();
}

// 25,000 unit squares, 0.5 apart, on a 158 x 159 grid.
const std::vector<Ring>& Squares() {
  static std::vector<Ring> rings;
  if (rings.empty()) {
    for (int k = 0; k < 25000; ++k) {
      const double x = 1.5 * (k % 158), y = 1.5 * (k / 158);
      rings.push_back({{x, y}, {x + 1, y}, {x + 1, y + 1}, {x, y + 1}});
    }
  }
  return rings;
}

// A closed wavy curve of n vertices: radius 1000 (1 + 0.02 sin(1000 angle)),
// a hundred and more nearly collinear vertices per wave.
const std::vector<Ring>& Wavy(int n) {
  static std::map<int, std::vector<Ring>> cache;
  auto& v = cache[n];
  if (v.empty()) {
    Ring r;
    for (int i = 0; i < n; ++i) {
      const double a = 2 * M_PI * i / n, rad = 1000.0 * (1 + 0.02 * std::sin(1000.0 * a));
      r.push_back({rad * std::cos(a), rad * std::sin(a)});
    }
    v.push_back(r);
  }
  return v;
}

void BM_ZoneFeedOverOwnIndex(benchmark::State& state) {
  zt::bench::paired_case(state, zt::VD_Terminate, [] { RunRings(Squares(), true); },
                         [] { RunRings(Squares(), false); });
  state.counters["restarts"] = zt::VD_GetRestartCount();
}
BENCHMARK(BM_ZoneFeedOverOwnIndex)->Unit(benchmark::kMillisecond)->MinTime(8);

void BM_Wavy(benchmark::State& state) {
  const auto& rings = Wavy(static_cast<int>(state.range(0)));
  zt::bench::timed_case(state, zt::VD_Terminate, [&] { RunRings(rings, false); });
  state.counters["restarts"] = zt::VD_GetRestartCount();
  state.counters["recovery"] = zt::VD_InRecoveryMode();
}
BENCHMARK(BM_Wavy)->Arg(100000)->Arg(200000)->Arg(400000)->Unit(benchmark::kMillisecond);

void BM_WavyGrowth(benchmark::State& state) {
  zt::bench::paired_case(state, zt::VD_Terminate, [] { RunRings(Wavy(400000), false); },
                         [] { RunRings(Wavy(100000), false); });
}
BENCHMARK(BM_WavyGrowth)->Unit(benchmark::kMillisecond)->MinTime(8);

// Arguments: (0 star | 1 pocket with 20 islands, number of segments).
#define CASES ->Args({0, 20000})->Args({0, 100000})->Args({1, 20000})->Unit(benchmark::kMillisecond)
BENCHMARK(BM_Ours) CASES;
BENCHMARK(BM_Boost) CASES;
BENCHMARK(BM_OursOverBoost) CASES->MinTime(8);

}  // namespace

BENCHMARK_MAIN();
