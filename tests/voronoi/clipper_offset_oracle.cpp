// Offsets collected by SlopeDomain against Clipper's round offset at the
// same arc tolerance: random star-shaped pockets with star-shaped islands,
// inside and outside; rest material with spikes, there-and-back contours,
// and the ring sets of data/ring_sets.txt (squares touching by edges or
// corners, triangles sharing a vertex), whose curves do not depend on the
// order of the contours nor on their starts.
// The number of curves agrees and every vertex of either result lies within
// 0.01 of the other's boundary.
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <numbers>
#include <random>
#include <string>
#include <utility>
#include <vector>

#include "offset_check.hpp"
#include "support/clipper_paths.hpp"
#include "voronoi/engine.hpp"
#include "zone/slope_domain.hpp"

namespace zt {
namespace {

using test::Pt;
using Ring = std::vector<Pt>;

constexpr double kBoundaryTolerance = 0.01;
// Clipper rounds the number of steps of a round join to the nearest integer,
// so its chords may leave the arc by up to 1.5^2 = 2.25 times its arc
// tolerance. It is given the tolerance that keeps its chords within 0.005 of
// the arc, as ours are: both results then stay within 0.005 of the exact
// offset and within 0.01 of each other.
constexpr double kClipperJoinOvershoot = 2.25;

// The curves SlopeDomain collects (closed rings, repeated points dropped).
std::vector<Ring> OursOffset(const std::vector<Ring>& rings, double t, std::int32_t side) {
  TaggedPointList list;
  for (const Ring& r : rings) {
    for (const Pt& p : r) list.AddDoubling({0, p.x, p.y});
    list.AddDoubling({0, r[0].x, r[0].y});
    list.AddDoubling(TaggedPoint::separator());
  }
  VD_Initialize();
  SlopeDomain domain(t);
  EXPECT_EQ(domain.compute(list, side), 0);
  std::vector<Ring> out;
  Ring cur;
  for (const TaggedPoint& p : list) {
    if (p.tag == kSeparatorTag) {
      if (!cur.empty()) out.push_back(cur);
      cur.clear();
    } else if (cur.empty() || cur.back().x != p.x || cur.back().y != p.y) {
      cur.push_back({p.x, p.y});
    }
  }
  if (!cur.empty()) out.push_back(cur);
  return out;
}

// Rings of two points are there-and-back contours: Clipper drops them as
// polygons, so they go in as open paths with round ends (strokes).
std::vector<Ring> ClipperOffsetOf(const std::vector<Ring>& rings, double delta) {
  ClipperLib::ClipperOffset co(2.0, kArcTolerance / kClipperJoinOvershoot * test::kClipperScale);
  for (Ring r : rings) {
    const bool stroke = r.size() == 2;
    r.push_back(r.front());  // closed, as the shared conversion takes them
    ClipperLib::Path path = test::to_path(r);
    co.AddPath(path, ClipperLib::jtRound, stroke ? ClipperLib::etOpenRound : ClipperLib::etClosedPolygon);
  }
  ClipperLib::Paths offset;
  co.Execute(offset, delta * test::kClipperScale);
  std::vector<Ring> rs;
  for (const ClipperLib::Path& p : offset) {
    rs.emplace_back();
    for (const auto& q : p) rs.back().push_back({q.X / test::kClipperScale, q.Y / test::kClipperScale});
  }
  return rs;
}

double DistToRings(const Pt& p, const std::vector<Ring>& rings) {
  double m = INFINITY;
  for (const Ring& r : rings) m = std::min(m, test::ring_distance(p, r));
  return m;
}

double OneWay(const std::vector<Ring>& from, const std::vector<Ring>& to) {
  double m = 0;
  for (const Ring& r : from)
    for (const Pt& p : r) m = std::max(m, DistToRings(p, to));
  return m;
}

// Ours against Clipper on one side (`outward`: the right of the rings).
void ExpectLikeClipper(const std::vector<Ring>& rings, double t, std::int32_t side, const std::string& what) {
  SCOPED_TRACE(what);
  const auto ours = OursOffset(rings, t, side);
  const auto theirs = ClipperOffsetOf(rings, side == kSideLeft ? -t : t);
  ASSERT_EQ(ours.size(), theirs.size());
  EXPECT_LE(OneWay(ours, theirs), kBoundaryTolerance);
  EXPECT_LE(OneWay(theirs, ours), kBoundaryTolerance);
}

TEST(ClipperOffsetOracle, PocketsWithIslandsInsideAndOutside) {
  std::mt19937 rng(23);
  for (int trial = 0; trial < 40; ++trial) {
    const std::vector<Ring> rings = test::PocketWithIslands(rng, 10 + trial % 30, trial % 4, 5 + trial % 9);
    std::uniform_real_distribution<double> td(0.5, 12.0);
    const double t = td(rng);
    // Counter-clockwise outer contour: its left is the inside.
    ExpectLikeClipper(rings, t, trial % 2 ? kSideLeft : kSideRight, "trial " + std::to_string(trial));
  }
}

// A two-point contour (A, B, A) leaves one segment with the same region on
// both sides: either side, and either way round, gives its stroke.
TEST(DegenerateRestMaterial, ThereAndBackContourGivesItsStrokeOnEitherSide) {
  for (const Ring& r : {Ring{{3, 0}, {-1, 4}}, Ring{{-1, 4}, {3, 0}}})
    for (const std::int32_t side : {kSideLeft, kSideRight}) {
      const auto ours = OursOffset({r}, 2.0, side);
      ASSERT_EQ(ours.size(), 1u) << "side " << side;
      EXPECT_LE(OneWay(ours, ClipperOffsetOf({r}, 2.0)), kBoundaryTolerance);
      EXPECT_LE(OneWay(ClipperOffsetOf({r}, 2.0), ours), kBoundaryTolerance);
    }
}

TEST(DegenerateRestMaterial, SpikedSquareKeepsItsOutwardOffset) {
  const Ring square{{0, 0}, {4, 0}, {2.0822978, -3.5103302}, {4, 0}, {8, 0}, {8, 8}, {0, 8}};
  ExpectLikeClipper({square}, 2.4, kSideRight, "outward");
  ExpectLikeClipper({square}, 2.4, kSideLeft, "inward");
}

// A spike at each corner and at two points of each edge of a unit square,
// in nine directions (none along an edge), offset outward and inward.
TEST(DegenerateRestMaterial, EverySpikePlacementOnASquareKeepsItsCurves) {
  constexpr double kSpikeLength = 0.35, kDistance = 0.15;
  const Ring square{{0, 0}, {1, 0}, {1, 1}, {0, 1}};
  for (int at = 0; at < 12; ++at)
    for (int dir = 0; dir < 9; ++dir) {
      const int corner = at % 4;
      const double f = at < 4 ? 0.0 : at < 8 ? 1.0 / 3 : 2.0 / 3;
      const Pt& p = square[corner];
      const Pt& q = square[(corner + 1) % 4];
      const Pt s{p.x + f * (q.x - p.x), p.y + f * (q.y - p.y)};
      const double a = (20.0 + 40.0 * dir) * std::numbers::pi / 180;
      const Pt tip{s.x + kSpikeLength * std::cos(a), s.y + kSpikeLength * std::sin(a)};
      Ring r;
      for (int k = 0; k < 4; ++k) {
        if (k == corner && f == 0.0) {
          r.insert(r.end(), {s, tip, s});
          continue;
        }
        r.push_back(square[k]);
        if (k == corner) r.insert(r.end(), {s, tip, s});
      }
      ExpectLikeClipper({r}, kDistance, kSideRight, "outward at " + std::to_string(at) + " dir " + std::to_string(dir));
      ExpectLikeClipper({r}, kDistance, kSideLeft, "inward at " + std::to_string(at) + " dir " + std::to_string(dir));
    }
}

// Levels of rest material as the suite hands them: squares with spikes,
// loose two-point contours, squares sharing an edge or a corner, four
// squares two by two. The curves
// do not depend on the order of the contours nor on where each closed
// contour starts.
TEST(DegenerateRestMaterial, SameCurvesWhateverTheOrderOfTheContours) {
  constexpr int kLevels = 12, kOrders = 6;
  std::mt19937 rng(1406);
  std::uniform_real_distribution<double> unit(0, 1);
  for (int level = 0; level < kLevels; ++level) {
    std::vector<Ring> rings;
    // A row of squares of side 4 with a neighbour that shares an edge or a
    // corner. The pieces lie far enough apart that no two grown pieces meet
    // at a grazing angle, where Clipper's chords would cross far from the
    // exact curves.
    for (int k = 0; k < 3; ++k) {
      const double x = 14.0 * k, y = 0.0;
      Ring sq{{x, y}, {x + 4, y}, {x + 4, y + 4}, {x, y + 4}};
      if (unit(rng) < 0.6) {  // a spike out of the bottom edge
        const Pt s{x + 1 + 2 * unit(rng), y};
        const double a = -std::numbers::pi * (0.15 + 0.7 * unit(rng));
        sq.insert(sq.begin() + 1, {s, {s.x + 2.5 * std::cos(a), s.y + 2.5 * std::sin(a)}, s});
      }
      rings.push_back(sq);
      if (unit(rng) < 0.5) rings.push_back({{x + 4, y}, {x + 8, y}, {x + 8, y + 4}, {x + 4, y + 4}});
      else rings.push_back({{x + 4, y + 4}, {x + 8, y + 4}, {x + 8, y + 8}, {x + 4, y + 8}});
    }
    // Four squares touching by their edges, two by two.
    for (const auto& [i, j] : {std::pair{0, 0}, {1, 0}, {0, 1}, {1, 1}}) {
      const double x = 45.0 + 4 * i, y = 4.0 * j;
      rings.push_back({{x, y}, {x + 4, y}, {x + 4, y + 4}, {x, y + 4}});
    }
    const int strokes = 1 + level % 3;
    for (int k = 0; k < strokes; ++k) {
      const Pt a{-5 + 14 * k + 4 * unit(rng), 16 + 6 * unit(rng)};
      rings.push_back({a, {a.x + 3 * unit(rng) + 0.5, a.y + 3 * unit(rng) - 1.5}});
    }
    const double t = 0.4 + 1.2 * unit(rng);
    for (int order = 0; order < kOrders; ++order) {
      std::shuffle(rings.begin(), rings.end(), rng);
      for (Ring& r : rings) std::rotate(r.begin(), r.begin() + rng() % r.size(), r.end());
      const std::string what = "level " + std::to_string(level) + " order " + std::to_string(order);
      ExpectLikeClipper(rings, t, kSideRight, what);
    }
  }
}

// The ring sets of data/ring_sets.txt on both sides, in their variants.
class RingSets : public test::CaseRows {};

TEST_P(RingSets, OffsetLikeClipperWhateverTheOrderAndStarts) {
  const std::vector<Ring> rings = test::ParseSites(row().field(0)).contours;
  const test::Keys k(row().field(1));
  const std::size_t n = rings.size();
  std::size_t all = n;
  for (const Ring& r : rings) all *= r.size();
  const std::size_t variants = k.str("variants") == "all" ? all : static_cast<std::size_t>(k.num("variants"));
  std::mt19937 rng(1414);
  std::vector<Ring> shuffled = rings;
  for (std::size_t v = 0; v < variants; ++v) {
    std::vector<Ring> cur = shuffled;
    if (k.str("variants") == "all") {
      // v: the cyclic shift of the order, then each ring's start.
      std::size_t code = v / n;
      for (std::size_t i = 0; i < n; ++i) {
        cur[i] = rings[(i + v) % n];
        std::rotate(cur[i].begin(), cur[i].begin() + code % cur[i].size(), cur[i].end());
        code /= cur[i].size();
      }
    } else if (v > 0) {
      std::shuffle(shuffled.begin(), shuffled.end(), rng);
      for (Ring& r : shuffled) std::rotate(r.begin(), r.begin() + rng() % r.size(), r.end());
      cur = shuffled;
    }
    for (const double t : test::Nums(k.str("t")))
      for (const std::int32_t side : {kSideLeft, kSideRight})
        ExpectLikeClipper(cur, t, side, "variant " + std::to_string(v) + " t " + std::to_string(t) + " side " + std::to_string(side));
  }
}

INSTANTIATE_TEST_SUITE_P(DegenerateRestMaterial, RingSets, test::RowsOf("ring_sets.txt"), test::RowName);

}  // namespace
}  // namespace zt
