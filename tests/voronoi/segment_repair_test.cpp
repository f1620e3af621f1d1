// Input repair with segments: the worked examples of data/segment_repair.txt
// on a bare engine (whole computations of defective input are rows of
// data/segment_diagrams.txt).
#include <gtest/gtest.h>

#include <cfloat>
#include <cmath>
#include <vector>

#include "support/case_rows.hpp"
#include "vd_test_util.hpp"
#include "voronoi/detail/input_repair.hpp"
#include "voronoi/detail/preprocess.hpp"
#include "voronoi/detail/segment_repair.hpp"

namespace zt::test {
namespace {

// The cases of data/segment_repair.txt.
class SegmentRepair : public CaseRows {};

TEST_P(SegmentRepair, LeavesTheExpectedInput) {
  VD_Initialize();
  VD_Reset();
  const std::vector<double> xy = Nums(row().field(0));
  for (std::size_t i = 0; i + 1 < xy.size(); i += 2) API_AddPoint(xy[i], xy[i + 1], 10 + static_cast<int>(i / 2));
  for (const std::string& s : Split(row().field(1))) API_AddSegment(std::stoi(s), std::stoi(s.substr(s.find('-') + 1)), 77);
  vd::ComputeSegmentLineData();
  vd::Engine& g = vd::Vd();
  g.restartPending = false;
  for (const std::string& call : Parts(row().field(2), ';')) {
    const std::vector<std::string> w = Split(call);
    const int a = std::stoi(w.at(1)), b = w.at(2) == "=" || w.at(2) == "all" ? 0 : std::stoi(w[2]);
    bool answer = false;
    if (w[0] == "suspect") {
      g.suspect = vd::SuspectPair{true, a, vd::PNT, b, vd::SEG};
      continue;
    }
    if (w[0] == "sp") answer = vd::RepairSegmentPoint(a, b);
    if (w[0] == "ss") answer = vd::RepairSegmentSegment(a, b);
    if (w[0] == "input") answer = vd::RepairInput(a, vd::SEG, w[2] == "all");
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
      const vd::PointRecord& p = g.points[std::stoi(key.substr(key[1] == 'o' ? 5 : 4))];
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
