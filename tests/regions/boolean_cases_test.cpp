// Behaviour of rg_boolean on the small cases that pin the classification:
// the rows of data/boolean.txt (two overlapping squares worked through
// exactly, identical operands, touching at one vertex, nesting and the ray
// test, open polylines, the retry with exchanged roles), closing duplicates,
// results written over an operand, engine reuse and threads.
#include <gtest/gtest.h>

#include <algorithm>
#include <sstream>
#include <thread>

#include "region_test_support.hpp"
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

}  // namespace
}  // namespace zt::test
