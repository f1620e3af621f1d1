// SlopeDomain against a scripted engine: what is fed, what is asked, how the
// curves come back, the arc chords, and the read-out's running totals.
#include "zone/slope_domain.hpp"

#include <gtest/gtest.h>

#include <cmath>
#include <limits>
#include <numbers>

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

FeedBox box_of_diagonal(double d) { return {0.0, d / std::sqrt(2.0), 0.0, d / std::sqrt(2.0)}; }

TEST(OffsetRequest, DistanceHalfSizeAndBoundFactor) {
  OffsetRequest r = offset_request(1.0, box_of_diagonal(10.0));
  EXPECT_NEAR(r.h, 4.9, 1e-12);
  EXPECT_EQ(r.t, 1.0);
  EXPECT_EQ(r.boundFactor, 1);
  r = offset_request(1.0, box_of_diagonal(1.0));
  EXPECT_NEAR(r.h, 0.49, 1e-12);
  EXPECT_NEAR(r.t, 0.245, 1e-12);
  EXPECT_EQ(r.boundFactor, 3);
  // Regression: a quotient beyond the 32-bit range, or NaN, gives 1.
  EXPECT_EQ(offset_request(1e300, box_of_diagonal(1.0)).boundFactor, 1);
  EXPECT_EQ(offset_request(1.0, FeedBox{0, 0, 0, 0}).boundFactor, 1);
  EXPECT_EQ(offset_request(std::nan(""), box_of_diagonal(1.0)).boundFactor, 1);
}

TEST(SlopeDomainFeed, PointsSegmentsTagsAndSkippedPolylines) {
  FakeEngine engine;
  SlopeDomain domain(1.0, engine);
  TaggedPointList l;
  fill(l, {
      {{0, 0}, {4, 0}, {4, 0}, {4, 3}, {0, 3}, {0, 0}},  // closed, one repeated point
      {{7, 7}},                                          // one point: not fed
      {{9, 9}, {9.0005, 9.0005}},                        // below the extent: not fed
      {{20, 0}, {22, 0}},                                // open
  });
  FeedBox box;
  EXPECT_EQ(domain.feed_contours(l, box), 2);
  ASSERT_EQ(engine.points.size(), 7u);
  const std::vector<std::int32_t> tags = {-1, 0, 0, 0, -1, -1, -1};
  for (size_t i = 0; i < tags.size(); ++i) EXPECT_EQ(engine.points[i].tag, tags[i]) << i;
  EXPECT_EQ(engine.points[4].x, 0.0);  // the closing point is stored again
  ASSERT_EQ(engine.segments.size(), 5u);
  EXPECT_EQ(engine.segments[0].i1, 2);
  EXPECT_EQ(engine.segments[0].i2, 3);
  EXPECT_EQ(engine.segments[3].i2, 6);  // no segment closes the contour
  EXPECT_EQ(engine.segments[4].tag, 1);
  EXPECT_EQ(box.xmin, 0.0);
  EXPECT_EQ(box.xmax, 22.0);
  EXPECT_EQ(box.ymax, 3.0);
  // Separator thresholds: x of exactly 90000 goes on a polyline, never starts one.
  engine.reset();
  TaggedPointList edge(0, 10);
  edge.Add({0, 90000.0, 0.0});
  edge.Add({0, 1.0, 1.0});
  edge.Add({0, 90000.0, 5.0});
  FeedBox b2;
  EXPECT_EQ(domain.feed_contours(edge, b2), 1);
  EXPECT_EQ(engine.points.size(), 2u);
}

TEST(SlopeDomainCompute, NothingToFeedEmptiesTheListWithoutAskingTheEngine) {
  FakeEngine engine;
  SlopeDomain domain(1.0, engine);
  TaggedPointList l;
  fill(l, {{{1, 1}}, {{2, 2}, {2.0001, 2.0}}});
  EXPECT_EQ(domain.compute(l, 2), 0);
  EXPECT_EQ(l.count(), 0);
  EXPECT_EQ(engine.calls, std::vector<std::string>{"reset"});
}

TEST(SlopeDomainCompute, RequestsAndFailuresLeaveTheListUnchanged) {
  FakeEngine engine;
  SlopeDomain domain(1.0, engine);
  TaggedPointList l;
  fill(l, {{{0, 0}, {6, 0}, {6, 8}, {0, 0}}});  // diagonal 10
  engine.diagramOk = false;
  EXPECT_EQ(domain.compute(l, 2), -1);
  EXPECT_EQ(l.count(), 5);
  ASSERT_EQ(engine.calls.size(), 2u);
  EXPECT_EQ(engine.calls[1], "diagram 0 1 0 0 0 0 0 0 1");
  engine.diagramOk = true;
  engine.offsetsOk = false;
  engine.calls.clear();
  EXPECT_EQ(domain.compute(l, 1), -1);
  EXPECT_EQ(l.count(), 5);
  EXPECT_EQ(engine.calls.back(), "offsets 1 1 0");
  // No curve: an empty list, no separator.
  engine.offsetsOk = true;
  EXPECT_EQ(domain.compute(l, 2), 0);
  EXPECT_EQ(l.count(), 0);
}

TEST(SlopeDomainCompute, OneCurveOfStraightElementsGivesKPlusFourEntries) {
  FakeEngine engine;
  engine.scale = 4.0;  // the handler must see user coordinates
  engine.shift = {1.0, -2.0};
  engine.script = {{1.0, {{0, 0, {0, 0}}, {0, 1, {0, 2}}, {0, 2, {2, 2}}, {0, 3, {2, 0}}}}};
  SlopeDomain domain(1.0, engine);
  TaggedPointList l;
  fill(l, {{{0, 0}, {1, 0}, {1, 1}, {0, 0}}});
  ASSERT_EQ(domain.compute(l, 2), 0);
  ASSERT_EQ(l.count(), 4 + 4);
  EXPECT_EQ(l[0].tag, kSeparatorTag);
  EXPECT_EQ(l[7].tag, kSeparatorTag);
  // Reversed: the start first, second and last; the traced order backwards.
  const std::vector<Point2d> want = {{0, 0}, {0, 0}, {2, 0}, {2, 2}, {0, 2}, {0, 0}};
  for (int i = 0; i < 6; ++i) {
    EXPECT_NEAR(l[i + 1].x, want[i].x, 1e-12) << i;
    EXPECT_NEAR(l[i + 1].y, want[i].y, 1e-12) << i;
    EXPECT_EQ(l[i + 1].tag, 0);
  }
  EXPECT_EQ(domain.curveStart, -1);
}

class ArcTest : public ::testing::Test {
 protected:
  FakeEngine engine;
  SlopeDomain domain{1.0, engine};
  TaggedPointList out{0, 100};
  void SetUp() override { domain.setOutput(&out); }
};

TEST_F(ArcTest, ChordCountsOfQuarterAndHalfCircles) {
  domain.approximate_arc({1, 0}, {0, 1}, {0, 0}, true, false, true);
  EXPECT_EQ(out.count(), 7 + 1);
  for (const TaggedPoint& p : out) EXPECT_NEAR(std::hypot(p.x, p.y), 1.0, 1e-12);
  out.Clear();
  domain.approximate_arc({1, 0}, {-1, 0}, {0, 0}, true, true, true);
  EXPECT_EQ(out.count(), 1 + 15 + 1);
  // Counter-clockwise from (1, 0) to (-1, 0) goes through the upper half,
  // clockwise through the lower half.
  for (int i = 1; i < 16; ++i) EXPECT_GT(out[i].y, 0.0);
  out.Clear();
  domain.approximate_arc({1, 0}, {-1, 0}, {0, 0}, false, false, true);
  for (int i = 0; i < 15; ++i) EXPECT_LT(out[i].y, 0.0);
  // Chord count floor(a / (2 acos(1 - 0.005 / r))) for r = 3, a = 2.
  out.Clear();
  domain.approximate_arc({3, 0}, {3 * std::cos(2.0), 3 * std::sin(2.0)}, {0, 0}, true, false, true);
  EXPECT_EQ(out.count(), static_cast<int>(std::floor(2.0 / (2 * std::acos(1 - 0.005 / 3)))) + 1);
  // Every chord's sagitta stays within the tolerance.
  for (int i = 0; i + 1 < out.count(); ++i) {
    const double mx = 0.5 * (out[i].x + out[i + 1].x), my = 0.5 * (out[i].y + out[i + 1].y);
    EXPECT_LE(3.0 - std::hypot(mx, my), 0.005 + 1e-12);
  }
}

TEST_F(ArcTest, SmallRadiusAndDegenerateArcsGiveTheirEndPointsOnly) {
  domain.approximate_arc({0.004, 0}, {0, 0.004}, {0, 0}, true, false, true);
  ASSERT_EQ(out.count(), 1);
  EXPECT_EQ(out[0].y, 0.004);
  out.Clear();
  // Regression: a start point on the centre gave NaN chord points.
  domain.approximate_arc({0, 0}, {0, 1}, {0, 0}, true, true, true);
  ASSERT_EQ(out.count(), 2);
  for (const TaggedPoint& p : out) EXPECT_TRUE(std::isfinite(p.x) && std::isfinite(p.y));
}

// Records the handler calls of a read-out.
struct RecordingHandler : VD_OffsetHandler {
  std::vector<std::string> log;
  void initOutput(std::int32_t n) override { log.push_back("initOutput " + std::to_string(n)); }
  void initCurve(double, double x, double y, std::int32_t n) override {
    log.push_back("initCurve " + std::to_string(x) + " " + std::to_string(y) + " " + std::to_string(n));
  }
  void writeLineSegment(double, double, double ex, double ey, SiteRef s) override {
    log.push_back("line " + std::to_string(ex) + " " + std::to_string(ey) + " " +
                  std::to_string(s.index) + " " + site_kind_name(s.kind));
  }
  void writeCircularArc(double, double, double ex, double ey, double cx, double cy, bool ccw,
                        SiteRef s) override {
    log.push_back("arc " + std::to_string(ex) + " " + std::to_string(ey) + " c " +
                  std::to_string(cx) + " " + std::to_string(cy) + (ccw ? " ccw " : " cw ") +
                  site_kind_name(s.kind));
  }
  void endCurve(std::int32_t l, std::int32_t a) override {
    log.push_back("endCurve " + std::to_string(l) + " " + std::to_string(a));
  }
  void endOutput(std::int32_t n) override { log.push_back("endOutput " + std::to_string(n)); }
};

TEST(EmitOffsets, KindsCoincidenceCentresAndRunningTotals) {
  FakeEngine engine;
  engine.scale = 2.0;
  engine.pointCentres[5] = {1.0, 0.0};
  engine.arcCentres[0] = {3.0, 3.0};
  engine.script = {
      {0.5, {{0, 7, {0, 0}}, {2, 5, {1, 1}}, {2, 5, {1, 1.0000001}}, {9, 1, {2, 0}}}},
      {0.5, {{6, 0, {3, 4}}, {7, 0, {4, 3}}}},
  };
  engine.computeOffsets(2, 0.5, 0.0);
  RecordingHandler h;
  emit_offsets(engine, h);
  EXPECT_EQ(h.nCurves, 2);
  const std::vector<std::string> want = {
      "initOutput 2",
      "initCurve 0.000000 0.000000 4",
      "line 1.000000 1.000000 7 SEG",
      "line 1.000000 1.000000 5 PNT",  // the next start lies within 1e-6 internally
      "arc 2.000000 0.000000 c 1.000000 0.000000 cw PNT",
      // kind 9: nothing
      "endCurve 2 1",
      "initCurve 3.000000 4.000000 2",
      "arc 4.000000 3.000000 c 3.000000 3.000000 ccw ARC",
      "arc 3.000000 4.000000 c 3.000000 3.000000 cw ARC",
      "endCurve 2 3",
      "endOutput 2",
  };
  EXPECT_EQ(h.log, want);
}

TEST(OffsetHandlerTrace, DefaultSlotsWriteTheirExactTexts) {
  FakeEngine engine;
  set_offset_engine(&engine);
  VD_OffsetHandler h;
  ::testing::internal::CaptureStderr();
  h.initOutput(2);
  h.initCurve(1.5, 0.25, -1.0, 4);
  h.writeLineSegment(0, 0, 1, 2, {3, kSiteSegment});
  h.writeCircularArc(0, 0, 1, 1, 0.5, 0.5, true, {4, kSitePoint});
  h.writeCircularArc(0, 0, 1, 1, 0.5, 0.5, false, {1, 9});
  h.endCurve(1, 2);
  h.endOutput(2);
  const std::string got = ::testing::internal::GetCapturedStderr();
  set_offset_engine(nullptr);
  const std::string stars = "***********************************\n";
  const std::string want =
      stars + "initOutput :\n   .nCurves(2)\n" +
      "initCurve : \n   .offset (1.500000)\n   .start(0.250000,-1.000000)\n   .nMaxElts(4)\n" +
      "writeLineSegment :\n   .start(0.000000,0.000000)\n   .end(1.000000,2.000000)\n"
      "   .site(SEG,VD(3),TAG(3))\n" +
      "writeCircularArc :\n   .orientation(CCW)\n   .start(0.000000,0.000000)\n"
      "   .end(1.000000,1.000000)\n   .center(0.500000,0.500000)\n   .site(PNT,VD(4),TAG(2004))\n" +
      "writeCircularArc :\n   .orientation(CW)\n   .start(0.000000,0.000000)\n"
      "   .end(1.000000,1.000000)\n   .center(0.500000,0.500000)\n   .site(UNKNOWN,VD(1),TAG(9001))\n" +
      "endCurve :\n   .nLines(1)\n   .nArcs(2)\n" + "endOutput :\n   .nCurves(2)\n" + stars;
  EXPECT_EQ(got, want);
}

}  // namespace
}  // namespace zt::testing
