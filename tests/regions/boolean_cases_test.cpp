// Behaviour of rg_boolean on the small cases that pin the classification:
// identical operands, touching at one vertex, nesting, closing duplicates,
// open polylines, results written over an operand, engine reuse and threads.
#include <gtest/gtest.h>

#include <thread>

#include "region_test_support.hpp"

namespace zt::test {
namespace {

double area_of(const TaggedPointList& a, const TaggedPointList& b, const char* op) {
  TaggedPointList r;
  EXPECT_EQ(rg_boolean(a, b, op, &r), 0) << op;
  return total_area(r);
}

TEST(BooleanCases, IdenticalOperandsKeepOneCopyForUnionAndIntersectionAndNothingForDifference) {
  TaggedPointList a, b;
  const Contour shape{{0, 0, 1}, {4, 0, 1}, {4, 3, 1}, {2, 5, 1}, {0, 3, 1}};
  fill_list(a, {shape});
  fill_list(b, {shape});
  for (const char* op : {"u", "i"}) {
    TaggedPointList r;
    ASSERT_EQ(rg_boolean(a, b, op, &r), 0);
    const auto cs = contours_of(r);
    ASSERT_EQ(cs.size(), 1u) << op;
    EXPECT_DOUBLE_EQ(signed_area(cs[0]), 16.0) << op;
  }
  TaggedPointList d;
  d.AddDoubling(TaggedPoint(7, 1, 1));
  ASSERT_EQ(rg_boolean(a, b, "d", &d), 0);
  EXPECT_EQ(d.count(), 0);
}

TEST(BooleanCases, OperandsTouchingAtOneVertex) {
  TaggedPointList a, b;
  fill_list(a, {rect(0, 0, 1, 1, 1)});
  fill_list(b, {rect(1, 1, 2, 2, 2)});
  TaggedPointList u, i, d;
  ASSERT_EQ(rg_boolean(a, b, "u", &u), 0);
  EXPECT_DOUBLE_EQ(total_area(u), 2.0);
  ASSERT_EQ(rg_boolean(a, b, "i", &i), 0);
  EXPECT_DOUBLE_EQ(total_area(i), 0.0);
  ASSERT_EQ(rg_boolean(a, b, "d", &d), 0);
  EXPECT_DOUBLE_EQ(std::fabs(total_area(d)), 1.0);
  // No edge is cut in its interior: every result point is an input corner.
  for (const TaggedPointList* r : {&u, &d}) {
    for (const TaggedPoint& p : *r) {
      if (!is_separator(p)) {
        EXPECT_TRUE(p.x == std::floor(p.x) && p.y == std::floor(p.y));
      }
    }
  }
}

TEST(BooleanCases, NestedOperandIsDecidedByTheRayTest) {
  TaggedPointList outer, inner;
  fill_list(outer, {rect(0, 0, 10, 10, 1)});
  fill_list(inner, {{{2, 2, 5}, {3, 2, 6}, {3, 3, 7}, {2, 3, 8}}});
  TaggedPointList r;
  ASSERT_EQ(rg_boolean(outer, inner, "i", &r), 0);
  // The inner contour comes back whole with its own tags, closed by its first point.
  ASSERT_EQ(r.count(), 7);
  const int tags[] = {5, 6, 7, 8, 8, 5};
  const double xs[] = {2, 3, 3, 2, 2, 2}, ys[] = {2, 2, 3, 3, 2, 2};
  for (int k = 0; k < 6; ++k) {
    EXPECT_EQ(r[k].tag, tags[k]) << k;
    EXPECT_EQ(r[k].x, xs[k]) << k;
    EXPECT_EQ(r[k].y, ys[k]) << k;
  }
  EXPECT_TRUE(is_separator(r[6]));
  EXPECT_DOUBLE_EQ(area_of(outer, inner, "u"), 100.0);
  EXPECT_DOUBLE_EQ(area_of(inner, outer, "i"), 1.0);
  EXPECT_EQ(contours_of(r).size(), 1u);
  TaggedPointList d;
  ASSERT_EQ(rg_boolean(outer, inner, "d", &d), 0);
  EXPECT_EQ(contours_of(d).size(), 2u);
}

TEST(BooleanCases, HorizontalEdgeOnTheRayCountsNoCrossing) {
  // The ray from the inner square's first point (1, 1) runs along the edge
  // (4, 1)-(6, 1) of the outer contour; only the edge at x = 4 counts.
  TaggedPointList outer, inner;
  fill_list(outer, {{{0, 0}, {4, 0}, {4, 1}, {6, 1}, {6, 3}, {0, 3}}});
  fill_list(inner, {rect(1, 1, 2, 2)});
  EXPECT_DOUBLE_EQ(area_of(outer, inner, "i"), 1.0);
  EXPECT_DOUBLE_EQ(area_of(outer, inner, "u"), 16.0);
}

TEST(BooleanCases, ResultWrittenOverAnOperand) {
  TaggedPointList a, b, expected;
  fill_list(a, {rect(0, 0, 2, 2, 1)});
  fill_list(b, {rect(1, 1, 3, 3, 2)});
  ASSERT_EQ(rg_boolean(a, b, "i", &expected), 0);
  ASSERT_EQ(rg_boolean(a, b, "i", &a), 0);
  EXPECT_TRUE(same_list(a, expected));

  fill_list(a, {rect(0, 0, 2, 2, 1)});
  ASSERT_EQ(rg_boolean(a, b, "u", &expected), 0);
  ASSERT_EQ(rg_boolean(a, b, "u", &b), 0);
  EXPECT_TRUE(same_list(b, expected));
}

TEST(BooleanCases, ClosingDuplicatesWithinTheTolerance) {
  TaggedPointList far;
  fill_list(far, {rect(100, 100, 101, 101)});
  // The last point repeats the first within 2^-47 (several times): closed.
  TaggedPointList a;
  for (const Pt& p : rect(0, 0, 1, 1, 3)) a.AddDoubling(TaggedPoint(p.tag, p.x, p.y));
  a.AddDoubling(TaggedPoint(3, 1e-15, 0));
  a.AddDoubling(TaggedPoint(3, 0, -2e-15));
  a.AddDoubling(TaggedPoint::separator());
  TaggedPointList r;
  ASSERT_EQ(rg_boolean(a, far, "u", &r), 0);
  auto cs = contours_of(r);
  ASSERT_EQ(cs.size(), 2u);
  ASSERT_EQ(cs[0].size(), 5u);
  EXPECT_EQ(cs[0].back().x, 0.0);
  EXPECT_EQ(cs[0].back().y, 0.0);
  EXPECT_DOUBLE_EQ(signed_area(cs[0]), 1.0);

  // Beyond the tolerance it stays an open polyline: no closing point.
  a.Clear();
  for (const Pt& p : rect(0, 0, 1, 1, 3)) a.AddDoubling(TaggedPoint(p.tag, p.x, p.y));
  a.AddDoubling(TaggedPoint(3, 1e-12, 0));
  a.AddDoubling(TaggedPoint::separator());
  ASSERT_EQ(rg_boolean(a, far, "u", &r), 0);
  cs = contours_of(r);
  ASSERT_EQ(cs.size(), 2u);
  EXPECT_EQ(cs[0].size(), 5u);
  EXPECT_NEAR(cs[0].back().x, 1e-12, 0x1p-46);
}

TEST(BooleanCases, WholeContourWithDifferentEndTagsClosesTwice) {
  TaggedPointList a, far, r;
  fill_list(a, {{{0, 0, 1}, {1, 0, 2}, {1, 1, 3}, {0, 1, 4}}});
  a[4].tag = 4;  // the repeated first point carries the last tag
  fill_list(far, {rect(5, 5, 6, 6)});
  ASSERT_EQ(rg_boolean(a, far, "u", &r), 0);
  const auto c = contours_of(r).at(0);
  ASSERT_EQ(c.size(), 6u);
  EXPECT_EQ(c[4].tag, 4);
  EXPECT_EQ(c[5].tag, 1);
  EXPECT_EQ(c[4].x, 0.0);
  EXPECT_EQ(c[5].x, 0.0);
}

TEST(BooleanCases, OpenPolylinePiecesAreClassified) {
  TaggedPointList line, square, r;
  fill_list(square, {rect(0, 0, 2, 2)});
  add_contour(line, {{-1, 1, 9}, {3, 1, 9}}, false);
  ASSERT_EQ(rg_boolean(line, square, "i", &r), 0);
  auto cs = contours_of(r);
  // The polyline's piece inside the square comes first, along its own direction.
  ASSERT_EQ(cs.size(), 1u);
  ASSERT_GE(cs[0].size(), 2u);
  EXPECT_EQ(cs[0][0].x, 0.0);
  EXPECT_EQ(cs[0][1].x, 2.0);
  EXPECT_EQ(cs[0][0].tag, 9);
  EXPECT_EQ(cs[0][1].tag, 9);
}

TEST(BooleanCases, DroppedOpenPolylineWithoutCrossingsIsNotAFailure) {
  // Regression: an open polyline that meets the other operand nowhere and is
  // not kept has no pieces; it must be skipped, not fail the emission.
  TaggedPointList line, square, r;
  fill_list(square, {rect(0, 0, 2, 2)});
  add_contour(line, {{5, 5}, {6, 6}, {7, 5}}, false);
  ASSERT_EQ(rg_boolean(line, square, "i", &r), 0);
  EXPECT_EQ(r.count(), 0);
  ASSERT_EQ(rg_boolean(line, square, "u", &r), 0);
  EXPECT_EQ(contours_of(r).size(), 2u);
}

// B's long edge runs from beyond A's corner (2, 0), along A's bottom edge
// within the tolerance, to beyond (0, 0): the pair test asks for the roles to
// be exchanged, and A's corners become splits of B's edge.
TEST(BooleanCases, NearlyCollinearOverlapThroughTheRetry) {
  TaggedPointList a, b;
  fill_list(a, {rect(0, 0, 2, 2, 1)});
  const double d = 18 * 0x1p-48;  // just above the tolerance once normalised
  fill_list(b, {{{3, 0, 2}, {-1, d, 2}, {1, -2, 2}}});
  TaggedPointList u, i, diff;
  ASSERT_EQ(rg_boolean(a, b, "u", &u), 0);
  ASSERT_EQ(rg_boolean(a, b, "i", &i), 0);
  ASSERT_EQ(rg_boolean(a, b, "d", &diff), 0);
  EXPECT_NEAR(total_area(u), 8.0, 1e-12);
  EXPECT_EQ(i.count(), 0);
  EXPECT_NEAR(std::fabs(total_area(diff)), 4.0, 1e-12);
  ASSERT_EQ(contours_of(u).size(), 1u);
}

TEST(BooleanCases, DisjointIntersectionIsEmpty) {
  TaggedPointList a, b, r;
  fill_list(a, {rect(0, 0, 1, 1)});
  fill_list(b, {rect(3, 0, 4, 1)});
  r.AddDoubling(TaggedPoint(1, 2, 3));
  ASSERT_EQ(rg_boolean(a, b, "i", &r), 0);
  EXPECT_EQ(r.count(), 0);
}

TEST(BooleanCases, EngineReuseAcrossSizesAndThreadsGivesTheSameOutput) {
  TaggedPointList a, b, big, first, again;
  fill_list(a, {rect(0, 0, 2, 2, 1)});
  fill_list(b, {rect(1, 1, 3, 3, 2)});
  ASSERT_EQ(rg_boolean(a, b, "u", &first), 0);
  // A large operation in between grows every pool.
  Contour ring;
  for (int k = 0; k < 5000; ++k) ring.push_back({std::cos(k * 0.00125664), std::sin(k * 0.00125664)});
  fill_list(big, {ring});
  TaggedPointList tmp;
  ASSERT_EQ(rg_boolean(big, a, "u", &tmp), 0);
  ASSERT_EQ(rg_boolean(a, b, "u", &again), 0);
  EXPECT_TRUE(same_list(first, again));

  bool same[2] = {false, false};
  std::thread t1([&] {
    TaggedPointList r;
    same[0] = rg_boolean(a, b, "u", &r) == 0 && same_list(r, first);
  });
  std::thread t2([&] {
    TaggedPointList r;
    same[1] = rg_boolean(a, b, "u", &r) == 0 && same_list(r, first);
  });
  t1.join();
  t2.join();
  EXPECT_TRUE(same[0]);
  EXPECT_TRUE(same[1]);
}

}  // namespace
}  // namespace zt::test
