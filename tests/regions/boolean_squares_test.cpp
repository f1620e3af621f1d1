// The two overlapping squares, worked through exactly: areas, orientation,
// separators and the tag changes at the crossing points.
#include <gtest/gtest.h>

#include "region_test_support.hpp"

namespace zt::test {
namespace {

struct SquaresCase {
  const char* op;
  double area;  // signed
};

class TwoSquares : public ::testing::TestWithParam<SquaresCase> {};

TEST_P(TwoSquares, OneContourWithTagChangesAtTheCrossings) {
  TaggedPointList a, b;
  fill_list(a, {rect(0, 0, 2, 2, 1)});
  fill_list(b, {rect(1, 1, 3, 3, 2)});
  TaggedPointList r;
  ASSERT_EQ(rg_boolean(a, b, GetParam().op, &r), 0);
  ASSERT_GT(r.count(), 0);
  EXPECT_TRUE(is_separator(r[r.count() - 1]));
  int separators = 0;
  for (const TaggedPoint& p : r) separators += is_separator(p);
  EXPECT_EQ(separators, 1);
  const auto cs = contours_of(r);
  ASSERT_EQ(cs.size(), 1u);
  const auto& c = cs[0];
  EXPECT_NEAR(signed_area(c), GetParam().area, 1e-12);

  // It starts and ends on one crossing with different tags...
  const TaggedPoint& first = c.front();
  const TaggedPoint& last = c.back();
  EXPECT_EQ(first.x, last.x);
  EXPECT_EQ(first.y, last.y);
  EXPECT_NE(first.tag, last.tag);
  const bool startsAt21 = first.x == 2 && first.y == 1;
  const bool startsAt12 = first.x == 1 && first.y == 2;
  EXPECT_TRUE(startsAt21 || startsAt12);
  // ...and passes the other one twice in a row, once with each tag.
  const double ox = startsAt21 ? 1 : 2, oy = startsAt21 ? 2 : 1;
  int twice = 0;
  for (std::size_t i = 1; i + 1 < c.size(); ++i) {
    if (c[i].x == ox && c[i].y == oy && c[i + 1].x == ox && c[i + 1].y == oy) {
      EXPECT_NE(c[i].tag, c[i + 1].tag);
      ++twice;
    }
  }
  EXPECT_EQ(twice, 1);
  // Tags change nowhere else: once inside the record sequence, once where
  // it wraps from the last record to the first.
  int changes = 0;
  for (std::size_t i = 1; i < c.size(); ++i) changes += c[i].tag != c[i - 1].tag;
  EXPECT_EQ(changes, 1);
}

INSTANTIATE_TEST_SUITE_P(Ops, TwoSquares,
                         ::testing::Values(SquaresCase{"u", 7.0}, SquaresCase{"i", 1.0},
                                           SquaresCase{"d", -3.0}, SquaresCase{"Union", 7.0},
                                           SquaresCase{"I", 1.0}, SquaresCase{"D", -3.0}));

TEST(TwoSquaresExact, IntersectionIsTheUnitSquareBetweenTheCrossings) {
  TaggedPointList a, b;
  fill_list(a, {rect(0, 0, 2, 2, 1)});
  fill_list(b, {rect(1, 1, 3, 3, 2)});
  TaggedPointList r;
  ASSERT_EQ(rg_boolean(a, b, "i", &r), 0);
  const auto c = contours_of(r).at(0);
  for (const TaggedPoint& p : c) {
    EXPECT_TRUE((p.x == 1 || p.x == 2) && (p.y == 1 || p.y == 2)) << p.x << " " << p.y;
  }
}

}  // namespace
}  // namespace zt::test
