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

// Every refusal before the classification leaves the result untouched.
TEST(BooleanBadInput, RefusedOperandsAndOperations) {
  TaggedPointList square, other, r;
  fill_list(square, {rect(0, 0, 1, 1)});
  fill_list(other, {rect(0.5, 0.5, 2, 2)});
  r.AddDoubling(TaggedPoint(42, 1, 2));
  auto refused = [&](const TaggedPointList& a, const TaggedPointList& b, const char* op) {
    EXPECT_EQ(rg_boolean(a, b, op, &r), -1);
    return r.count() == 1 && r[0].tag == 42;
  };
  // Coordinates that are not finite or beyond 1e15 in magnitude, in either operand.
  const double inf = std::numeric_limits<double>::infinity();
  for (double v : {std::numeric_limits<double>::quiet_NaN(), inf, -inf, 1.5e15, -2e15}) {
    for (int which = 0; which < 4; ++which) {
      TaggedPointList a;
      fill_list(a, {rect(0, 0, 2, 2)});
      (which % 2 ? a[1 + which / 2].y : a[1 + which / 2].x) = v;
      EXPECT_TRUE(refused(a, square, "u")) << v;
      EXPECT_TRUE(refused(square, a, "i")) << v;
    }
  }
  // Empty operands, only separators (one tagged so, read as a lone point),
  // all points on one vertex.
  TaggedPointList empty, separators, onePoint;
  separators.AddDoubling(TaggedPoint::separator());
  separators.AddDoubling(TaggedPoint(kSeparatorTag, 5, 5));
  add_contour(onePoint, {{0.5, 0.5}, {0.5, 0.5 + 1e-16}});
  for (const TaggedPointList* bad : {&empty, &separators, &onePoint}) {
    EXPECT_TRUE(refused(*bad, square, "u"));
    EXPECT_TRUE(refused(square, *bad, "d"));
  }
  EXPECT_TRUE(refused(separators, separators, "u"));
  // Unknown operations (refused after the overlay, before the result is cleared).
  for (const char* op : {"x", "", "-u", static_cast<const char*>(nullptr)}) EXPECT_TRUE(refused(square, other, op));
  EXPECT_EQ(rg_boolean(square, other, "u", nullptr), -1);
  // At the limit the input is accepted (above 99990 a record is a separator,
  // so large coordinates are negative).
  TaggedPointList big, inner;
  fill_list(big, {rect(-1e15, -1e15, 0, 0)});
  fill_list(inner, {rect(-5e14, -5e14, -1e14, -1e14)});
  EXPECT_EQ(rg_boolean(big, inner, "i", &r), 0);
  EXPECT_DOUBLE_EQ(total_area(r), 1.6e29);
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
  add_contour(b, rect(0.5, -1, 1, 1));
  EXPECT_EQ(rg_boolean(a, b, "u", &r), 0);
  EXPECT_EQ(rg_boolean(b, a, "i", &r), 0);
}

// Sorted, constant and two-valued keys: the selection must stay linear.
TEST(BooleanMendedFaults, MedianSelectionIsLinearOnManyEqualKeys) {
  constexpr int n = 100000;
  for (int pattern = 0; pattern < 4; ++pattern) {
    std::vector<detail::EdgeBox> boxes(n);
    for (int i = 0; i < n; ++i) {
      const int key = pattern == 0 ? 7 : pattern == 1 ? i / 2 : pattern == 2 ? i % 2 : (n - i) / 3;
      boxes[i] = detail::EdgeBox{double(key), 0, double(key + 1), 1, nullptr};
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
