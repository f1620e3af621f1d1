// rg_boolean beside Clipper on the same inputs, in the same run:
//   Wavy   two wavy 50,000-vertex circles that cross at a few points;
//   Noisy  two noisy, nearly coincident 50,000-vertex circles that cross at
//          tens of thousands of points;
//   Comb   a square whose one edge is crossed 20,000 times by a comb.
// Intersection and union of each. Clipper gets the same points scaled by
// 2^30 to integers; that conversion is done once, outside the timing.
#include <benchmark/benchmark.h>

#include <polyclipping/clipper.hpp>

#include <cmath>
#include <random>
#include <vector>

#include "regions/boolean.hpp"

namespace {

constexpr int kVertices = 50000;
constexpr double kClipperScale = 1073741824.0;

struct Pair {
  std::vector<zt::TaggedPoint> a, b;
};

std::vector<zt::TaggedPoint> circle(double cx, double cy, double (*radius)(int, double, std::mt19937_64&),
                                    std::uint64_t seed) {
  std::mt19937_64 rng(seed);
  std::vector<zt::TaggedPoint> c;
  for (int k = 0; k < kVertices; ++k) {
    const double t = 2 * M_PI * k / kVertices;
    const double r = radius(k, t, rng);
    c.emplace_back(1, cx + r * std::cos(t), cy + r * std::sin(t));
  }
  return c;
}

const Pair& wavy() {
  static const Pair p{
      circle(0, 0, [](int, double t, std::mt19937_64&) { return 1 + 0.01 * std::sin(50 * t); }, 1),
      circle(0.3, 0.1, [](int, double t, std::mt19937_64&) { return 1 + 0.01 * std::sin(37 * t); }, 2)};
  return p;
}

const Pair& noisy() {
  static const Pair p{
      circle(0, 0, [](int, double, std::mt19937_64& g) { return 1 + 1e-4 * std::normal_distribution<>()(g); }, 3),
      circle(1e-5, 0, [](int, double, std::mt19937_64& g) { return 1 + 1e-4 * std::normal_distribution<>()(g); },
             4)};
  return p;
}

const Pair& comb() {
  static const Pair p = [] {
    Pair c;
    c.a = {{1, 0, 500}, {1, 1000, 500}, {1, 1000, 1000}, {1, 0, 1000}};
    c.b = {{2, 0.5, 300}, {2, 999.5, 300}};
    for (int k = 19999; k >= 0; --k) c.b.emplace_back(2, 0.5 + 999.0 * k / 20000, k % 2 ? 600.0 : 400.0);
    return c;
  }();
  return p;
}

void to_list(const std::vector<zt::TaggedPoint>& c, zt::TaggedPointList& l) {
  for (const zt::TaggedPoint& p : c) l.AddDoubling(p);
  l.AddDoubling(c.front());
  l.AddDoubling(zt::TaggedPoint::separator());
}

ClipperLib::Paths to_paths(const std::vector<zt::TaggedPoint>& c) {
  ClipperLib::Path p;
  for (const zt::TaggedPoint& q : c)
    p.emplace_back(std::llround(q.x * kClipperScale), std::llround(q.y * kClipperScale));
  return {p};
}

void run_ours(benchmark::State& state, const Pair& in, const char* op) {
  zt::TaggedPointList a, b, r;
  to_list(in.a, a);
  to_list(in.b, b);
  for (auto _ : state) {
    if (zt::rg_boolean(a, b, op, &r) != 0) state.SkipWithError("rg_boolean failed");
    benchmark::DoNotOptimize(r.data());
  }
  state.counters["points_out"] = r.count();
}

void run_clipper(benchmark::State& state, const Pair& in, ClipperLib::ClipType ct) {
  const ClipperLib::Paths a = to_paths(in.a), b = to_paths(in.b);
  ClipperLib::Paths sol;
  for (auto _ : state) {
    ClipperLib::Clipper c;
    c.AddPaths(a, ClipperLib::ptSubject, true);
    c.AddPaths(b, ClipperLib::ptClip, true);
    c.Execute(ct, sol, ClipperLib::pftNonZero, ClipperLib::pftNonZero);
    benchmark::DoNotOptimize(sol.data());
  }
  std::size_t n = 0;
  for (const auto& p : sol) n += p.size();
  state.counters["points_out"] = static_cast<double>(n);
}

void BM_Wavy_Intersection_Ours(benchmark::State& s) { run_ours(s, wavy(), "i"); }
void BM_Wavy_Intersection_Clipper(benchmark::State& s) { run_clipper(s, wavy(), ClipperLib::ctIntersection); }
void BM_Wavy_Union_Ours(benchmark::State& s) { run_ours(s, wavy(), "u"); }
void BM_Wavy_Union_Clipper(benchmark::State& s) { run_clipper(s, wavy(), ClipperLib::ctUnion); }
void BM_Noisy_Intersection_Ours(benchmark::State& s) { run_ours(s, noisy(), "i"); }
void BM_Noisy_Intersection_Clipper(benchmark::State& s) { run_clipper(s, noisy(), ClipperLib::ctIntersection); }
void BM_Noisy_Union_Ours(benchmark::State& s) { run_ours(s, noisy(), "u"); }
void BM_Noisy_Union_Clipper(benchmark::State& s) { run_clipper(s, noisy(), ClipperLib::ctUnion); }

void BM_Comb_Intersection_Ours(benchmark::State& s) { run_ours(s, comb(), "i"); }
void BM_Comb_Intersection_Clipper(benchmark::State& s) { run_clipper(s, comb(), ClipperLib::ctIntersection); }

BENCHMARK(BM_Wavy_Intersection_Ours)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_Wavy_Intersection_Clipper)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_Wavy_Union_Ours)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_Wavy_Union_Clipper)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_Noisy_Intersection_Ours)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_Noisy_Intersection_Clipper)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_Noisy_Union_Ours)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_Noisy_Union_Clipper)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_Comb_Intersection_Ours)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_Comb_Intersection_Clipper)->Unit(benchmark::kMillisecond);

}  // namespace

BENCHMARK_MAIN();
