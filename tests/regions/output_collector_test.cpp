// The OutputCollector's rules: mapping back, duplicates within the
// tolerance, the stored point moved at a change of tag, separators.
#include <gtest/gtest.h>

#include "regions/detail/output_collector.hpp"

namespace zt::detail {
namespace {

class Collector : public ::testing::Test {
 protected:
  void SetUp() override {
    collector_set_tolerance(kDuplicateTolerance);
    collector_reset(&out, 0.0, 0.0, 1.0, 1.0);
  }
  TaggedPointList out;
};

TEST_F(Collector, SamePointTwiceWithOneTagIsStoredOnceWithTwoTagsTwice) {
  emit_point(1, 1, 5);
  emit_point(1, 1, 5);
  EXPECT_EQ(out.count(), 1);
  emit_point(1, 1, 6);
  ASSERT_EQ(out.count(), 2);
  EXPECT_EQ(out[0].tag, 5);
  EXPECT_EQ(out[1].tag, 6);
}

TEST_F(Collector, RunWithinToleranceKeepsFirstPositionUntilTheTagChanges) {
  emit_point(1, 1, 5);
  emit_point(1 + 5e-8, 1, 5);
  emit_point(1 + 9e-8, 1 - 9e-8, 5);
  ASSERT_EQ(out.count(), 1);
  EXPECT_EQ(out[0].x, 1.0);
  emit_point(2, 2, 6);
  ASSERT_EQ(out.count(), 2);
  EXPECT_EQ(out[0].x, 1 + 9e-8);  // moved to the last point of the run
  EXPECT_EQ(out[0].y, 1 - 9e-8);
  EXPECT_EQ(out[0].tag, 5);
  emit_point(2 + 2e-7, 2, 6);  // beyond the tolerance: stored
  EXPECT_EQ(out.count(), 3);
}

TEST_F(Collector, SeparatorsPassUnmappedAndCollapse) {
  collector_reset(&out, 10.0, 20.0, 2.0, 4.0);
  emit_point(1, 1, 3);
  emit_separator();
  emit_separator();
  ASSERT_EQ(out.count(), 2);
  EXPECT_EQ(out[0].x, 12.0);
  EXPECT_EQ(out[0].y, 24.0);
  EXPECT_EQ(out[1].x, kSeparatorCoord);
  EXPECT_EQ(out[1].tag, kSeparatorTag);
  emit_point(0, 0, 3);
  ASSERT_EQ(out.count(), 3);
  EXPECT_EQ(out[1].x, kSeparatorCoord);  // the separator stays a separator
  EXPECT_EQ(out[2].x, 10.0);
}

}  // namespace
}  // namespace zt::detail
