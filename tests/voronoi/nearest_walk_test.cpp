// The walk through a finished diagram of points against brute force: from
// any site, for queries at random, at midpoints of two points (ties on
// lattices and blocks) and on points (coincident), it ends at the least
// squared distance over the diagram's sites, compared exactly.
#include <gtest/gtest.h>

#include <random>
#include <string>

#include "vd_test_util.hpp"
#include "voronoi/detail/nearest_walk.hpp"

namespace zt::test {
namespace {

const NamedList kInputs[] = {
    {"Uniform", "uniform 3000 7 1000"},
    {"Clustered", "clustered 3000 3"},
    {"HalfClustered", "uniform 1500 4 1000; uniform 1500 5 1"},
    {"LatticeCocircular", "lattice 40 1"},
    {"BlocksWithTies", "blocks 3000 9 40"},
    {"Collinear", "collinear 500 3"},
};

class NearestWalk : public ::testing::TestWithParam<NamedList> {};

TEST_P(NearestWalk, EndsAtTheNearestSiteFromAnyStart) {
  Store(Generate(GetParam().list));
  ASSERT_TRUE(ComputePoints());
  vd::Engine& g = vd::Vd();
  std::vector<std::int32_t> sites;
  double x0 = 1e300, x1 = -1e300, y0 = 1e300, y1 = -1e300;
  for (std::int32_t i = 0; i < g.points.count; ++i) {
    const vd::PointRecord& p = g.points[i];
    if (p.vd < 0 || p.deleted) continue;
    sites.push_back(i);
    if (i >= 2 && i < g.points.count - 2)
      x0 = std::min(x0, p.x), x1 = std::max(x1, p.x), y0 = std::min(y0, p.y), y1 = std::max(y1, p.y);
  }
  std::mt19937 rng(17);
  std::uniform_int_distribution<std::size_t> pick(0, sites.size() - 1);
  std::uniform_real_distribution<double> ux(x0, x1), uy(y0, y1);
  int coincident = 0;
  for (int k = 0; k < 600; ++k) {
    const vd::PointRecord& a = g.points[sites[pick(rng)]];
    const vd::PointRecord& b = g.points[sites[pick(rng)]];
    vd::PointRecord q{};
    q.vd = q.node = q.arc = q.tag = vd::kNone;
    if (k % 3 == 0) q.x = ux(rng), q.y = uy(rng);
    else if (k % 3 == 1) q.x = 0.5 * (a.x + b.x), q.y = 0.5 * (a.y + b.y);
    else q.x = a.x, q.y = a.y;
    // The query is a record past every site, outside the diagram.
    const std::int32_t p = g.points.Append(q, vd::kSiteGrowth);
    const vd::Nearest walked = vd::WalkToNearest(sites[pick(rng)], p);
    const vd::Nearest scanned = vd::ScanNearest(p);
    --g.points.count;
    ASSERT_GE(walked.point, 0) << k;
    EXPECT_EQ(walked.dist2, scanned.dist2) << "query " << k << " at " << q.x << ", " << q.y;
    coincident += walked.dist2 <= vd::kCoincidentDist2;
  }
  EXPECT_GE(coincident, 200);
}

INSTANTIATE_TEST_SUITE_P(Inputs, NearestWalk, ::testing::ValuesIn(kInputs),
                         NamedListName);

}  // namespace
}  // namespace zt::test
