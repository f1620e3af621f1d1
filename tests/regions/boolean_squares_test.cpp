// The two overlapping squares, worked through exactly: areas, orientation,
// one separator, and the tag changes at the crossing points (2, 1), (1, 2).
#include <gtest/gtest.h>

#include "region_test_support.hpp"

namespace zt::test {
namespace {

TEST(TwoSquares, OneContourWithTagChangesAtTheCrossings) {
  TaggedPointList a, b;
  fill_list(a, {rect(0, 0, 2, 2, 1)});
  fill_list(b, {rect(1, 1, 3, 3, 2)});
  const struct {
    const char* op;
    double area;  // signed: the difference comes out clockwise
  } cases[] = {{"u", 7}, {"i", 1}, {"d", -3}, {"Union", 7}, {"I", 1}, {"D", -3}};
  for (const auto& c : cases) {
    SCOPED_TRACE(c.op);
    TaggedPointList r;
    ASSERT_EQ(rg_boolean(a, b, c.op, &r), 0);
    int separators = 0;
    for (const TaggedPoint& p : r) separators += is_separator(p);
    EXPECT_EQ(separators, 1);
    ASSERT_TRUE(is_separator(r[r.count() - 1]));
    const auto cs = contours_of(r);
    ASSERT_EQ(cs.size(), 1u);
    const auto& v = cs[0];
    EXPECT_DOUBLE_EQ(signed_area(v), c.area);
    // It starts and ends on one crossing, with different tags...
    EXPECT_TRUE(v.front().x == v.back().x && v.front().y == v.back().y);
    EXPECT_NE(v.front().tag, v.back().tag);
    const bool at21 = v.front().x == 2 && v.front().y == 1;
    EXPECT_TRUE(at21 || (v.front().x == 1 && v.front().y == 2));
    // ...passes the other twice in a row, once with each tag, and changes tag nowhere else.
    const double ox = at21 ? 1 : 2, oy = at21 ? 2 : 1;
    int twice = 0, changes = 0;
    for (std::size_t i = 1; i < v.size(); ++i) {
      changes += v[i].tag != v[i - 1].tag;
      if (v[i].x == ox && v[i].y == oy && v[i - 1].x == ox && v[i - 1].y == oy) {
        EXPECT_NE(v[i].tag, v[i - 1].tag);
        ++twice;
      }
    }
    EXPECT_EQ(twice, 1);
    EXPECT_EQ(changes, 1);
    if (c.area == 1) {
      for (const TaggedPoint& p : v) EXPECT_TRUE((p.x == 1 || p.x == 2) && (p.y == 1 || p.y == 2));
    }
  }
}

}  // namespace
}  // namespace zt::test
