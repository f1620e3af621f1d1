// The diagram of points beside Boost.Polygon's Voronoi diagram on the same
// integer input in the same run: 1e5 and 1e6 uniform points, 1e5 clustered
// points. Each case also reports the peak memory of one construction
// (growth of the resident set's high-water mark, in a child process), and
// BM_OursOverBoost runs the two in turn and reports the ratio of times.
#include <benchmark/benchmark.h>

#include <boost/polygon/voronoi.hpp>
#include <cstdio>
#include <map>
#include <random>
#include <string>
#include <vector>

#include "bench/common.hpp"
#include "voronoi/engine.hpp"

namespace {

using BPoint = boost::polygon::point_data<int>;

std::vector<BPoint> Uniform(int n) {
  std::mt19937 rng(1);
  std::uniform_int_distribution<int> u(0, (1 << 24) - 1);
  std::vector<BPoint> pts(n);
  for (auto& p : pts) p = BPoint(u(rng), u(rng));
  return pts;
}

std::vector<BPoint> Clustered(int n) {
  std::mt19937 rng(2);
  std::uniform_int_distribution<int> u(0, (1 << 24) - 1);
  std::normal_distribution<double> spread(0.0, 3000.0);
  std::vector<BPoint> centres(20);
  for (auto& c : centres) c = BPoint(u(rng), u(rng));
  std::vector<BPoint> pts(n);
  for (int i = 0; i < n; ++i)
    pts[i] = BPoint(centres[i % 20].x() + int(spread(rng)), centres[i % 20].y() + int(spread(rng)));
  return pts;
}

const std::vector<BPoint>& Input(int kind, int n) {
  static std::map<std::pair<int, int>, std::vector<BPoint>> cache;
  auto& v = cache[{kind, n}];
  if (v.empty()) v = kind == 0 ? Uniform(n) : Clustered(n);
  return v;
}

void RunOurs(const std::vector<BPoint>& pts) {
  zt::VD_Initialize();
  zt::VD_Reset();
  for (const auto& p : pts) zt::API_AddPoint(p.x(), p.y(), 0);
  if (!zt::VD_ComputeDiagram(false, 1, true, false, 0, 0, 0.0, 0.0, true)) std::abort();
}

void RunBoost(const std::vector<BPoint>& pts) {
  boost::polygon::voronoi_diagram<double> vd;
  boost::polygon::construct_voronoi(pts.begin(), pts.end(), &vd);
  benchmark::DoNotOptimize(vd.num_vertices());
}

void BM_Ours(benchmark::State& state) {
  const auto& pts = Input(static_cast<int>(state.range(0)), static_cast<int>(state.range(1)));
  zt::bench::timed_case(state, zt::VD_Terminate, [&] { RunOurs(pts); });
  state.counters["restarts"] = zt::VD_GetRestartCount();
}

void BM_Boost(benchmark::State& state) {
  const auto& pts = Input(static_cast<int>(state.range(0)), static_cast<int>(state.range(1)));
  zt::bench::timed_case(state, zt::VD_Terminate, [&] { RunBoost(pts); });
}

void BM_OursOverBoost(benchmark::State& state) {
  const auto& pts = Input(static_cast<int>(state.range(0)), static_cast<int>(state.range(1)));
  zt::bench::paired_case(state, zt::VD_Terminate, [&] { RunOurs(pts); }, [&] { RunBoost(pts); });
}

// Arguments: (0 uniform | 1 clustered, number of points).
#define CASES ->Args({0, 100000})->Args({0, 1000000})->Args({1, 100000})->Unit(benchmark::kMillisecond)
BENCHMARK(BM_Ours) CASES;
BENCHMARK(BM_Boost) CASES;
BENCHMARK(BM_OursOverBoost) CASES->MinTime(8);

}  // namespace

BENCHMARK_MAIN();
