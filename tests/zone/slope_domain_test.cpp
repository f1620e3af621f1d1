// SlopeDomain against a scripted engine: what comes back on failure and how
// the curves come back, the arc chords, and the read-out with its running
// totals and its trace texts. Then with the Voronoi engine, where polylines
// too far apart for their curves to meet are offset as separate groups and
// remembered: the same curves, byte for byte, whether a group is offset with
// others, alone, fresh or remembered, on any thread; inputs a last bit apart
// give the same curves; groups close enough to meet stay one diagram.
#include "zone/slope_domain.hpp"

#include <gtest/gtest.h>

#include <bit>
#include <cmath>
#include <functional>
#include <thread>
#include <vector>

#include "zone/offset_engine.hpp"
#include "zone/offset_readout.hpp"
#include "zone_test_support.hpp"

namespace zt::testing {
namespace {

void fill(TaggedPointList& l, const std::vector<std::vector<Point2d>>& polylines) {
  for (const auto& poly : polylines) {
    l.Add(TaggedPoint::separator());
    for (const Point2d& p : poly) l.Add({0, p.x, p.y});
  }
}

TEST(OffsetRequest, DistanceHalfSizeAndBoundFactor) {
  const double s = std::sqrt(0.5);
  OffsetRequest r = offset_request(1.0, {0, 10 * s, 0, 10 * s});  // diagonal 10
  EXPECT_NEAR(r.h, 4.9, 1e-12);
  EXPECT_EQ(r.t, 1.0);
  EXPECT_EQ(r.boundFactor, 1);
  r = offset_request(1.0, {0, s, 0, s});  // diagonal 1
  EXPECT_NEAR(r.t, 0.245, 1e-12);
  EXPECT_EQ(r.boundFactor, 3);
  // Regression: a quotient beyond the 32-bit range, or NaN, gives 1.
  EXPECT_EQ(offset_request(1e300, {0, s, 0, s}).boundFactor, 1);
  EXPECT_EQ(offset_request(1.0, {0, 0, 0, 0}).boundFactor, 1);
}

// What comes out when nothing can be fed, when the engine fails and when
// it finds no curve: the list emptied, or left as it was on failure.
TEST(SlopeDomainCompute, FailuresAndEmptyResults) {
  FakeEngine engine;
  SlopeDomain domain(1.0, engine);
  TaggedPointList l;
  fill(l, {{{1, 1}}, {{2, 2}, {2.0001, 2.0}}});  // a single point, a polyline below the extent
  EXPECT_EQ(domain.compute(l, 2), 0);
  EXPECT_EQ(l.count(), 0);
  fill(l, {{{0, 0}, {6, 0}, {6, 8}, {0, 0}}});
  engine.diagramOk = false;
  EXPECT_EQ(domain.compute(l, 2), -1);
  EXPECT_EQ(l.count(), 5);
  engine.diagramOk = true;
  engine.offsetsOk = false;
  EXPECT_EQ(domain.compute(l, 1), -1);
  EXPECT_EQ(l.count(), 5);
  engine.offsetsOk = true;  // no curve: no separator either
  EXPECT_EQ(domain.compute(l, 2), 0);
  EXPECT_EQ(l.count(), 0);
}

TEST(SlopeDomainCompute, OneCurveOfKStraightElementsGivesKPlusFourEntries) {
  FakeEngine engine;
  engine.scale = 4.0;  // the handler must see user coordinates
  engine.shift = {1.0, -2.0};
  engine.script = {{{0, 0, {0, 0}}, {0, 1, {0, 2}}, {0, 2, {2, 2}}, {0, 3, {2, 0}}}};
  SlopeDomain domain(1.0, engine);
  TaggedPointList l;
  fill(l, {{{0, 0}, {1, 0}, {1, 1}, {0, 0}}});
  ASSERT_EQ(domain.compute(l, 2), 0);
  ASSERT_EQ(l.count(), 8);
  EXPECT_EQ(l[0].tag, kSeparatorTag);
  EXPECT_EQ(l[7].tag, kSeparatorTag);
  // Reversed: the start first, second and last.
  const std::vector<Point2d> want = {{0, 0}, {0, 0}, {2, 0}, {2, 2}, {0, 2}, {0, 0}};
  for (int i = 0; i < 6; ++i) {
    EXPECT_NEAR(l[i + 1].x, want[i].x, 1e-12) << i;
    EXPECT_NEAR(l[i + 1].y, want[i].y, 1e-12) << i;
  }
}

TEST(ArcApproximation, ChordCountsDirectionsAndDegenerateArcs) {
  FakeEngine engine;
  SlopeDomain domain(1.0, engine);
  TaggedPointList out;
  domain.setOutput(&out);
  domain.approximate_arc({1, 0}, {0, 1}, {0, 0}, true, false, true);
  EXPECT_EQ(out.count(), 7 + 1);
  for (const TaggedPoint& p : out) EXPECT_NEAR(std::hypot(p.x, p.y), 1.0, 1e-12);
  out.Clear();
  domain.approximate_arc({1, 0}, {-1, 0}, {0, 0}, true, true, true);
  ASSERT_EQ(out.count(), 1 + 15 + 1);
  EXPECT_GT(out[8].y, 0.9);  // counter-clockwise through the upper half
  out.Clear();
  domain.approximate_arc({1, 0}, {-1, 0}, {0, 0}, false, false, true);
  EXPECT_LT(out[7].y, -0.9);
  // floor(a / (2 acos(1 - 0.005 / r))) chords for r = 3, a = 2, sagitta within 0.005.
  out.Clear();
  domain.approximate_arc({3, 0}, {3 * std::cos(2.0), 3 * std::sin(2.0)}, {0, 0}, true, true, true);
  EXPECT_EQ(out.count(), static_cast<int>(std::floor(1.0 / std::acos(1 - 0.005 / 3))) + 2);
  for (int i = 0; i + 1 < out.count(); ++i) {
    EXPECT_LE(3.0 - std::hypot(0.5 * (out[i].x + out[i + 1].x), 0.5 * (out[i].y + out[i + 1].y)),
              0.005 + 1e-12);
  }
  out.Clear();  // tolerance beyond the radius: the end point only
  domain.approximate_arc({0.004, 0}, {0, 0.004}, {0, 0}, true, false, true);
  EXPECT_EQ(out.count(), 1);
  // Regression: a start point on the centre gave NaN chord points.
  out.Clear();
  domain.approximate_arc({0, 0}, {0, 1}, {0, 0}, true, true, true);
  ASSERT_EQ(out.count(), 2);
  EXPECT_TRUE(std::isfinite(out[0].x) && std::isfinite(out[1].y));
}

// The default slots trace each call; the log is their output.
std::string read_out(FakeEngine& engine) {
  set_offset_engine(&engine);
  VD_OffsetHandler handler;
  ::testing::internal::CaptureStderr();
  emit_offsets(engine, handler);
  set_offset_engine(nullptr);
  return ::testing::internal::GetCapturedStderr();
}

TEST(EmitOffsets, KindsCoincidenceCentresRunningTotalsAndTraceTexts) {
  FakeEngine engine;
  engine.scale = 2.0;
  engine.centres[5] = {1.0, 0.0};
  engine.centres[-1] = {3.0, 3.0};
  engine.script = {
      {{0, 7, {0, 0}}, {2, 5, {1, 1}}, {2, 5, {1, 1.0000001}}, {9, 1, {2, 0}}},
      {{6, 0, {3, 4}}, {7, 0, {4, 3}}},
  };
  engine.computeOffsets(2, 0.5, 0.0);
  // The second element's start lies within 1e-6 (internally) of its end:
  // a line; kind 9 writes nothing.
  EXPECT_EQ(read_out(engine), test::read_text(std::string(ZT_TEST_DATA_DIR) + "/emit_offsets.expected"));
  EXPECT_STREQ(site_kind_name(4), "UNKNOWN");
}

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
