// Random cases against Clipper: polygons with holes in general position, and
// degenerate ones on a 16 x 16 integer grid (shared edges in both directions,
// touching vertices, collinear overlaps). For each case and operation: the
// area agrees with Clipper's within 1e-9 relative, area(A u B) + area(A n B)
// = area(A) + area(B), the result's orientation is right (union and
// intersection wind +1 over their region and 0 elsewhere), and a rerun gives
// identical output. A difference's contour runs along the subtrahend's
// pieces or the minuend's, whichever its chain starts from, so its
// orientation is not fixed: its area is taken by the even-odd rule.
//
// ZT_ORACLE_CASES sets the number of cases of each family (default 5000, or
// 600 in sanitizer builds, which run about 20 times slower).
#include <gtest/gtest.h>

#include <polyclipping/clipper.hpp>

#include <algorithm>
#include <cmath>
#include <cstdlib>
#include <random>
#include <sstream>
#include <string>

#include "region_test_support.hpp"
#include "support/clipper_paths.hpp"
#include "support/segment_distance.hpp"

namespace zt::test {
namespace {

#if defined(__SANITIZE_ADDRESS__)
constexpr int kDefaultCases = 2000;
#else
constexpr int kDefaultCases = 5000;
#endif
// Clipper works on integers: coordinates are scaled by 2^40, exactly for
// the generated inputs (multiples of 2^-20 below 1024).
constexpr double kExactScale = 1099511627776.0;
constexpr double kAreaRelTolerance = 1e-9;

int case_count() {
  if (const char* s = std::getenv("ZT_ORACLE_CASES")) return std::atoi(s);
  return kDefaultCases;
}

using Region = std::vector<Contour>;

ClipperLib::Paths to_paths(const TaggedPointList& list) {
  ClipperLib::Paths out;
  for (const auto& c : contours_of(list)) {
    ClipperLib::Path p;
    for (const TaggedPoint& q : c)
      p.emplace_back(static_cast<ClipperLib::cInt>(std::llround(q.x * kExactScale)),
                     static_cast<ClipperLib::cInt>(std::llround(q.y * kExactScale)));
    out.push_back(p);
  }
  return out;
}

double paths_area(const ClipperLib::Paths& ps) {
  double a = 0;
  for (const auto& p : ps) a += ClipperLib::Area(p);
  return a / (kExactScale * kExactScale);
}

// Area of the part of the plane where the result's contours wind positively
// (or negatively).
double winding_area(const TaggedPointList& r, ClipperLib::PolyFillType fill) {
  ClipperLib::Clipper c;
  c.AddPaths(to_paths(r), ClipperLib::ptSubject, true);
  ClipperLib::Paths sol;
  c.Execute(ClipperLib::ctUnion, sol, fill, fill);
  return paths_area(sol);
}

// The case as C++ initialisers, ready to become a named regression test.
std::string dump(const Region& r) {
  std::ostringstream s;
  s.precision(17);
  for (const Contour& c : r) {
    for (const Pt& p : c) s << "{" << p.x << ", " << p.y << "}, ";
    s << "\n";
  }
  return s.str();
}

// All checks on one case; stops at the first failure.
void check_case(const Region& ra, const Region& rb, const std::string& label) {
  SCOPED_TRACE(label + "\nA:\n" + dump(ra) + "B:\n" + dump(rb));
  TaggedPointList a, b;
  fill_list(a, ra);
  fill_list(b, rb);
  const double areaA = total_area(a), areaB = total_area(b);
  const double tol = kAreaRelTolerance * (std::fabs(areaA) + std::fabs(areaB));
  double got[3] = {0, 0, 0};
  const char* ops[3] = {"u", "i", "d"};
  const ClipperLib::ClipType cts[3] = {ClipperLib::ctUnion, ClipperLib::ctIntersection,
                                       ClipperLib::ctDifference};
  for (int k = 0; k < 3; ++k) {
    SCOPED_TRACE(ops[k]);
    TaggedPointList r, again;
    ASSERT_EQ(rg_boolean(a, b, ops[k], &r), 0);
    const double expected = paths_area(clip(to_paths(a), to_paths(b), cts[k]));
    if (k == 2) {
      got[k] = winding_area(r, ClipperLib::pftEvenOdd);
      ASSERT_NEAR(got[k], expected, tol);
    } else {
      got[k] = total_area(r);
      ASSERT_NEAR(got[k], expected, tol);
      // Orientation: the region is covered once, counter-clockwise outside.
      ASSERT_NEAR(winding_area(r, ClipperLib::pftPositive), expected, tol);
      ASSERT_NEAR(winding_area(r, ClipperLib::pftNegative), 0.0, tol);
    }
    ASSERT_EQ(rg_boolean(a, b, ops[k], &again), 0);
    ASSERT_TRUE(same_list(r, again));
  }
  ASSERT_NEAR(got[0] + got[1], areaA + areaB, tol);
}

// ---- general position: star-shaped contours with random radii, holes inside

double snap20(double v) { return std::round(v * 1048576.0) / 1048576.0; }

Contour star(std::mt19937_64& rng, double cx, double cy, double rmin, double rmax, int n, bool ccw) {
  std::uniform_real_distribution<double> rad(rmin, rmax), jitter(-0.2, 0.2);
  Contour c;
  for (int i = 0; i < n; ++i) {
    const double t = 2 * M_PI * (i + 0.5 + jitter(rng)) / n;
    const double r = rad(rng);
    c.push_back({snap20(cx + r * std::cos(t)), snap20(cy + r * std::sin(t))});
  }
  if (!ccw) std::reverse(c.begin(), c.end());
  return c;
}

// Star-shaped contours (at most 0.7 pi between neighbours seen from the
// centre, so the centre lies inside) with optional holes strictly inside.
Region random_general(std::mt19937_64& rng) {
  std::uniform_real_distribution<double> u(0, 1);
  std::uniform_int_distribution<int> nv(4, 24);
  Region r;
  const int parts = u(rng) < 0.3 ? 2 : 1;
  for (int p = 0; p < parts; ++p) {
    // Two parts live in separate halves so they never overlap.
    const double cx = parts == 2 ? (p == 0 ? 25 : 75) + 10 * u(rng) : 40 + 20 * u(rng);
    const double cy = 40 + 20 * u(rng);
    const double rmax = parts == 2 ? 18 : 10 + 30 * u(rng);
    const double rmin = rmax * (0.4 + 0.4 * u(rng));
    r.push_back(star(rng, cx, cy, rmin, rmax, nv(rng), true));
    const double room = ring_distance(Pt{cx, cy}, r.back());
    if (u(rng) < 0.4) r.push_back(star(rng, cx, cy, room * 0.2, room * 0.8, nv(rng), false));
  }
  return r;
}

// ---- degenerate: rectangles and star polygons with vertices on a 16 x 16 grid

Region random_grid(std::mt19937_64& rng) {
  std::uniform_int_distribution<int> g(0, 15);
  std::uniform_real_distribution<double> u(0, 1);
  Region r;
  if (u(rng) < 0.5) {
    int x0 = g(rng), x1 = g(rng), y0 = g(rng), y1 = g(rng);
    while (x0 == x1) x1 = g(rng);
    while (y0 == y1) y1 = g(rng);
    if (x0 > x1) std::swap(x0, x1);
    if (y0 > y1) std::swap(y0, y1);
    r.push_back(rect(x0, y0, x1, y1));
    if (x1 - x0 >= 3 && y1 - y0 >= 3 && u(rng) < 0.3)
      r.push_back(rect(x0 + 1, y0 + 1, x1 - 1, y1 - 1, 0, false));
    return r;
  }
  // A star around an off-lattice centre: lattice points sorted by angle.
  const double cx = 7.5 + 0.0123 * u(rng), cy = 7.5 + 0.0321 * u(rng);
  for (;;) {
    std::uniform_int_distribution<int> nv(3, 10);
    std::vector<std::pair<double, Pt>> pts;
    const int n = nv(rng);
    for (int i = 0; i < n; ++i) {
      const Pt p{double(g(rng)), double(g(rng))};
      pts.push_back({std::atan2(p.y - cy, p.x - cx), p});
    }
    std::sort(pts.begin(), pts.end(), [](auto& a, auto& b) { return a.first < b.first; });
    bool ok = true;
    for (std::size_t i = 0; i < pts.size(); ++i) {
      const double gap = (i + 1 < pts.size() ? pts[i + 1].first : pts[0].first + 2 * M_PI) - pts[i].first;
      if (gap >= M_PI * 0.999 || gap <= 1e-9) ok = false;
      const Pt& p = pts[i].second;
      const Pt& q = pts[(i + 1) % pts.size()].second;
      if (p.x == q.x && p.y == q.y) ok = false;
    }
    if (!ok) continue;
    Contour c;
    for (auto& e : pts) c.push_back(e.second);
    r.push_back(c);
    return r;
  }
}

// case_count() cases of a family, each drawn as (A, B) by `make`; stops at
// the first failing case.
template <class Make>
void run_family(std::uint64_t seed, const std::string& family, Make make) {
  std::mt19937_64 rng(seed);
  for (int i = 0, n = case_count(); i < n && !::testing::Test::HasFatalFailure(); ++i) {
    const std::pair<Region, Region> ab = make(rng);
    check_case(ab.first, ab.second, family + " case " + std::to_string(i));
  }
}

TEST(ClipperOracle, GeneralPositionWithHoles) {
  run_family(20261206, "general", [](std::mt19937_64& rng) {
    Region a = random_general(rng);
    return std::pair{a, random_general(rng)};
  });
}

TEST(ClipperOracle, DegenerateOnIntegerGrid) {
  run_family(16161616, "grid", [](std::mt19937_64& rng) {
    Region a = random_grid(rng);
    return std::pair{a, random_grid(rng)};
  });
}

// Sixteen wedges of A meet at the origin, a corner of B: a star of more than
// twenty entries, sorted by the quicksort rather than the selection pass.
TEST(ClipperOracle, ManyContoursMeetingAtOneVertex) {
  Region a, b;
  for (int k = 0; k < 16; ++k) {
    const double t0 = 2 * M_PI * k / 16, t1 = t0 + 2 * M_PI / 40;
    a.push_back({{0, 0}, {snap20(10 * std::cos(t0)), snap20(10 * std::sin(t0))},
                 {snap20(10 * std::cos(t1)), snap20(10 * std::sin(t1))}});
  }
  b.push_back(rect(0, 0, 5, 5));
  check_case(a, b, "wedges");
  b = {rect(-3, -3, 0, 0), rect(1, -4, 4, 4)};
  check_case(a, b, "wedges and two squares");
}

// One long edge crossed 3,000 times by a comb: every crossing lands on the
// same split list.
TEST(ClipperOracle, CombAcrossOneLongEdge) {
  Region comb(1);
  for (int k = 0; k < 3000; ++k) comb[0].push_back({snap20(0.5 + 999.0 * k / 3000), k % 2 ? 600.0 : 400.0});
  comb[0].push_back({999.5, 300});
  comb[0].push_back({0.5, 300});
  std::reverse(comb[0].begin(), comb[0].end());  // counter-clockwise
  check_case({rect(0, 500, 1000, 1000)}, comb, "comb");
}

// B is A moved by a small lattice step (or not at all): long collinear
// overlaps, shared edges and vertices in the same direction.
TEST(ClipperOracle, ShiftedCopiesOnIntegerGrid) {
  run_family(31415926, "shifted", [](std::mt19937_64& rng) {
    std::uniform_int_distribution<int> step(-2, 2);
    Region a = random_grid(rng), b = a;
    const int dx = step(rng), dy = step(rng);
    for (Contour& c : b)
      for (Pt& p : c) p.x += dx, p.y += dy;
    return std::pair{a, b};
  });
}

}  // namespace
}  // namespace zt::test
