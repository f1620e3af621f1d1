// SlopeDomain against a scripted engine: what comes back on failure and how
// the curves come back, the arc chords, and the read-out with its running
// totals and its trace texts.
#include "zone/slope_domain.hpp"

#include <gtest/gtest.h>

#include <cmath>

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

}  // namespace
}  // namespace zt::testing
