// Cleaning and repair of the input: sorting, duplicate points, degenerate
// and duplicate segments with their ends following their points; the
// cross-reference of segment ends; segment line data; and the worked repair
// examples of data/segment_repair.txt on a bare engine (whole computations
// of defective input are rows of data/segment_diagrams.txt).
#include <gtest/gtest.h>

#include <cfloat>
#include <cmath>

#include "vd_test_util.hpp"
#include "voronoi/detail/preprocess.hpp"
#include "voronoi/detail/segment_repair.hpp"

namespace zt::test {
namespace {

using namespace vd;

// Stores points and segments as a caller would, with dummy slots in place.
void StoreSites(const std::vector<Pt>& pts, const std::vector<std::pair<int, int>>& segs) {
  Store(pts);
  for (auto [a, b] : segs) ASSERT_GE(API_AddSegment(a + 2, b + 2, 100 + a), 0);
  AddDummySlots();
}

// The coordinates at both ends of every segment, in segment order.
std::vector<double> SegmentEnds() {
  const Engine& g = Vd();
  std::vector<double> v;
  for (std::int32_t s = 0; s < g.segments.count; ++s) {
    const PointRecord& a = g.points[g.segments[s].i1];
    const PointRecord& b = g.points[g.segments[s].i2];
    v.insert(v.end(), {a.x, a.y, b.x, b.y});
  }
  return v;
}

TEST(Cleaning, SortRemovesDuplicatesAndSegmentEndsFollowTheirPoints) {
  // A closed square that repeats its first point, stored unsorted.
  StoreSites({{1, 1}, {0, 1}, {0, 0}, {1, 0}, {1, 1}, {0.5, 0.5}},
             {{0, 1}, {1, 2}, {2, 3}, {3, 4}});
  const std::vector<double> before = SegmentEnds();
  CleanInput(false);
  const Engine& g = Vd();
  EXPECT_EQ(g.points.count, 2 + 5 + 2);
  EXPECT_EQ(g.duplicatePoints, 1);
  EXPECT_EQ(SegmentEnds(), before);
  for (std::int32_t i = 1; i < g.points.count; ++i)
    EXPECT_TRUE(g.points[i - 1].x < g.points[i].x ||
                (g.points[i - 1].x == g.points[i].x && g.points[i - 1].y < g.points[i].y));
  EXPECT_EQ(g.points[0].x, -DBL_MAX);
  EXPECT_EQ(g.points[g.points.count - 1].y, DBL_MAX);
  // The segment closing the square ends where the first one starts.
  EXPECT_EQ(g.segments[3].i2, g.segments[0].i1);
}

TEST(Cleaning, DegenerateAndDuplicateSegmentsGo) {
  StoreSites({{0, 0}, {1, 0}, {1, 0}, {2, 5}}, {{0, 1}, {1, 2}, {1, 0}, {2, 3}, {0, 1}});
  CleanInput(true);
  const Engine& g = Vd();
  // (1,2) joins two copies of one point; (1,0) and the second (0,1) repeat (0,1).
  EXPECT_EQ(g.segments.count, 2);
  EXPECT_EQ(g.removedSegments, 3);
  for (std::int32_t s = 0; s < g.segments.count; ++s) EXPECT_NE(g.segments[s].i1, g.segments[s].i2);
  // Without the segment sorting only the degenerate one goes.
  StoreSites({{0, 0}, {1, 0}, {1, 0}, {2, 5}}, {{0, 1}, {1, 2}, {1, 0}, {2, 3}, {0, 1}});
  CleanInput(false);
  EXPECT_EQ(Vd().segments.count, 4);
}

TEST(Cleaning, CrossReferenceRedirectsEveryEndOfAPoint) {
  StoreSites({{0, 0}, {1, 0}, {2, 0}, {1, 0}}, {{0, 1}, {1, 2}, {3, 0}, {2, 3}});
  BuildCrossReference();
  RedirectSegmentEnds(5, 3);  // engine index of the fourth point onto the second
  const Engine& g = Vd();
  EXPECT_EQ(g.segments[2].i1, 3);
  EXPECT_EQ(g.segments[3].i2, 3);
  EXPECT_EQ(g.segments[0].i2, 3);
  // The list stays valid in place: redirecting the second point on to the
  // first moves the ends that came from the fourth too.
  EXPECT_TRUE(g.xrefBuilt);
  RedirectSegmentEnds(3, 2);
  EXPECT_EQ(g.segments[2].i1, 2);
  EXPECT_EQ(g.segments[3].i2, 2);
  EXPECT_EQ(g.segments[1].i1, 2);
}

TEST(Cleaning, SegmentLineDataHasTheUnitNormalToTheLeft) {
  StoreSites({{1, 1}, {4, 5}, {2, 2}, {2, 2 + 1e-12}}, {{0, 1}, {2, 3}});
  Engine& g = Vd();
  g.restartPending = false;
  ComputeSegmentLineData();
  const SegmentRecord& s = g.segments[0];
  EXPECT_DOUBLE_EQ(s.length, 5.0);
  EXPECT_DOUBLE_EQ(s.a, -0.8);
  EXPECT_DOUBLE_EQ(s.b, 0.6);
  EXPECT_NEAR(s.a * 1 + s.b * 1 + s.c, 0.0, 1e-15);
  EXPECT_GT(s.a * 0 + s.b * 10 + s.c, 0.0);  // (0, 10) lies on the left
  // A segment shorter than the zero length: its ends merge at once into
  // their midpoint, the segment goes, and a restart drops the merged point.
  EXPECT_TRUE(g.restartPending);
  EXPECT_EQ(g.segments.count, 1);
  EXPECT_TRUE(g.points[5].deleted);
  EXPECT_DOUBLE_EQ(g.points[4].y, 2 + 0.5e-12);
}

// The cases of data/segment_repair.txt.
class SegmentRepair : public CaseRows {};

TEST_P(SegmentRepair, LeavesTheExpectedInput) {
  VD_Initialize();
  VD_Reset();
  const std::vector<double> xy = Nums(row().field(0));
  for (std::size_t i = 0; i + 1 < xy.size(); i += 2) API_AddPoint(xy[i], xy[i + 1], 10 + static_cast<int>(i / 2));
  for (const std::string& s : Split(row().field(1))) API_AddSegment(std::stoi(s), std::stoi(s.substr(s.find('-') + 1)), 77);
  ComputeSegmentLineData();
  Engine& g = Vd();
  g.restartPending = false;
  for (const std::string& call : Parts(row().field(2), ';')) {
    const std::vector<std::string> w = Split(call);
    const int a = std::stoi(w.at(1)), b = w.at(2) == "=" || w.at(2) == "all" ? 0 : std::stoi(w[2]);
    bool answer = false;
    if (w[0] == "suspect") {
      g.suspect = SuspectPair{true, a, PNT, b, SEG};
      continue;
    }
    if (w[0] == "sp") answer = RepairSegmentPoint(a, b);
    if (w[0] == "ss") answer = RepairSegmentSegment(a, b);
    if (w[0] == "input") answer = RepairInput(a, SEG, w[2] == "all");
    if (w[0] == "point") answer = RepairInput(a, PNT, false);
    EXPECT_EQ(answer, w.back() == "1") << call;
  }
  const Keys want(row().field(3));
  if (want.has("segs")) {
    const std::vector<std::string> ends = List(want.str("segs"));
    ASSERT_EQ(g.segments.count, static_cast<std::int32_t>(ends.size()));
    for (std::int32_t s = 0; s < g.segments.count; ++s) {
      const std::string e = ends[s], i1 = e.substr(0, e.find('-')), i2 = e.substr(e.find('-') + 1);
      EXPECT_TRUE(i1 == "*" || g.segments[s].i1 == std::stoi(i1)) << "segment " << s;
      EXPECT_TRUE(i2 == "*" || g.segments[s].i2 == std::stoi(i2)) << "segment " << s;
      EXPECT_TRUE(!want.has("tags") || g.segments[s].tag == want.num("tags")) << "segment " << s;
    }
  }
  EXPECT_TRUE(!want.has("restart") || g.restartPending == (want.num("restart") != 0));
  EXPECT_TRUE(!want.has("count") || g.points.count == want.num("count"));
  EXPECT_TRUE(!want.has("inexact") || g.lineDataInexact);
  EXPECT_TRUE(!want.has("suspect") || !g.suspect.set);
  for (const auto& [key, value] : want.kv) {
    if (key.rfind("point", 0) == 0 || key.rfind("ptag", 0) == 0) {
      const PointRecord& p = g.points[std::stoi(key.substr(key[1] == 'o' ? 5 : 4))];
      const std::vector<double> v = Nums(value);
      const auto near = [&](double a, double b) { return std::fabs(a - b) <= want.num("tol", 4 * DBL_EPSILON * std::fabs(b)); };
      EXPECT_TRUE(key[1] == 't' ? p.tag == v.at(0) : near(p.x, v.at(0)) && near(p.y, v.at(1))) << key;
    }
  }
  if (want.has("same")) {
    const std::vector<double> v = Nums(want.str("same"));
    EXPECT_EQ(g.points[int(v.at(0))].x, g.points[int(v.at(1))].x);
    EXPECT_EQ(g.points[int(v.at(0))].y, g.points[int(v.at(1))].y);
  }
}

INSTANTIATE_TEST_SUITE_P(Data, SegmentRepair, RowsOf("segment_repair.txt"), RowName);

}  // namespace
}  // namespace zt::test
