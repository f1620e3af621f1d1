// rg_boolean against Clipper on random operand pairs, one generator family a
// row. The oracle rows (ClipperOracleFamilies: general position with holes,
// degenerate cases on a 16 x 16 integer grid, shifted copies) run every check
// of check_case: the area agrees with Clipper's within 1e-9 relative,
// area(A u B) + area(A n B) = area(A) + area(B), union and intersection wind
// +1 over their region and 0 elsewhere, and a rerun gives identical output. A
// difference's contour runs along the subtrahend's pieces or the minuend's,
// whichever its chain starts from, so its area is taken by the even-odd rule.
// ZT_ORACLE_CASES sets their case count (default 5000, 2000 in sanitizer
// builds, which run about 20 times slower).
#include <gtest/gtest.h>

#include <polyclipping/clipper.hpp>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <functional>
#include <random>
#include <sstream>
#include <string>

#include "region_test_support.hpp"
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

int env_count(const char* name, int fallback) {
  const char* s = std::getenv(name);
  return s ? std::atoi(s) : fallback;
}

using Region = std::vector<Contour>;
namespace cl = ClipperLib;
const char* const kOps[3] = {"u", "i", "d"};
const cl::ClipType kClipTypes[3] = {cl::ctUnion, cl::ctIntersection, cl::ctDifference};

cl::Paths scaled_paths(const TaggedPointList& list, double scale) {
  cl::Paths out;
  for (const auto& c : contours_of(list)) {
    out.emplace_back();
    for (const TaggedPoint& q : c)
      out.back().emplace_back(static_cast<cl::cInt>(std::llround(q.x * scale)),
                              static_cast<cl::cInt>(std::llround(q.y * scale)));
  }
  return out;
}

// The area of the part of the plane where an operation (a union with no
// clip operand) fills by the rule `fill`.
double fill_area(const cl::Paths& a, const cl::Paths* b, cl::ClipType ct, double scale,
                 cl::PolyFillType fill = cl::pftEvenOdd) {
  cl::Clipper c;
  c.AddPaths(a, cl::ptSubject, true);
  if (b) c.AddPaths(*b, cl::ptClip, true);
  cl::Paths sol;
  c.Execute(ct, sol, fill, fill);
  double area = 0;
  for (const auto& p : sol) area += cl::Area(p);
  return area / (scale * scale);
}

// The case as C++ initialisers, ready to become a named regression test.
std::string dump(const Region& ra, const Region& rb) {
  std::ostringstream s;
  s.precision(17);
  for (const Region* r : {&ra, &rb}) {
    s << (r == &ra ? "\nA:\n" : "B:\n");
    for (const Contour& c : *r) {
      for (const Pt& p : c) s << "{" << p.x << ", " << p.y << "}, ";
      s << "\n";
    }
  }
  return s.str();
}

// All checks on one case; stops at the first failure.
void check_case(const Region& ra, const Region& rb, const std::string& label) {
  SCOPED_TRACE(label + dump(ra, rb));
  TaggedPointList a, b;
  fill_list(a, ra);
  fill_list(b, rb);
  const double areaA = total_area(a), areaB = total_area(b);
  const double tol = kAreaRelTolerance * (std::fabs(areaA) + std::fabs(areaB));
  const cl::Paths pa = scaled_paths(a, kExactScale), pb = scaled_paths(b, kExactScale);
  const auto winding_area = [](const TaggedPointList& r, cl::PolyFillType fill) {
    return fill_area(scaled_paths(r, kExactScale), nullptr, cl::ctUnion, kExactScale, fill);
  };
  double got[3] = {0, 0, 0};
  for (int k = 0; k < 3; ++k) {
    SCOPED_TRACE(kOps[k]);
    TaggedPointList r, again;
    ASSERT_EQ(rg_boolean(a, b, kOps[k], &r), 0);
    const double expected = fill_area(pa, &pb, kClipTypes[k], kExactScale, cl::pftNonZero);
    got[k] = k == 2 ? winding_area(r, cl::pftEvenOdd) : total_area(r);
    ASSERT_NEAR(got[k], expected, tol);
    if (k < 2) {  // orientation: the region is covered once, counter-clockwise outside
      ASSERT_NEAR(winding_area(r, cl::pftPositive), expected, tol);
      ASSERT_NEAR(winding_area(r, cl::pftNegative), 0.0, tol);
    }
    ASSERT_EQ(rg_boolean(a, b, kOps[k], &again), 0);
    ASSERT_TRUE(same_list(r, again));
  }
  ASSERT_NEAR(got[0] + got[1], areaA + areaB, tol);
}

// ---- generators, all drawing from one engine seeded per family

std::mt19937_64& rng() {
  static std::mt19937_64 engine;
  return engine;
}
double uni(double lo, double hi) { return std::uniform_real_distribution<double>(lo, hi)(rng()); }
int pick(int lo, int hi) { return std::uniform_int_distribution<int>(lo, hi)(rng()); }
double snap20(double v) { return std::round(v * 1048576.0) / 1048576.0; }

Contour star(double cx, double cy, double rmin, double rmax, int n, bool ccw) {
  std::uniform_real_distribution<double> rad(rmin, rmax), jitter(-0.2, 0.2);
  Contour c;
  for (int i = 0; i < n; ++i) {
    const double t = 2 * M_PI * (i + 0.5 + jitter(rng())) / n;
    const double r = rad(rng());
    c.push_back({snap20(cx + r * std::cos(t)), snap20(cy + r * std::sin(t))});
  }
  if (!ccw) std::reverse(c.begin(), c.end());
  return c;
}

// General position: star-shaped contours (at most 0.7 pi between neighbours
// seen from the centre, so the centre lies inside) with optional holes
// strictly inside; two parts live in separate halves so they never overlap.
Region random_general() {
  std::uniform_real_distribution<double> u(0, 1);
  std::uniform_int_distribution<int> nv(4, 24);
  Region r;
  const int parts = u(rng()) < 0.3 ? 2 : 1;
  for (int p = 0; p < parts; ++p) {
    const double cx = parts == 2 ? (p == 0 ? 25 : 75) + 10 * u(rng()) : 40 + 20 * u(rng());
    const double cy = 40 + 20 * u(rng());
    const double rmax = parts == 2 ? 18 : 10 + 30 * u(rng());
    const double rmin = rmax * (0.4 + 0.4 * u(rng()));
    r.push_back(star(cx, cy, rmin, rmax, nv(rng()), true));
    const double room = ring_distance(Pt{cx, cy}, r.back());
    if (u(rng()) < 0.4) r.push_back(star(cx, cy, room * 0.2, room * 0.8, nv(rng()), false));
  }
  return r;
}

// Degenerate: rectangles (some with a hole) and star polygons with vertices
// on a 16 x 16 grid, sorted by angle around an off-lattice centre.
Region random_grid() {
  std::uniform_int_distribution<int> g(0, 15);
  std::uniform_real_distribution<double> u(0, 1);
  if (u(rng()) < 0.5) {
    int x0 = g(rng()), x1 = g(rng()), y0 = g(rng()), y1 = g(rng());
    while (x0 == x1) x1 = g(rng());
    while (y0 == y1) y1 = g(rng());
    if (x0 > x1) std::swap(x0, x1);
    if (y0 > y1) std::swap(y0, y1);
    Region r{rect(x0, y0, x1, y1)};
    if (x1 - x0 >= 3 && y1 - y0 >= 3 && u(rng()) < 0.3) r.push_back(rect(x0 + 1, y0 + 1, x1 - 1, y1 - 1, 0, false));
    return r;
  }
  const double cx = 7.5 + 0.0123 * u(rng()), cy = 7.5 + 0.0321 * u(rng());
  for (;;) {
    std::uniform_int_distribution<int> nv(3, 10);
    std::vector<std::pair<double, Pt>> pts;
    for (int i = 0, n = nv(rng()); i < n; ++i) {
      const Pt p{double(g(rng())), double(g(rng()))};
      pts.push_back({std::atan2(p.y - cy, p.x - cx), p});
    }
    std::sort(pts.begin(), pts.end(), [](auto& a, auto& b) { return a.first < b.first; });
    bool ok = true;
    for (std::size_t i = 0; i < pts.size(); ++i) {
      const double gap = (i + 1 < pts.size() ? pts[i + 1].first : pts[0].first + 2 * M_PI) - pts[i].first;
      const Pt &p = pts[i].second, &q = pts[(i + 1) % pts.size()].second;
      ok = ok && gap < M_PI * 0.999 && gap > 1e-9 && !(p.x == q.x && p.y == q.y);
    }
    if (!ok) continue;
    Contour c;
    for (auto& e : pts) c.push_back(e.second);
    return {c};
  }
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
  check_case(a, {rect(0, 0, 5, 5)}, "wedges");
  check_case(a, {rect(-3, -3, 0, 0), rect(1, -4, 4, 4)}, "wedges and two squares");
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

// ---- the degenerate-input campaign (DegenerateCampaign): every family
// against Clipper, both operands and the result read by the even-odd rule,
// compared by area. ZT_CAMPAIGN_CASES sets the cases per family (default
// 150; the full campaign is 10000, see the README). An operation counts as
// wrong when it returns 0 with an area off Clipper's (or, for union and
// intersection, contours whose signed areas do not add up to that area: a
// lobe or a whole contour turned the wrong way), and as refused when it
// returns -1. The test prints both figures per family and fails on any,
// naming the first such case as initialisers ready for a regression test.

// Clipper works on integers: each case is scaled by the power of two that
// brings its largest coordinate near 2^50, exact for the generated inputs.
double case_scale(const TaggedPointList& a, const TaggedPointList& b) {
  double m = 1e-300;
  for (const TaggedPointList* l : {&a, &b})
    for (const TaggedPoint& p : *l)
      if (!is_separator(p)) m = std::max({m, std::fabs(p.x), std::fabs(p.y)});
  return std::ldexp(1.0, 50 - std::ilogb(m));
}

// A contour that passes a point twice split there into separate loops: the
// same boundary modulo 2, which Clipper reads more reliably than one path
// touching itself (it has taken such a path's pinched-off triangle for a hole).
cl::Paths simple_loops(const cl::Paths& in) {
  cl::Paths out;
  for (const cl::Path& p : in) {
    cl::Path stack;
    for (const cl::IntPoint& q : p) {
      auto at = std::find(stack.begin(), stack.end(), q);
      if (at == stack.end()) {
        stack.push_back(q);
        continue;
      }
      if (stack.end() - at >= 3) out.emplace_back(at, stack.end());
      stack.erase(at + 1, stack.end());
    }
    if (stack.size() >= 3) out.push_back(stack);
  }
  return out;
}

struct CampaignCount {
  int wrong = 0, refused = 0;
  std::string first;
};

void campaign_case(const Region& ra, const Region& rb, const std::string& label, CampaignCount& count) {
  TaggedPointList a, b;
  fill_list(a, ra);
  fill_list(b, rb);
  const double scale = case_scale(a, b);
  const cl::Paths pa = scaled_paths(a, scale), pb = scaled_paths(b, scale);
  const double areaA = fill_area(pa, nullptr, cl::ctUnion, scale), areaB = fill_area(pb, nullptr, cl::ctUnion, scale);
  // Relative to the operands' areas, plus what moving every boundary point
  // by the engine's tolerances can change: 2^-47 of the extent plus its
  // margin of 4, or the snapping quantum 2^-48, whichever is larger; and
  // the result's duplicate tolerance (1e-7, less for extents below about 2).
  double perimeter = 0, extent = 0;
  for (const Region* r : {&ra, &rb})
    for (const Contour& c : *r)
      for (std::size_t i = 0; i < c.size(); ++i) {
        const Pt &p = c[i], &q = c[(i + 1) % c.size()];
        perimeter += std::hypot(q.x - p.x, q.y - p.y);
        extent = std::max({extent, std::fabs(p.x), std::fabs(p.y)});
      }
  const double merged = std::min(1e-7, 2 * extent * 0x1p-24);
  const double moved = std::max({0x1p-47 * (2 * extent + 4), 0x1p-48, merged});
  const double tol = kAreaRelTolerance * (areaA + areaB) + 4 * perimeter * moved;
  for (int k = 0; k < 3; ++k) {
    TaggedPointList r;
    const int rc = rg_boolean(a, b, kOps[k], &r);
    const double expected = fill_area(pa, &pb, kClipTypes[k], scale);
    const double got = rc == 0 ? fill_area(simple_loops(scaled_paths(r, scale)), nullptr, cl::ctUnion, scale) : 0;
    // Where Clipper disagrees, the slab computation decides: Clipper has
    // misread inputs with doubled segments. Union and intersection contours
    // run with the result on their left (holes clockwise), so their signed
    // areas add up to the even-odd area; a lobe turned the other way at a
    // self-crossing does not.
    const bool wrong = rc == 0 && ((std::fabs(got - expected) > tol && std::fabs(got - slab_area(ra, rb, kOps[k][0])) > tol) ||
                                   (k < 2 && std::fabs(total_area(r) - got) > tol));
    count.refused += rc != 0;
    count.wrong += wrong;
    if ((rc != 0 || wrong) && count.first.empty()) {
      std::ostringstream s;
      s.precision(17);
      s << label << " op " << kOps[k] << " rc " << rc << " area " << got << " signed " << total_area(r)
        << " expected " << expected << dump(ra, rb);
      count.first = s.str();
    }
  }
}

void move(Region& r, double dx, double dy, double s = 1.0) {
  for (Contour& c : r)
    for (Pt& p : c) p = {p.x * s + dx, p.y * s + dy, p.tag};
}

// A grid operand beside a general one, so that edges of all kinds meet.
Region any_region() { return uni(0, 1) < 0.5 ? random_general() : random_grid(); }

// A spike from a vertex or from a point inside an edge, to a point inside
// or outside the contour: there and back, bounding nothing.
void add_spike(Contour& c) {
  const std::size_t i = static_cast<std::size_t>(pick(0, static_cast<int>(c.size()) - 1));
  const Pt p = c[i], q = c[(i + 1) % c.size()];
  const double f = uni(0, 1) < 0.5 ? 0.0 : snap20(uni(0.1, 0.9));
  const Pt base{snap20(p.x + f * (q.x - p.x)), snap20(p.y + f * (q.y - p.y))};
  const Pt tip{snap20(base.x + uni(-30, 30)), snap20(base.y + uni(-30, 30))};
  std::vector<Pt> in{tip, base};
  if (f != 0.0) in.insert(in.begin(), base);
  c.insert(c.begin() + static_cast<long>(i) + 1, in.begin(), in.end());
}

// A contour crossing itself: vertices in random order.
Contour tangle(double cx, double cy, double r) {
  Contour c;
  for (int k = 0, n = pick(4, 9); k < n; ++k) c.push_back({snap20(cx + uni(-r, r)), snap20(cy + uni(-r, r))});
  return c;
}

using Pair = std::pair<Region, Region>;

Pair family_simple() {
  Region a{star(uni(30, 70), uni(30, 70), 10, uni(12, 40), pick(3, 24), true)};
  return {a, Region{star(uni(30, 70), uni(30, 70), 10, uni(12, 40), pick(3, 24), true)}};
}
Pair family_holes() { return {random_general(), random_general()}; }
Pair family_grid() { return {random_grid(), random_grid()}; }

// B is A moved by a small lattice step (or not at all): long collinear
// overlaps, shared edges and vertices in the same direction.
Pair family_shifted() {
  Region a = random_grid(), b = a;
  const int dx = pick(-2, 2), dy = pick(-2, 2);
  move(b, dx, dy);
  return {a, b};
}

// B is A moved by d in a random direction, or one of A's contours with one
// vertex moved by d, so that edges run within d of each other.
Pair near_copy(double d) {
  Region a = any_region(), b = a;
  const double t = uni(0, 2 * M_PI);
  if (uni(0, 1) < 0.5) {
    move(b, d * std::cos(t), d * std::sin(t));
  } else {
    Pt& p = b[0][static_cast<std::size_t>(pick(0, static_cast<int>(b[0].size()) - 1))];
    p.x += d * std::cos(t), p.y += d * std::sin(t);
  }
  if (uni(0, 1) < 0.3) b.push_back(rect(pick(0, 8), pick(0, 8), pick(9, 16), pick(9, 16)));
  return {a, b};
}
Pair family_near_relative() { return near_copy(100 * std::pow(10.0, uni(-9, -5))); }
// The engine's tolerance is 2^-47 of the extent plus a margin of 4.
Pair family_near_tolerance() { return near_copy(std::pow(10.0, uni(-1, 3)) * 0x1p-47 * 110); }

// Doubled segments: a two-point contour, a bridge from an outer contour to
// its hole (out and back), or two contours of one operand sharing an edge.
Pair family_doubled() {
  Region a = any_region(), b = any_region();
  Region& x = uni(0, 1) < 0.5 ? a : b;
  const int kind = pick(0, 2);
  if (kind == 0) {
    x.push_back({{snap20(uni(0, 100)), snap20(uni(0, 100))}, {snap20(uni(0, 100)), snap20(uni(0, 100))}});
  } else if (kind == 1) {
    const int x0 = pick(0, 6), y0 = pick(0, 6), x1 = pick(11, 16), y1 = pick(11, 16);
    const Contour hole = rect(x0 + 2, y0 + 2, x1 - 2, y1 - 2, 0, false);
    Contour c = rect(x0, y0, x1, y1);
    c.insert(c.begin() + 1, {hole[0], hole[1], hole[2], hole[3], hole[0], c[0]});
    x.push_back(c);
  } else {
    const int x0 = pick(0, 7), y0 = pick(0, 12), y1 = y0 + pick(1, 4), x1 = x0 + pick(1, 4), x2 = x1 + pick(1, 4);
    x.push_back(rect(x0, y0, x1, y1));
    x.push_back(rect(x1, y0, x2, y1));
  }
  return {a, b};
}

Pair family_spikes() {
  Region a = any_region(), b = any_region();
  for (int k = pick(1, 3); k > 0; --k) add_spike((uni(0, 1) < 0.5 ? a : b)[0]);
  return {a, b};
}

// A sliver of width w (relative to the extent): a spike whose way back is
// moved sideways by w, or a thin triangle of its own.
Pair family_slivers() {
  Region a = any_region(), b = any_region();
  Region& x = uni(0, 1) < 0.5 ? a : b;
  const double w = 100 * std::pow(10.0, uni(-16, -8));
  const Pt p{snap20(uni(0, 100)), snap20(uni(0, 100))}, q{snap20(uni(0, 100)), snap20(uni(0, 100))};
  const double len = std::hypot(q.x - p.x, q.y - p.y) + 1e-300;
  if (uni(0, 1) < 0.5) {
    x.push_back({p, q, {p.x - w * (q.y - p.y) / len, p.y + w * (q.x - p.x) / len}});
  } else {
    Contour& c = x[0];
    const std::size_t i = static_cast<std::size_t>(pick(0, static_cast<int>(c.size()) - 1));
    const Pt v = c[i];
    c.insert(c.begin() + static_cast<long>(i) + 1, {q, {v.x - w * (q.y - v.y) / len, v.y + w * (q.x - v.x) / len}, v});
  }
  return {a, b};
}

Pair family_self_crossing() {
  Region a{tangle(uni(30, 70), uni(30, 70), uni(10, 40))}, b = any_region();
  if (uni(0, 1) < 0.5) b = {tangle(uni(30, 70), uni(30, 70), uni(10, 40))};
  if (uni(0, 1) < 0.5) std::swap(a, b);
  return {a, b};
}

// General and grid cases scaled by a power of two to an extent of 1e-9..1e-2,
// or 1e5..1e14 and moved below zero (coordinates at or above 99990 would
// read as separators).
Pair scaled(double lo, double hi, bool huge) {
  auto ab = uni(0, 1) < 0.5 ? family_holes() : family_grid();
  const double s = std::ldexp(1.0, static_cast<int>(std::floor(std::log2(std::pow(10.0, uni(lo, hi)) / 100))));
  const double shift = huge ? -std::ldexp(1.0, std::ilogb(s * 128) + 1) : 0.0;
  move(ab.first, shift, shift, s);
  move(ab.second, shift, shift, s);
  return ab;
}
Pair family_tiny() { return scaled(-9, -2, false); }
Pair family_huge() { return scaled(5, 14, true); }

struct FamilyRow {
  const char* name;
  Pair (*make)();
  std::uint64_t seed = 0;  // 0: the hash of the name
};
std::string family_name(const ::testing::TestParamInfo<FamilyRow>& info) { return info.param.name; }
void seed(const FamilyRow& f) { rng().seed(f.seed ? f.seed : std::hash<std::string>{}(f.name)); }

const FamilyRow kFamilies[] = {
    {"Simple", family_simple},
    {"Holes", family_holes},
    {"GridSharedEdges", family_grid},
    {"NearCoincidentRelative", family_near_relative},
    {"NearCoincidentAtTolerance", family_near_tolerance},
    {"DoubledSegments", family_doubled},
    {"Spikes", family_spikes},
    {"Slivers", family_slivers},
    {"SelfCrossing", family_self_crossing},
    {"TinyExtents", family_tiny},
    {"HugeExtents", family_huge},
};

class DegenerateCampaign : public ::testing::TestWithParam<FamilyRow> {};

TEST_P(DegenerateCampaign, AgreesWithClipperByEvenOddArea) {
  const FamilyRow& f = GetParam();
  seed(f);
  CampaignCount count;
  const int n = env_count("ZT_CAMPAIGN_CASES", 150);
  for (int i = 0; i < n; ++i) {
    const auto ab = f.make();
    campaign_case(ab.first, ab.second, std::string(f.name) + " case " + std::to_string(i), count);
  }
  std::printf("campaign %-26s cases %6d operations %6d wrong %5d refused %5d\n", f.name, n, 3 * n, count.wrong,
              count.refused);
  EXPECT_EQ(count.wrong, 0) << count.first;
  EXPECT_EQ(count.refused, 0) << count.first;
}

INSTANTIATE_TEST_SUITE_P(Families, DegenerateCampaign, ::testing::ValuesIn(kFamilies), family_name);

const FamilyRow kOracleFamilies[] = {{"GeneralPositionWithHoles", family_holes, 20261206},
                                     {"DegenerateOnIntegerGrid", family_grid, 16161616},
                                     {"ShiftedCopiesOnIntegerGrid", family_shifted, 31415926}};

class ClipperOracleFamilies : public ::testing::TestWithParam<FamilyRow> {};

TEST_P(ClipperOracleFamilies, AllChecksAgree) {
  seed(GetParam());
  for (int i = 0, n = env_count("ZT_ORACLE_CASES", kDefaultCases); i < n && !HasFatalFailure(); ++i) {
    const auto ab = GetParam().make();
    check_case(ab.first, ab.second, std::string(GetParam().name) + " case " + std::to_string(i));
  }
}

INSTANTIATE_TEST_SUITE_P(Families, ClipperOracleFamilies, ::testing::ValuesIn(kOracleFamilies), family_name);

}  // namespace
}  // namespace zt::test
