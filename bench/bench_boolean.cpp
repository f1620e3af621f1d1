// rg_boolean beside Clipper on the same inputs, in the same run. Families:
//   Wavy       two wavy 50,000-vertex circles that cross at a few points;
//   Noisy      two noisy, nearly coincident 50,000-vertex circles that cross
//              at tens of thousands of points;
//   Comb       a square whose one edge is crossed 20,000 times by a comb;
//   Far<d>     a wavy 50,000-vertex circle against a copy of itself plus a
//              unit square d away towards -x (d = 1e2, 1e3, 1e5): the joint
//              box is ruled by a piece that holds almost nothing;
//   Scattered  2,000 small 20-vertex pieces scattered over a 1e4 box, against
//              the same pieces shifted so that each crosses its twin.
// Intersection (and union for the first two). BM_Ours and BM_Clipper report
// the peak memory of one operation (peak_MB, in a child process, our engine
// created afresh on its own thread); BM_OursOverClipper runs the two in turn
// and reports the ratio of times (ratio_median is the figure to quote) with
// both peaks beside it (ours_peak_MB, peer_peak_MB).
// Clipper gets the same points scaled by 2^30 to integers (at most 2^47 in
// magnitude, within its range); that conversion is done once, outside the
// timing.
#include <benchmark/benchmark.h>

#include <polyclipping/clipper.hpp>

#include <cmath>
#include <random>
#include <thread>
#include <vector>

#include "bench/common.hpp"
#include "regions/boolean.hpp"

namespace {

constexpr int kVertices = 50000;
constexpr double kClipperScale = 1073741824.0;

struct Pair {
  std::vector<std::vector<zt::TaggedPoint>> a, b;
};

std::vector<zt::TaggedPoint> circle(double cx, double cy, double (*radius)(int, double, std::mt19937_64&),
                                    std::uint64_t seed, int n = kVertices) {
  std::mt19937_64 rng(seed);
  std::vector<zt::TaggedPoint> c;
  for (int k = 0; k < n; ++k) {
    const double t = 2 * M_PI * k / n;
    const double r = radius(k, t, rng);
    c.emplace_back(1, cx + r * std::cos(t), cy + r * std::sin(t));
  }
  return c;
}

double wave50(int, double t, std::mt19937_64&) { return 1 + 0.01 * std::sin(50 * t); }
double wave37(int, double t, std::mt19937_64&) { return 1 + 0.01 * std::sin(37 * t); }
double noise(int, double, std::mt19937_64& g) { return 1 + 1e-4 * std::normal_distribution<>()(g); }

Pair make_wavy() { return {{circle(0, 0, wave50, 1)}, {circle(0.3, 0.1, wave37, 2)}}; }

Pair make_noisy() { return {{circle(0, 0, noise, 3)}, {circle(1e-5, 0, noise, 4)}}; }

Pair make_comb() {
  Pair c;
  c.a = {{{1, 0, 500}, {1, 1000, 500}, {1, 1000, 1000}, {1, 0, 1000}}};
  std::vector<zt::TaggedPoint> b = {{2, 0.5, 300}, {2, 999.5, 300}};
  for (int k = 19999; k >= 0; --k) b.emplace_back(2, 0.5 + 999.0 * k / 20000, k % 2 ? 600.0 : 400.0);
  c.b = {b};
  return c;
}

Pair make_far(double distance) {
  Pair p;
  p.a = {circle(0, 0, wave50, 1)};
  p.b = {p.a[0], {{2, -distance - 1, 0}, {2, -distance, 0}, {2, -distance, 1}, {2, -distance - 1, 1}}};
  return p;
}

Pair make_scattered() {
  Pair p;
  std::mt19937_64 rng(11);
  std::uniform_real_distribution<double> u(0, 1e4);
  for (int k = 0; k < 2000; ++k) {
    const double cx = u(rng), cy = u(rng);
    p.a.push_back(circle(cx, cy, [](int, double, std::mt19937_64&) { return 1.0; }, 0, 20));
    p.b.push_back(circle(cx + 0.3, cy + 0.2, [](int, double, std::mt19937_64&) { return 1.0; }, 0, 20));
  }
  return p;
}

// Family numbers, the benchmark's argument.
enum Family { kWavy, kNoisy, kComb, kFar1e2, kFar1e3, kFar1e5, kScattered, kFamilies };

const Pair& input(int family) {
  static std::vector<Pair> cache(kFamilies);
  Pair& p = cache[family];
  if (p.a.empty()) {
    switch (family) {
      case kWavy: p = make_wavy(); break;
      case kNoisy: p = make_noisy(); break;
      case kComb: p = make_comb(); break;
      case kFar1e2: p = make_far(1e2); break;
      case kFar1e3: p = make_far(1e3); break;
      case kFar1e5: p = make_far(1e5); break;
      default: p = make_scattered(); break;
    }
  }
  return p;
}

void to_list(const std::vector<std::vector<zt::TaggedPoint>>& cs, zt::TaggedPointList& l) {
  for (const auto& c : cs) {
    for (const zt::TaggedPoint& p : c) l.AddDoubling(p);
    l.AddDoubling(c.front());
    l.AddDoubling(zt::TaggedPoint::separator());
  }
}

ClipperLib::Paths to_paths(const std::vector<std::vector<zt::TaggedPoint>>& cs, double scale) {
  ClipperLib::Paths paths;
  for (const auto& c : cs) {
    ClipperLib::Path p;
    for (const zt::TaggedPoint& q : c) p.emplace_back(std::llround(q.x * scale), std::llround(q.y * scale));
    paths.push_back(p);
  }
  return paths;
}

struct Case {
  zt::TaggedPointList a, b, r;
  ClipperLib::Paths pa, pb, sol;
  const char* op;
  ClipperLib::ClipType ct;

  Case(const benchmark::State& state)
      : op(state.range(1) == 0 ? "i" : "u"),
        ct(state.range(1) == 0 ? ClipperLib::ctIntersection : ClipperLib::ctUnion) {
    const Pair& in = input(static_cast<int>(state.range(0)));
    to_list(in.a, a);
    to_list(in.b, b);
    pa = to_paths(in.a, kClipperScale);
    pb = to_paths(in.b, kClipperScale);
  }
  void ours() {
    if (zt::rg_boolean(a, b, op, &r) != 0) std::abort();
    benchmark::DoNotOptimize(r.data());
  }
  void clipper() {
    ClipperLib::Clipper c;
    c.AddPaths(pa, ClipperLib::ptSubject, true);
    c.AddPaths(pb, ClipperLib::ptClip, true);
    c.Execute(ct, sol, ClipperLib::pftNonZero, ClipperLib::pftNonZero);
    benchmark::DoNotOptimize(sol.data());
  }
};

void BM_Clipper(benchmark::State& state) {
  Case c(state);
  zt::bench::timed_case(state, [] {}, [&] { c.clipper(); });
  std::size_t n = 0;
  for (const auto& p : c.sol) n += p.size();
  state.counters["points_out"] = static_cast<double>(n);
}

// Our engine's peak on a fresh thread (a fresh engine counts its storage).
double ours_peak_mb(Case& c) {
  return zt::bench::peak_mb([] {}, [&] { std::thread([&] { c.ours(); }).join(); });
}

void BM_Ours(benchmark::State& state) {
  Case c(state);
  state.counters["peak_MB"] = ours_peak_mb(c);
  for (auto _ : state) c.ours();
  state.counters["points_out"] = c.r.count();
}

void BM_OursOverClipper(benchmark::State& state) {
  Case c(state);
  // The peaks beside the times, so that each row of the paired run says both.
  state.counters["ours_peak_MB"] = ours_peak_mb(c);
  state.counters["peer_peak_MB"] = zt::bench::peak_mb([] {}, [&] { c.clipper(); });
  zt::bench::paired_case(state, [] {}, [&] { c.ours(); }, [&] { c.clipper(); });
}

// Arguments: (family, 0 intersection | 1 union).
#define CASES                                                                                            \
  ->Args({kWavy, 0})->Args({kWavy, 1})->Args({kNoisy, 0})->Args({kNoisy, 1})->Args({kComb, 0})        \
      ->Args({kFar1e2, 0})->Args({kFar1e3, 0})->Args({kFar1e5, 0})->Args({kScattered, 0})              \
      ->Unit(benchmark::kMillisecond)
BENCHMARK(BM_Ours) CASES;
BENCHMARK(BM_Clipper) CASES;
BENCHMARK(BM_OursOverClipper) CASES->MinTime(2);

}  // namespace

BENCHMARK_MAIN();
