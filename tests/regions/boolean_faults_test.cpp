// Bad input and the mended faults: refused coordinates, empty operands,
// unknown operations, storage failure, points outside the normalised square,
// and the median selection on many equal keys.
#include <gtest/gtest.h>

#include <cmath>
#include <limits>
#include <thread>
#include <vector>

#include "region_test_support.hpp"
#include "regions/detail/engine.hpp"

namespace zt::test {
namespace {

TEST(BooleanBadInput, NonFiniteOrHugeCoordinatesAreRefusedBeforeAnythingIsTouched) {
  const double bad[] = {std::numeric_limits<double>::quiet_NaN(), std::numeric_limits<double>::infinity(),
                        -std::numeric_limits<double>::infinity(), 1.5e15, -2e15};
  TaggedPointList good;
  fill_list(good, {rect(0, 0, 1, 1)});
  for (double v : bad) {
    for (int which = 0; which < 4; ++which) {
      TaggedPointList a;
      fill_list(a, {rect(0, 0, 2, 2)});
      TaggedPoint& p = a[1 + which / 2];
      (which % 2 ? p.y : p.x) = v;
      TaggedPointList r;
      r.AddDoubling(TaggedPoint(42, 1, 2));
      EXPECT_EQ(rg_boolean(a, good, "u", &r), -1) << v;
      EXPECT_EQ(rg_boolean(good, a, "i", &r), -1) << v;
      ASSERT_EQ(r.count(), 1);
      EXPECT_EQ(r[0].tag, 42);
    }
  }
  // At the limit the input is still accepted (coordinates above 99990 are
  // separators, so large ones are negative).
  TaggedPointList big, inner, r;
  fill_list(big, {rect(-1e15, -1e15, 0, 0)});
  fill_list(inner, {rect(-5e14, -5e14, -1e14, -1e14)});
  EXPECT_EQ(rg_boolean(big, inner, "i", &r), 0);
  EXPECT_DOUBLE_EQ(total_area(r), 1.6e29);
}

TEST(BooleanBadInput, EmptyAndDegenerateOperandsFail) {
  TaggedPointList square, empty, separators, onePoint, r;
  fill_list(square, {rect(0, 0, 1, 1)});
  separators.AddDoubling(TaggedPoint::separator());
  separators.AddDoubling(TaggedPoint(kSeparatorTag, 5, 5));  // tagged as a separator
  onePoint.AddDoubling(TaggedPoint(0, 0.5, 0.5));
  onePoint.AddDoubling(TaggedPoint(0, 0.5, 0.5 + 1e-16));
  onePoint.AddDoubling(TaggedPoint(0, 0.5, 0.5));
  onePoint.AddDoubling(TaggedPoint::separator());
  for (const TaggedPointList* bad : {&empty, &separators, &onePoint}) {
    EXPECT_EQ(rg_boolean(*bad, square, "u", &r), -1);
    EXPECT_EQ(rg_boolean(square, *bad, "u", &r), -1);
  }
  EXPECT_EQ(rg_boolean(separators, separators, "u", &r), -1);
  EXPECT_EQ(rg_boolean(square, square, "u", nullptr), -1);
}

TEST(BooleanBadInput, UnknownOperationFailsAndLeavesTheResultUntouched) {
  TaggedPointList a, b, r;
  fill_list(a, {rect(0, 0, 2, 2)});
  fill_list(b, {rect(1, 1, 3, 3)});
  r.AddDoubling(TaggedPoint(5, 6, 7));
  for (const char* op : {"x", "", "-u"}) {
    EXPECT_EQ(rg_boolean(a, b, op, &r), -1) << op;
    ASSERT_EQ(r.count(), 1);
  }
  EXPECT_EQ(rg_boolean(a, b, nullptr, &r), -1);
  EXPECT_EQ(r.count(), 1);
}

TEST(BooleanBadInput, StorageFailureAtAnyPointIsAnOrderlyFailure) {
  TaggedPointList a, b, reference;
  Contour wavy;
  for (int k = 0; k < 1500; ++k) {
    const double t = k * 2 * M_PI / 1500;
    wavy.push_back({(1 + 0.1 * std::sin(17 * t)) * std::cos(t), (1 + 0.1 * std::sin(17 * t)) * std::sin(t)});
  }
  fill_list(a, {wavy});
  fill_list(b, {rect(0, -0.5, 2, 0.5)});
  ASSERT_EQ(rg_boolean(a, b, "u", &reference), 0);
  // Each run is on a fresh thread, so its engine starts with empty pools and
  // the n-th allocation is a different one each time.
  int failures = 0;
  for (int n = 1; n <= 40; ++n) {
    int first = 0, second = 0;
    bool same = false;
    std::thread t([&] {
      TaggedPointList r;
      detail::tl_failAllocationAfter = n;
      first = rg_boolean(a, b, "u", &r);
      detail::tl_failAllocationAfter = 0;
      second = rg_boolean(a, b, "u", &r);
      same = same_list(r, reference);
    });
    t.join();
    failures += first == -1;
    EXPECT_TRUE(first == 0 || first == -1);
    EXPECT_EQ(second, 0) << n;
    EXPECT_TRUE(same) << n;
  }
  EXPECT_GT(failures, 10);
}

// A record with x below the threshold but y above it is read as a contour
// point although the bounding box ignores it, so it lands far outside the
// normalised square; its cell key must still find a bucket.
TEST(BooleanMendedFaults, PointOutsideTheSquareIndexesAValidBucket) {
  TaggedPointList a, b, r;
  a.AddDoubling(TaggedPoint(0, 0, 0));
  a.AddDoubling(TaggedPoint(0, 2, 0));
  a.AddDoubling(TaggedPoint(0, 1, 99995));
  a.AddDoubling(TaggedPoint(0, -3, 1e15));
  a.AddDoubling(TaggedPoint(0, 0, 0));
  a.AddDoubling(TaggedPoint::separator());
  b.AddDoubling(TaggedPoint(kSeparatorTag, -1e15, -1e15));  // read as a point too
  fill_list(r, {});
  add_contour(b, rect(0.5, -1, 1, 1));
  EXPECT_EQ(rg_boolean(a, b, "u", &r), 0);
  EXPECT_EQ(rg_boolean(b, a, "i", &r), 0);

  detail::VertexGrid g;
  ASSERT_EQ(detail::size_grid(g, 100), 0);
  for (std::int64_t row : {std::int64_t{-1}, std::int64_t{-1073741824}, std::int64_t{1073741824}}) {
    for (std::int64_t col : {std::int64_t{-5}, std::int64_t{0}, std::int64_t{1073741824}}) {
      const std::int32_t k = detail::grid_bucket_of(g, row, col);
      EXPECT_GE(k, 0);
      EXPECT_LT(k, g.bucketCount);
    }
  }
  EXPECT_EQ(detail::grid_cell_index(-1e300, 0, 0.001), -1073741824);
  EXPECT_EQ(detail::grid_cell_index(1e300, 0, 0.001), 1073741824);
  delete[] g.buckets;
  delete g.vertices;
}

TEST(BooleanMendedFaults, BucketCountIsTheNextPrimeAboveATenthOfThePoints) {
  EXPECT_EQ(detail::grid_bucket_count_for(0), 997);
  EXPECT_EQ(detail::grid_bucket_count_for(9970), 997);
  EXPECT_EQ(detail::grid_bucket_count_for(10000), 1009);
  EXPECT_EQ(detail::grid_bucket_count_for(100000), 10007);
}

// Sorted, constant and two-valued keys: the selection must stay linear.
TEST(BooleanMendedFaults, MedianSelectionIsLinearOnManyEqualKeys) {
  constexpr int n = 100000;
  for (int pattern = 0; pattern < 4; ++pattern) {
    std::vector<detail::EdgeBox> boxes(n);
    for (int i = 0; i < n; ++i) {
      const int key = pattern == 0 ? 7 : pattern == 1 ? i / 2 : pattern == 2 ? i % 2 : (n - i) / 3;
      boxes[i] = detail::EdgeBox{key, 0, key + 1, 1, nullptr};
    }
    const int m = (n - 1) / 2;
    const std::int64_t comparisons = detail::select_median(boxes.data(), 0, n - 1, m, true);
    EXPECT_LT(comparisons, 8LL * n) << pattern;
    for (int i = 0; i < n; ++i) {
      if (i < m) {
        EXPECT_LE(boxes[i].xmin, boxes[m].xmin);
      } else if (i > m) {
        EXPECT_GE(boxes[i].xmin, boxes[m].xmin);
      }
    }
  }
}

TEST(BooleanMendedFaults, StaircaseOf50000VerticesIsQuick) {
  // Axis-aligned staircase: every other edge shares its x (or y) key.
  Contour stairs;
  constexpr int steps = 12500;
  for (int k = 0; k < steps; ++k) {
    stairs.push_back({double(k), double(k)});
    stairs.push_back({double(k + 1), double(k)});
  }
  for (int k = steps; k > 0; --k) {
    stairs.push_back({double(k), double(k + 1)});
    stairs.push_back({double(k - 1), double(k + 1)});
  }
  ASSERT_EQ(stairs.size(), 50000u);
  TaggedPointList a, b, r;
  fill_list(a, {stairs});
  fill_list(b, {rect(-1, -1, steps / 2.0 + 0.5, steps / 2.0 + 0.5)});
  ASSERT_EQ(rg_boolean(a, b, "i", &r), 0);
  // The staircase band has area 2 per step; half the steps fall in the box,
  // less the triangle cut at the corner.
  EXPECT_GT(total_area(r), 0.0);
  TaggedPointList u;
  ASSERT_EQ(rg_boolean(a, b, "u", &u), 0);
  const double areaA = 2.0 * steps, areaB = (steps / 2.0 + 1.5) * (steps / 2.0 + 1.5);
  EXPECT_NEAR(total_area(u) + total_area(r), areaA + areaB, 1e-6);
}

}  // namespace
}  // namespace zt::test
