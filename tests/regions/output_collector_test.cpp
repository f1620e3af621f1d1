// The OutputCollector's rules: duplicates within the tolerance, the stored
// point moved at a change of tag, separators passed unmapped and collapsed.
#include <gtest/gtest.h>

#include "regions/detail/output_collector.hpp"

namespace zt::detail {
namespace {

TEST(OutputCollector, DuplicateAndTagRules) {
  TaggedPointList out;
  collector_set_tolerance(kDuplicateTolerance);
  collector_reset(&out, 10.0, 20.0, 2.0, 4.0);
  emit_point(1, 1, 5);
  emit_point(1, 1, 5);  // same point, same tag: stored once
  emit_point(1 + 2e-8, 1, 5);
  emit_point(1 + 4e-8, 1 - 2e-8, 5);  // a run within 1e-7 keeps the first position...
  ASSERT_EQ(out.count(), 1);
  EXPECT_EQ(out[0].x, 12.0);
  emit_point(2, 2, 6);  // ...until the tag changes: then it moves to the run's last point
  ASSERT_EQ(out.count(), 2);
  EXPECT_EQ(out[0].x, (1 + 4e-8) * 2 + 10);
  EXPECT_EQ(out[0].y, (1 - 2e-8) * 4 + 20);
  EXPECT_EQ(out[0].tag, 5);
  emit_point(2, 2, 7);  // same point, another tag: stored twice
  ASSERT_EQ(out.count(), 3);
  EXPECT_EQ(out[1].tag, 6);
  EXPECT_EQ(out[2].tag, 7);
  emit_separator();
  emit_separator();  // collapses
  ASSERT_EQ(out.count(), 4);
  EXPECT_EQ(out[3].x, kSeparatorCoord);
  EXPECT_EQ(out[3].tag, kSeparatorTag);
  emit_point(0, 0, 3);
  ASSERT_EQ(out.count(), 5);
  EXPECT_EQ(out[3].x, kSeparatorCoord);  // the separator stays
  EXPECT_EQ(out[4].x, 10.0);
}

}  // namespace
}  // namespace zt::detail
