// SlopeDomain::compute with the Voronoi engine, where polylines too far
// apart for their curves to meet are offset as separate groups and
// remembered: the same curves, byte for byte, whether a group is offset
// with others, alone, fresh or remembered, on any thread; inputs a
// last bit apart give the same curves; groups close enough to meet stay one
// diagram.
#include <gtest/gtest.h>

#include <bit>
#include <cmath>
#include <functional>
#include <thread>
#include <vector>

#include "zone/offset_engine.hpp"
#include "zone/slope_domain.hpp"

namespace zt::testing {
namespace {

constexpr double kPi = 3.14159265358979323846;

// A counter-clockwise wavy ring of n points around (cx, cy), closed.
std::vector<Point2d> ring(double cx, double cy, double r, int n) {
  std::vector<Point2d> p;
  for (int i = 0; i <= n; ++i) {
    const double a = 2 * kPi * (i % n) / n;
    p.push_back({cx + (r + 0.3 * std::sin(5 * a)) * std::cos(a), cy + (r + 0.3 * std::sin(5 * a)) * std::sin(a)});
  }
  return p;
}

void fill(TaggedPointList& l, const std::vector<std::vector<Point2d>>& polylines) {
  for (const auto& poly : polylines) {
    l.Add(TaggedPoint::separator());
    for (const Point2d& p : poly) l.Add({0, p.x, p.y});
  }
}

struct Bits {
  std::vector<std::uint64_t> v;
  bool operator==(const Bits&) const = default;
};

// The offset curves of `polylines`, computed on a fresh thread with nothing
// remembered, after `before` (other offsets computed first, and remembered).
Bits offset_on_fresh_thread(const std::vector<std::vector<Point2d>>& polylines, double distance, int side,
                            const std::vector<std::vector<std::vector<Point2d>>>& before = {}) {
  forget_offset_groups();
  Bits out;
  std::thread([&] {
    voronoi_offset_engine().initialize();
    for (const auto& b : before) {
      TaggedPointList l;
      fill(l, b);
      SlopeDomain(distance).compute(l, side);
    }
    TaggedPointList l;
    fill(l, polylines);
    EXPECT_EQ(SlopeDomain(distance).compute(l, side), 0);
    for (const TaggedPoint& p : l) {
      out.v.push_back(static_cast<std::uint64_t>(static_cast<std::uint32_t>(p.tag)));
      out.v.push_back(std::bit_cast<std::uint64_t>(p.x));
      out.v.push_back(std::bit_cast<std::uint64_t>(p.y));
    }
    voronoi_offset_engine().terminate();
  }).join();
  return out;
}

int curves(const Bits& b) {
  int n = 0;
  for (std::size_t i = 0; i < b.v.size(); i += 3) n += static_cast<int>(static_cast<std::int32_t>(b.v[i]) == kSeparatorTag);
  return n - 1;  // one separator leads, one follows each curve
}

struct GroupCase {
  const char* name;
  double distance;
  int side;
  double apart;  // centre distance of the two rings (radius 3)
  int curves;    // of the two together
  bool separate;  // offset as two groups
};

constexpr GroupCase kCases[] = {
    {"GrownFarApart", 1.0, kSideRight, 20.0, 2, true},
    {"ShrunkFarApart", 1.0, kSideLeft, 20.0, 2, true},
    {"GrownJustApart", 1.0, kSideRight, 8.8, 2, true},  // boxes 2.2 apart
    {"ShrunkInOneGroup", 2.0, kSideLeft, 7.0, 2, false},  // boxes 0.4 apart
    {"GrownMeeting", 1.0, kSideRight, 7.2, 1, false},
    {"GrownMeetingAcrossMoreThanTheDistance", 1.0, kSideRight, 8.0, 1, false},  // rings 1.75 apart
};

TEST(OffsetGroups, GroupsGiveTheSameCurvesTogetherAloneFreshOrRemembered) {
  for (const GroupCase& c : kCases) {
    SCOPED_TRACE(c.name);
    const auto a = ring(0, 0, 3, 400), b = ring(c.apart, 1, 3, 300), far = ring(-40, 40, 5, 200);
    const Bits together = offset_on_fresh_thread({a, b}, c.distance, c.side);
    EXPECT_EQ(curves(together), c.curves);
    // The same after the thread offset the groups in other company.
    EXPECT_EQ(offset_on_fresh_thread({a, b}, c.distance, c.side, {{a, far}, {far, b}, {b}}), together);
    if (!c.separate) continue;
    // Apart, each ring's curves are its own, in the order of the groups.
    const Bits first = offset_on_fresh_thread({a}, c.distance, c.side);
    Bits second = offset_on_fresh_thread({b}, c.distance, c.side);
    Bits joined = first;
    joined.v.insert(joined.v.end(), second.v.begin() + 3, second.v.end());  // one separator between
    EXPECT_EQ(joined, together);
  }
}

TEST(OffsetGroups, InputsALastBitApartGiveTheSameCurves) {
  auto a = ring(0, 0, 3, 400);
  const Bits once = offset_on_fresh_thread({a}, 2.0, kSideRight);
  for (Point2d& p : a) p.x = std::nextafter(p.x, 1e9);
  EXPECT_EQ(offset_on_fresh_thread({a}, 2.0, kSideRight), once);
}

}  // namespace
}  // namespace zt::testing
