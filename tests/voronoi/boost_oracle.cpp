// Oracle: the diagram of integer point sets against Boost.Polygon's Voronoi
// diagram. Every Boost vertex whose circle holds no corner point (so that it
// is a vertex of our diagram too) must match one of our nodes within 1e-9 of
// the extent, and every node of ours between three caller points must match
// a Boost vertex (nodes of cocircular groups may coincide).
#include <gtest/gtest.h>

#include <algorithm>
#include <boost/polygon/voronoi.hpp>
#include <cmath>
#include <random>
#include <vector>

#include "node_match.hpp"

namespace zt {
namespace {

using namespace vdtest;
using BPoint = boost::polygon::point_data<int>;

struct Outcome {
  int boostChecked = 0, oursChecked = 0, skipped = 0;
  std::string error;
};

Outcome Compare(const std::vector<BPoint>& input) {
  Outcome out;
  std::vector<Pt> pts;
  for (const BPoint& p : input) pts.push_back({double(p.x()), double(p.y())});
  Store(pts);
  if (!ComputePoints()) {
    out.error = "not computed";
    return out;
  }
  if (std::string e = FinalCheck(pts.size() < 3000); !e.empty()) {
    out.error = "checker: " + e;
    return out;
  }
  double minX = 1e300, maxX = -1e300, minY = 1e300, maxY = -1e300;
  for (const Pt& p : pts) {
    minX = std::min(minX, p.x), maxX = std::max(maxX, p.x);
    minY = std::min(minY, p.y), maxY = std::max(maxY, p.y);
  }
  const double tol = 1e-9 * std::max({maxX - minX, maxY - minY, 1.0});

  // Our nodes whose sites are all caller points.
  const OurNodes nodes = CollectNodes(
      [](const VD_EdgeInfo& info) {
        return info.ltype != 2 || info.rtype != 2 || VD_GetPointTag(info.lft) < 0 || VD_GetPointTag(info.rgt) < 0;
      },
      false);

  boost::polygon::voronoi_diagram<double> bd;
  boost::polygon::construct_voronoi(input.begin(), input.end(), &bd);
  // The circle of a vertex: through the site of one of its cells.
  const auto clearance = [&](const auto& v, XY p) {
    const BPoint& s = input[v.incident_edge()->cell()->source_index()];
    return std::hypot(p.x - s.x(), p.y - s.y());
  };
  MatchCounts counts;
  out.error = MatchBothWays(bd, clearance, nodes, tol, counts);
  out.boostChecked = counts.theirsChecked, out.oursChecked = counts.oursChecked, out.skipped = counts.skipped;
  return out;
}

TEST(BoostOracle, RandomIntegerPoints) {
  std::mt19937 rng(42);
  int checked = 0, skipped = 0;
  for (int round = 0; round < 60; ++round) {
    const int n = 3 + round * 25;
    const int range = round % 3 == 0 ? 30 : 100000;  // small ranges: duplicates and cocircular points
    std::uniform_int_distribution<int> u(-range, range);
    std::vector<BPoint> pts;
    for (int i = 0; i < n; ++i) pts.emplace_back(u(rng), u(rng));
    const Outcome o = Compare(pts);
    ASSERT_EQ(o.error, "") << "round " << round;
    checked += o.boostChecked;
    skipped += o.skipped;
  }
  EXPECT_GT(checked, 10000);
  // Vertices hidden by a corner point are rare: only far out, beyond the hull.
  EXPECT_LT(skipped, checked / 100);
}

TEST(BoostOracle, IntegerLatticeIsCocircularEverywhere) {
  std::vector<BPoint> pts;
  for (int i = 0; i < 40; ++i)
    for (int j = 0; j < 30; ++j) pts.emplace_back(7 * i, 7 * j);
  const Outcome o = Compare(pts);
  EXPECT_EQ(o.error, "");
  EXPECT_GT(o.boostChecked, 1000);
}

TEST(BoostOracle, ClusteredIntegerPoints) {
  std::mt19937 rng(5);
  std::normal_distribution<double> spread(0.0, 40.0);
  std::uniform_int_distribution<int> centre(-1000000, 1000000);
  std::vector<BPoint> pts;
  std::vector<BPoint> centres;
  for (int c = 0; c < 6; ++c) centres.emplace_back(centre(rng), centre(rng));
  for (int i = 0; i < 9000; ++i) {
    const BPoint& c = centres[i % 6];
    pts.emplace_back(c.x() + int(std::lround(spread(rng))), c.y() + int(std::lround(spread(rng))));
  }
  const Outcome o = Compare(pts);
  EXPECT_EQ(o.error, "");
  EXPECT_TRUE(vd::Vd().usedQuadtree);
  EXPECT_GT(o.oursChecked, 5000);
}

TEST(BoostOracle, CollinearIntegerPoints) {
  std::vector<BPoint> pts;
  for (int i = 0; i < 500; ++i) pts.emplace_back(3 * ((i * 37) % 500), 5 * ((i * 37) % 500) - 11);
  pts.emplace_back(0, 1);  // one point off the line gives vertices between real points
  const Outcome o = Compare(pts);
  EXPECT_EQ(o.error, "");
}

}  // namespace
}  // namespace zt
