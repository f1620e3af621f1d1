// The facade: life cycle, indices, refusal of bad segments, staleness (bad
// coordinates are rows of data/point_sets.txt).
#include <gtest/gtest.h>

#include "vd_test_util.hpp"

namespace zt {
namespace {

using namespace test;

TEST(Facade, InitialiseTwiceAndResetBeforeInitialise) {
  VD_Terminate();
  VD_Reset();      // nothing while not initialised
  VD_Terminate();  // likewise
  EXPECT_TRUE(VD_Initialize());
  EXPECT_FALSE(VD_Initialize());
  VD_Terminate();
  EXPECT_TRUE(VD_Initialize());
}

TEST(Facade, IndicesAfterReset) {
  VD_Initialize();
  VD_Reset();
  EXPECT_EQ(API_AddPoint(1, 1, 7), 2);
  EXPECT_EQ(API_AddPoint(2, 1, 8), 3);
  EXPECT_EQ(vd::Vd().points[0].x, 1.0);  // slots 0 and 1 copy the first point
  EXPECT_EQ(vd::Vd().points[1].tag, -1);
  EXPECT_EQ(API_AddSegment(2, 3, 9), 0);
}

TEST(Facade, SegmentWithAnIndexThatNamesNoCallerPointIsRefused) {
  VD_Initialize();
  VD_Reset();
  API_AddPoint(0, 0, 0);
  API_AddPoint(1, 0, 0);
  for (auto [a, b] : {std::pair{0, 2}, {1, 3}, {2, 4}, {-1, 2}, {3, 100}}) {
    EXPECT_EQ(API_AddSegment(a, b, 0), -1) << a << " " << b;
  }
  EXPECT_EQ(vd::Vd().segments.count, 0);
  EXPECT_EQ(API_AddSegment(2, 3, 0), 0);
}

TEST(Facade, AddingSitesAfterAComputationMakesItStaleAndTheNextOneSound) {
  const std::vector<Pt> pts = UniformPoints(100, 21, 50.0);
  Store(pts);
  ASSERT_TRUE(ComputePoints());
  ASSERT_TRUE(VD_IsUpToDate());
  EXPECT_EQ(API_AddPoint(25.0, 25.0, 100), 102);
  EXPECT_FALSE(VD_IsUpToDate());
  ASSERT_TRUE(ComputePoints());
  EXPECT_EQ(FinalCheck(), "");
  // The same diagram as storing all 101 points at once.
  std::vector<Pt> all = pts;
  all.push_back({25.0, 25.0});
  std::vector<double> a, b;
  for (std::int32_t i = 0; i < VD_GetNodeCount(); ++i)
    if (VD_GetNode(i).live) a.push_back(VD_GetNode(i).x);
  Store(all);
  ASSERT_TRUE(ComputePoints());
  for (std::int32_t i = 0; i < VD_GetNodeCount(); ++i)
    if (VD_GetNode(i).live) b.push_back(VD_GetNode(i).x);
  EXPECT_EQ(a, b);
}

}  // namespace
}  // namespace zt
