// Simplification speed on 1e6 points of a noisy circle, tolerance 0.005: the
// list form the zone builder uses after each level's offsets, and the plain
// array form used before feeding contours to the Voronoi engine. Reports
// points per second.
#include <benchmark/benchmark.h>

#include <cmath>
#include <random>
#include <vector>

#include "zone/simplify.hpp"

namespace {

constexpr int kPoints = 1000000;
constexpr double kTolerance = 0.005;
constexpr double kRadius = 100.0;
constexpr double kNoise = 0.002;  // below the tolerance: most points go

std::vector<zt::Point2d> noisy_circle() {
  std::mt19937_64 rng(7);
  std::uniform_real_distribution<double> noise(-kNoise, kNoise);
  std::vector<zt::Point2d> p(kPoints);
  for (int i = 0; i < kPoints; ++i) {
    const double a = 2 * M_PI * i / kPoints;
    const double r = kRadius + noise(rng);
    p[i] = {r * std::cos(a), r * std::sin(a)};
  }
  p.back() = p.front();
  return p;
}

void BM_SimplifyPolylines(benchmark::State& state) {
  const std::vector<zt::Point2d> circle = noisy_circle();
  zt::TaggedPointList in(kPoints + 1, 1000), out(kPoints + 1, 1000);
  in.Add(zt::TaggedPoint::separator());
  for (const zt::Point2d& q : circle) in.Add({1, q.x, q.y});
  for (auto _ : state) {
    zt::simplify_polylines(in, out, kTolerance);
    benchmark::DoNotOptimize(out.data());
  }
  state.counters["kept"] = out.count();
  state.counters["points/s"] =
      benchmark::Counter(double(kPoints) * state.iterations(), benchmark::Counter::kIsRate);
}
BENCHMARK(BM_SimplifyPolylines)->Unit(benchmark::kMillisecond);

void BM_PolylineSimplifier(benchmark::State& state) {
  const std::vector<zt::Point2d> circle = noisy_circle();
  zt::PolylineSimplifier simplifier;
  zt::Array<zt::Point2d>& result = *simplifier.resultList(kPoints);
  for (auto _ : state) {
    simplifier.simplify(circle.data(), kPoints, kTolerance, result, true);
    benchmark::DoNotOptimize(result.data());
  }
  state.counters["kept"] = result.count();
  state.counters["points/s"] =
      benchmark::Counter(double(kPoints) * state.iterations(), benchmark::Counter::kIsRate);
}
BENCHMARK(BM_PolylineSimplifier)->Unit(benchmark::kMillisecond);

}  // namespace

BENCHMARK_MAIN();
