// Input repair with segments: the worked examples on a bare engine, and
// defective input repaired by whole computations.
#include <gtest/gtest.h>

#include <cmath>
#include <vector>

#include "vd_test_util.hpp"
#include "voronoi/detail/input_repair.hpp"
#include "voronoi/detail/preprocess.hpp"
#include "voronoi/detail/segment_repair.hpp"

namespace zt::vdtest {
namespace {

// A bare engine holding points (from index 2) and segments with line data,
// in internal units (no scaling, no dummies).
struct Bare {
  explicit Bare(const std::vector<Pt>& pts) {
    VD_Initialize();
    VD_Reset();
    for (std::size_t i = 0; i < pts.size(); ++i) API_AddPoint(pts[i].x, pts[i].y, 10 + static_cast<int>(i));
  }
  std::int32_t Seg(std::int32_t a, std::int32_t b) { return API_AddSegment(a, b, 77); }
  void Prepare() {
    vd::ComputeSegmentLineData();
    vd::Vd().restartPending = false;
  }
  vd::Engine& g = vd::Vd();
};

TEST(SegmentRepair, PointNearTheInteriorSplitsTheSegment) {
  Bare b({{0, 0}, {1, 0}, {0.5, 5e-7}});
  b.Seg(2, 3);
  b.Prepare();
  ASSERT_TRUE(vd::RepairSegmentPoint(0, 4));
  EXPECT_TRUE(b.g.restartPending);
  ASSERT_EQ(b.g.segments.count, 2);
  EXPECT_EQ(b.g.segments[0].i1, 2);
  EXPECT_EQ(b.g.segments[0].i2, 4);
  EXPECT_EQ(b.g.segments[1].i1, 4);
  EXPECT_EQ(b.g.segments[1].i2, 3);
  EXPECT_EQ(b.g.segments[1].tag, 77);
}

TEST(SegmentRepair, PointNearAnEndMergesWithIt) {
  Bare b({{0, 0}, {1, 0}, {3e-7, 4e-7}});
  b.Seg(2, 3);
  b.Prepare();
  ASSERT_TRUE(vd::RepairSegmentPoint(0, 4));
  EXPECT_EQ(b.g.segments.count, 1);
  EXPECT_EQ(b.g.points[2].x, b.g.points[4].x);
  EXPECT_EQ(b.g.points[2].y, b.g.points[4].y);
  EXPECT_DOUBLE_EQ(b.g.points[2].x, 1.5e-7);
  EXPECT_TRUE(b.g.lineDataInexact);
}

TEST(SegmentRepair, PointOffTheLineChangesNothing) {
  Bare b({{0, 0}, {1, 0}, {0.5, 2e-6}});
  b.Seg(2, 3);
  b.Prepare();
  EXPECT_FALSE(vd::RepairSegmentPoint(0, 4));
  EXPECT_FALSE(vd::RepairInput(0, vd::SEG, true));  // check-all is off by default
  EXPECT_FALSE(b.g.restartPending);
  EXPECT_EQ(b.g.segments.count, 1);
}

TEST(SegmentRepair, CrossingSegmentsAreSplitAtTheCrossing) {
  Bare b({{0, 0}, {1, 1}, {0, 1}, {1, 0.5}});
  b.Seg(2, 3);
  b.Seg(4, 5);
  b.Prepare();
  const std::int32_t before = b.g.points.count;
  ASSERT_TRUE(vd::RepairSegmentSegment(0, 1));
  ASSERT_EQ(b.g.points.count, before + 1);
  const vd::PointRecord& x = b.g.points[before];
  EXPECT_EQ(x.tag, -1);
  // (0,0)-(1,1) meets (0,1)-(1,0.5) at x = y = 2/3.
  EXPECT_NEAR(x.x, 2.0 / 3.0, 1e-15);
  EXPECT_NEAR(x.y, 2.0 / 3.0, 1e-15);
  ASSERT_EQ(b.g.segments.count, 4);
  EXPECT_EQ(b.g.segments[0].i2, before);
  EXPECT_EQ(b.g.segments[1].i2, before);
  EXPECT_EQ(b.g.segments[2].i1, before);
  EXPECT_EQ(b.g.segments[3].i1, before);
}

TEST(SegmentRepair, TouchingSegmentsAreNotCrossing) {
  // A shared end point, and an end point on the other's interior.
  Bare b({{0, 0}, {1, 0}, {1, 1}, {0.5, 0}, {0.5, 1}});
  b.Seg(2, 3);
  b.Seg(3, 4);
  b.Seg(5, 6);
  b.Prepare();
  EXPECT_FALSE(vd::RepairSegmentSegment(0, 1));
  EXPECT_FALSE(vd::RepairSegmentSegment(0, 2));
  EXPECT_FALSE(b.g.restartPending);
  // The point on the interior is caught by the segment-point test.
  EXPECT_TRUE(vd::RepairSegmentPoint(0, 5));
}

TEST(SegmentRepair, DuplicateSegmentsLoseTheHigherIndex) {
  for (const bool reversed : {false, true}) {
    Bare b({{0, 0}, {1, 0}, {0, 1}});
    b.Seg(2, 3);
    b.Seg(3, 4);
    reversed ? b.Seg(3, 2) : b.Seg(2, 3);
    b.Prepare();
    ASSERT_TRUE(vd::RepairSegmentSegment(2, 0)) << reversed;
    ASSERT_EQ(b.g.segments.count, 2);
    EXPECT_EQ(b.g.segments[0].i1, 2);
    EXPECT_EQ(b.g.segments[1].i1, 3);
    EXPECT_EQ(b.g.segments[1].i2, 4);
  }
}

TEST(SegmentRepair, SuspectPairIsTestedFirstAndCleared) {
  Bare b({{0, 0}, {1, 0}, {0.5, 5e-7}});
  b.Seg(2, 3);
  b.Prepare();
  b.g.suspect = vd::SuspectPair{true, 4, vd::PNT, 0, vd::SEG};
  EXPECT_TRUE(vd::RepairInput(0, vd::SEG, false));
  EXPECT_FALSE(b.g.suspect.set);
  EXPECT_EQ(b.g.segments.count, 2);
}

// ---- Whole computations on defective input.

TEST(SegmentRepairComputation, CrossingContoursAreSplitAndComplete) {
  // Two overlapping squares: eight crossings... of which the computation
  // needs every one repaired to finish with a sound diagram.
  StoreContours({{{0, 0}, {2, 0}, {2, 2}, {0, 2}}, {{1, 1}, {3, 1.2}, {3.1, 3}, {0.9, 3.2}}}, 1);
  ASSERT_TRUE(ComputeSegments());
  EXPECT_EQ(FinalCheck(), "");
  EXPECT_GT(VD_GetRestartCount(), 0);
  // A star crossed by a long segment through its middle.
  VD_Reset();
  std::vector<std::int32_t> idx;
  for (int i = 0; i < 12; ++i) {
    const double a = 2 * M_PI * i / 12, r = i % 2 ? 1.0 : 0.5;
    idx.push_back(API_AddPoint(r * std::cos(a), r * std::sin(a), 0));
  }
  for (int i = 0; i < 12; ++i) API_AddSegment(idx[i], idx[(i + 1) % 12], 0);
  API_AddSegment(API_AddPoint(-2, 0.1, 0), API_AddPoint(2, -0.05, 0), 0);
  ASSERT_TRUE(ComputeSegments());
  EXPECT_EQ(FinalCheck(), "");
}

TEST(SegmentRepairComputation, NearDuplicatePointsAndPointsOnSegments) {
  // Internal units: the square spans 1, so 1e-8 is far below the repair
  // distance of 1e-6.
  StoreContours({{{0, 0}, {1, 0}, {1, 1}, {0, 1}}}, 1);
  API_AddPoint(0.5, 1e-8, 3);        // on the bottom edge
  API_AddPoint(1 + 1e-8, 1 - 1e-8, 3);  // at a corner
  API_AddPoint(0.25, 0.75, 3);       // an honest point inside
  ASSERT_TRUE(ComputeSegments());
  EXPECT_EQ(FinalCheck(), "");
  EXPECT_GT(VD_GetRestartCount(), 0);
}

TEST(SegmentRepairComputation, DuplicateSegmentsInEitherOrientation) {
  VD_Initialize();
  VD_Reset();
  const std::int32_t a = API_AddPoint(0, 0, 0), b = API_AddPoint(1, 0, 0), c = API_AddPoint(0.5, 1, 0);
  API_AddSegment(a, b, 0);
  API_AddSegment(b, c, 0);
  API_AddSegment(c, a, 0);
  API_AddSegment(b, a, 0);
  API_AddSegment(c, b, 0);
  ASSERT_TRUE(ComputeSegments());
  EXPECT_EQ(FinalCheck(), "");
  EXPECT_EQ(vd::Vd().segments.count, 3);
}

}  // namespace
}  // namespace zt::vdtest
