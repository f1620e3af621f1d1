// Offsets collected by SlopeDomain against Clipper's round offset at the
// same arc tolerance: random star-shaped pockets with star-shaped islands,
// inside and outside. The number of curves agrees and every vertex of either
// result lies within 0.01 of the other's boundary.
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <numbers>
#include <random>
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

std::vector<Ring> ClipperOffsetOf(const std::vector<Ring>& rings, double delta) {
  ClipperLib::Paths in;
  for (Ring r : rings) {
    r.push_back(r.front());  // closed, as the shared conversion takes them
    in.push_back(test::to_path(r));
  }
  std::vector<Ring> rs;
  for (const ClipperLib::Path& p : test::round_offset(in, delta, kArcTolerance / kClipperJoinOvershoot)) {
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

TEST(ClipperOffsetOracle, PocketsWithIslandsInsideAndOutside) {
  std::mt19937 rng(23);
  for (int trial = 0; trial < 40; ++trial) {
    std::vector<Ring> rings{test::Star(rng, 0, 0, 70, 100, 10 + trial % 30, false)};
    const int islands = trial % 4;
    for (int h = 0; h < islands; ++h) {
      const double a = 2 * std::numbers::pi * h / std::max(islands, 1);
      const double off = islands == 1 ? 0.0 : 35.0;
      rings.push_back(test::Star(rng, off * std::cos(a), off * std::sin(a), 8, 18, 5 + trial % 9, true));
    }
    std::uniform_real_distribution<double> td(0.5, 12.0);
    const double t = td(rng);
    const std::int32_t side = trial % 2 ? kSideLeft : kSideRight;
    const auto ours = OursOffset(rings, t, side);
    // Counter-clockwise outer contour: its left is the inside.
    const auto theirs = ClipperOffsetOf(rings, side == kSideLeft ? -t : t);
    ASSERT_EQ(ours.size(), theirs.size()) << "trial " << trial << " t " << t;
    EXPECT_LE(OneWay(ours, theirs), kBoundaryTolerance) << "trial " << trial;
    EXPECT_LE(OneWay(theirs, ours), kBoundaryTolerance) << "trial " << trial;
  }
}

}  // namespace
}  // namespace zt
