// The diagram of points beside Boost.Polygon's Voronoi diagram on the same
// integer input in the same run: 1e5 and 1e6 uniform points, 1e5 clustered
// points; and half-clustered points (half of them in a box 1e-3 of the
// whole side) beside our own time on as many uniform points. Each case also reports the peak memory of one construction
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

// Every other point uniform, the rest uniform in a box of side 1e-3 of the
// whole, placed at random.
std::vector<BPoint> HalfClustered(int n) {
  std::mt19937 rng(3);
  constexpr int kSide = 1 << 24, kSmall = kSide / 1000;
  std::uniform_int_distribution<int> u(0, kSide - 1), v(0, kSmall - 1);
  const int x0 = u(rng) % (kSide - kSmall), y0 = u(rng) % (kSide - kSmall);
  std::vector<BPoint> pts(n);
  for (int i = 0; i < n; ++i)
    pts[i] = i % 2 == 0 ? BPoint(u(rng), u(rng)) : BPoint(x0 + v(rng), y0 + v(rng));
  return pts;
}

const std::vector<BPoint>& Input(int kind, int n) {
  static std::map<std::pair<int, int>, std::vector<BPoint>> cache;
  auto& v = cache[{kind, n}];
  if (v.empty()) v = kind == 0 ? Uniform(n) : kind == 1 ? Clustered(n) : HalfClustered(n);
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
  state.counters["ours_MB"] = zt::bench::peak_mb(zt::VD_Terminate, [&] { RunOurs(pts); });
  state.counters["peer_MB"] = zt::bench::peak_mb(zt::VD_Terminate, [&] { RunBoost(pts); });
  zt::bench::paired_case(state, zt::VD_Terminate, [&] { RunOurs(pts); }, [&] { RunBoost(pts); });
}

// Ours on half-clustered points paired with ours on as many uniform points
// (ratio: half-clustered over uniform).
void BM_HalfOverUniform(benchmark::State& state) {
  const auto n = static_cast<int>(state.range(0));
  const auto& half = Input(2, n);
  const auto& uniform = Input(0, n);
  state.counters["ours_MB"] = zt::bench::peak_mb(zt::VD_Terminate, [&] { RunOurs(half); });
  state.counters["peer_MB"] = zt::bench::peak_mb(zt::VD_Terminate, [&] { RunOurs(uniform); });
  zt::bench::paired_case(
      state, zt::VD_Terminate, [&] { RunOurs(half); },
      [&] {
        zt::VD_Terminate();
        RunOurs(uniform);
        zt::VD_Terminate();
      });
}

// Arguments: (0 uniform | 1 clustered | 2 half-clustered, number of points).
#define CASES \
  ->Args({0, 100000})->Args({0, 1000000})->Args({1, 100000})->Args({2, 200000})->Unit(benchmark::kMillisecond)
BENCHMARK(BM_Ours) CASES->Args({0, 200000});
BENCHMARK(BM_Boost) CASES;
BENCHMARK(BM_OursOverBoost) CASES->MinTime(8);
BENCHMARK(BM_HalfOverUniform)->Arg(200000)->Unit(benchmark::kMillisecond)->MinTime(8);

}  // namespace

BENCHMARK_MAIN();
