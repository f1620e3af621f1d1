// The diagram of polygons beside Boost.Polygon's segment Voronoi diagram on
// the same integer input in the same run: star-shaped simple polygons of
// 2e4 and 1e5 segments, and a pocket with 20 islands. Each case reports the
// peak memory of one construction (growth of the resident set's high-water
// mark, in a child process) and our restarts, and BM_OursOverBoost runs the
// two in turn and reports the ratio of times.
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

// Arguments: (0 star | 1 pocket with 20 islands, number of segments).
#define CASES ->Args({0, 20000})->Args({0, 100000})->Args({1, 20000})->Unit(benchmark::kMillisecond)
BENCHMARK(BM_Ours) CASES;
BENCHMARK(BM_Boost) CASES;
BENCHMARK(BM_OursOverBoost) CASES->MinTime(8);

}  // namespace

BENCHMARK_MAIN();
