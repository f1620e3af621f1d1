// rg_boolean's behaviour. The small cases that pin the classification: the
// rows of data/boolean.txt (two overlapping squares worked through exactly,
// identical operands, touching at one vertex, nesting and the ray test, open
// polylines, the retry with exchanged roles), closing duplicates, results
// written over an operand, engine reuse and threads. Bad input and the
// mended faults: refused coordinates, empty operands, unknown operations,
// storage failure, points outside the normalised square, the median
// selection on many equal keys; and the work of one operation, which must
// grow like n log n whatever the shape of the input.
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <limits>
#include <sstream>
#include <thread>
#include <vector>

#include "region_test_support.hpp"
#include "regions/detail/engine.hpp"
#include "support/case_rows.hpp"

namespace zt::test {
namespace {

// Records "x,y[,tag]" (tag 0 when left out; S: a separator) separated by
// blanks or `sep`.
std::vector<TaggedPoint> records(std::string text, char sep = ' ') {
  std::replace(text.begin(), text.end(), sep, ' ');
  std::vector<TaggedPoint> out;
  for (const std::string& w : Split(text)) {
    const std::vector<double> v = Nums(w);
    out.push_back(w == "S" ? TaggedPoint::separator()
                           : TaggedPoint(v.size() > 2 ? static_cast<std::int32_t>(v[2]) : 0, v.at(0), v.at(1)));
  }
  return out;
}

// Contours separated by ';', each closed unless its last word is "open".
void operand(const std::string& field, TaggedPointList& l) {
  for (const std::string& c : Parts(field, ';')) {
    const bool open = Split(c).back() == "open";
    std::vector<TaggedPoint> points = records(open ? c.substr(0, c.rfind("open")) : c);
    if (!open) points.push_back(points.front());
    for (const TaggedPoint& p : points) l.AddDoubling(p);
    l.AddDoubling(TaggedPoint::separator());
  }
}

class BooleanRows : public CaseRows {};

TEST_P(BooleanRows, ResultAsListed) {
  TaggedPointList a, b, r;
  operand(row().field(0), a);
  operand(row().field(1), b);
  r.AddDoubling(TaggedPoint(7, 1, 1));
  ASSERT_EQ(rg_boolean(a, b, row().field(2).c_str(), &r), 0);
  for (const auto& [key, value] : Keys(row().field(3)).kv) {
    SCOPED_TRACE(key);
    const auto tilde = value.find('~');
    const double want = Num(value.substr(0, tilde));
    const double tol = tilde == std::string::npos ? 0 : Num(value.substr(tilde + 1));
    if (key == "area" || key == "|area|" || key == "evenodd") {
      const double got = key == "area"     ? total_area(r)
                         : key == "|area|" ? std::fabs(total_area(r))
                                           : slab_area(region_of(r), {}, 'u');
      if (tol > 0) {
        EXPECT_NEAR(got, want, tol);
      } else {
        EXPECT_DOUBLE_EQ(got, want);
      }
    } else if (key == "ccw") {
      for (const auto& c : contours_of(r)) EXPECT_GT(signed_area(c), 0.0);
    } else if (key == "contours") {
      EXPECT_EQ(contours_of(r).size(), static_cast<std::size_t>(want));
    } else if (key == "records") {
      EXPECT_EQ(r.count(), static_cast<int>(want));
    } else if (key == "tags" || key == "integral") {
      for (const TaggedPoint& p : r) {
        if (key == "tags") EXPECT_TRUE(p.tag == want || is_separator(p));
        else EXPECT_TRUE(p.x == std::floor(p.x) && p.y == std::floor(p.y));
      }
    } else {
      ASSERT_EQ(key, "starts");
      const std::vector<TaggedPoint> e = records(value, ';');
      ASSERT_GE(r.count(), static_cast<int>(e.size()));
      for (std::size_t k = 0; k < e.size(); ++k)
        EXPECT_TRUE(r[k].tag == e[k].tag && r[k].x == e[k].x && r[k].y == e[k].y) << k;
    }
  }
}

INSTANTIATE_TEST_SUITE_P(Rows, BooleanRows, RowsOf("boolean.txt"), RowName);

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
  TaggedPointList far, a, r;
  fill_list(far, {rect(100, 100, 101, 101)});
  // Two trailing repetitions of the first point within 2^-47: closed.
  add_contour(a, {{0, 0}, {1, 0}, {1, 1}, {0, 1}, {1e-15, 0}, {0, -2e-15}}, false);
  ASSERT_EQ(rg_boolean(a, far, "u", &r), 0);
  auto c = contours_of(r).at(0);
  ASSERT_EQ(c.size(), 5u);
  EXPECT_TRUE(c.back().x == 0 && c.back().y == 0);
  EXPECT_DOUBLE_EQ(signed_area(c), 1.0);
  // Beyond it the contour stays an open polyline: no closing point.
  a.Clear();
  add_contour(a, {{0, 0}, {1, 0}, {1, 1}, {0, 1}, {1e-12, 0}}, false);
  ASSERT_EQ(rg_boolean(a, far, "u", &r), 0);
  c = contours_of(r).at(0);
  ASSERT_EQ(c.size(), 5u);
  EXPECT_NEAR(c.back().x, 1e-12, 0x1p-46);
}

TEST(BooleanCases, EngineReuseAcrossSizesAndThreadsGivesTheSameOutput) {
  TaggedPointList a, b, big, first, again, tmp;
  fill_list(a, {rect(0, 0, 2, 2, 1)});
  fill_list(b, {rect(1, 1, 3, 3, 2)});
  ASSERT_EQ(rg_boolean(a, b, "u", &first), 0);
  Contour ring;  // a large operation in between grows every pool
  for (int k = 0; k < 5000; ++k) ring.push_back({std::cos(k * 0.00125664), std::sin(k * 0.00125664)});
  fill_list(big, {ring});
  ASSERT_EQ(rg_boolean(big, a, "u", &tmp), 0);
  ASSERT_EQ(rg_boolean(a, b, "u", &again), 0);
  EXPECT_TRUE(same_list(first, again));
  bool same[2] = {false, false};
  auto work = [&](int k) {
    TaggedPointList r;
    same[k] = rg_boolean(a, b, "u", &r) == 0 && same_list(r, first);
  };
  std::thread t1(work, 0), t2(work, 1);
  t1.join();
  t2.join();
  EXPECT_TRUE(same[0] && same[1]);
}

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
    for (int i = 0; i < n; ++i)
      EXPECT_TRUE(i < m ? boxes[i].xmin <= boxes[m].xmin : boxes[i].xmin >= boxes[m].xmin) << pattern << " " << i;
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

// Work, counted as box pairs compared at the box trees' leaf pairs and
// vertices walked by the vertex grid's lookups, of a wavy n-vertex circle
// against a copy of itself plus a unit square `distance` away towards -x:
// the square rules the joint box and puts the circles in one 1/1000 cell.
std::int64_t far_apart_work(int n, double distance) {
  Contour wavy;
  for (int k = 0; k < n; ++k) {
    const double t = 2 * M_PI * k / n, r = 1 + 0.01 * std::sin(50 * t);
    wavy.push_back({r * std::cos(t), r * std::sin(t)});
  }
  TaggedPointList a, b, r;
  fill_list(a, {wavy});
  fill_list(b, {wavy, rect(-distance - 1, 0, -distance, 1)});
  EXPECT_EQ(rg_boolean(a, b, "i", &r), 0);
  const detail::BooleanEngine* e = detail::last_thread_engine();
  return e->leafPairTests + detail::grid_visit_count(e->grid);
}

class BooleanScaling : public ::testing::TestWithParam<double> {};

TEST_P(BooleanScaling, FarApartWorkGrowsLikeNLogN) {
  constexpr int kSmall = 2000, kLarge = 32000;
  const double small = static_cast<double>(far_apart_work(kSmall, GetParam()));
  const double large = static_cast<double>(far_apart_work(kLarge, GetParam()));
  const double nLogN = (kLarge * std::log2(kLarge)) / (kSmall * std::log2(kSmall));
  // Slack for the trees' and the grid's constant factors; quadratic work
  // would be 256 times the small case, this bound is about 27.
  constexpr double kSlack = 1.25;
  EXPECT_LT(large / small, kSlack * nLogN) << small << " then " << large;
}

INSTANTIATE_TEST_SUITE_P(Distances, BooleanScaling, ::testing::Values(1e2, 1e5, 1e9));

}  // namespace
}  // namespace zt::test
