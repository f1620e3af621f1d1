// The nearest-point search against brute force: after every lookup the
// answer is at the least squared distance over the points entered so far
// (compared exactly), a query at a coincident point is not entered, and in
// the point quadtree a tie goes to the lowest point index. Integer points in
// small blocks make the ties and duplicates; spread points keep the grid.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>
#include <limits>
#include <numeric>
#include <random>
#include <vector>

#include "vd_test_util.hpp"
#include "voronoi/detail/nearest_search.hpp"

namespace zt::test {
namespace {

struct SearchRun {
  int lookups = 0;
  int ties = 0;        // lookups with more than one point at the least distance
  int coincident = 0;  // lookups that found an entered point at the query
};

// Enters the engine points 2.. in a shuffled order through the search and
// checks every answer; returns what was seen.
SearchRun SearchAll(const std::vector<Pt>& pts, std::uint32_t seed) {
  Store(pts);
  vd::Engine& g = vd::Vd();
  double x0 = pts[0].x, x1 = x0, y0 = pts[0].y, y1 = y0;
  for (const Pt& p : pts) {
    x0 = std::min(x0, p.x), x1 = std::max(x1, p.x);
    y0 = std::min(y0, p.y), y1 = std::max(y1, p.y);
  }
  g.usedQuadtree = false;
  vd::BuildNearestSearch(g.points.count, x0, y0, x1, y1);
  std::vector<std::int32_t> order(pts.size());
  std::iota(order.begin(), order.end(), 2);
  std::shuffle(order.begin(), order.end(), std::mt19937(seed));
  vd::InsertNearest(order[0]);
  std::vector<std::int32_t> entered{order[0]};
  SearchRun run;
  for (std::size_t k = 1; k < order.size(); ++k) {
    const std::int32_t p = order[k];
    const vd::PointRecord& q = g.points[p];
    double least = std::numeric_limits<double>::infinity();
    std::int32_t lowest = -1;
    int atLeast = 0;
    for (const std::int32_t e : entered) {
      const double dx = g.points[e].x - q.x, dy = g.points[e].y - q.y;
      const double d2 = dx * dx + dy * dy;
      if (d2 < least) least = d2, lowest = e, atLeast = 1;
      else if (d2 == least) lowest = std::min(lowest, e), ++atLeast;
    }
    const vd::Nearest found = vd::FindAndInsertNearest(p);
    ++run.lookups;
    EXPECT_EQ(found.dist2, least) << "lookup " << k;
    if (g.usedQuadtree) {
      EXPECT_EQ(found.point, lowest) << "lookup " << k << ", " << atLeast << " at the least distance";
    }
    if (found.dist2 != least) break;
    run.ties += atLeast > 1;
    if (least <= vd::kCoincidentDist2) ++run.coincident;
    else entered.push_back(p);
  }
  vd::ReleaseNearestSearch();
  return run;
}

TEST(NearestSearch, QuadtreeAnswersAreExactAndTiesGoToTheLowestIndex) {
  const SearchRun run = SearchAll(Generate("blocks 8000 3 60"), 11);
  EXPECT_TRUE(vd::Vd().usedQuadtree);
  EXPECT_EQ(run.lookups, 7999);
  // The data must exercise what the test is about.
  EXPECT_GT(run.ties, 500);
  EXPECT_GT(run.coincident, 100);
}

TEST(NearestSearch, GridAnswersAreExact) {
  std::vector<Pt> pts = UniformPoints(6000, 5, 1000.0);
  // Duplicates and a lattice corner for ties.
  for (int i = 0; i < 200; ++i) pts.push_back(pts[i * 7]);
  for (int i = 0; i < 30; ++i)
    for (int j = 0; j < 30; ++j) pts.push_back({double(i), double(j)});
  const SearchRun run = SearchAll(pts, 12);
  EXPECT_FALSE(vd::Vd().usedQuadtree);
  EXPECT_EQ(run.lookups, 7099);
  EXPECT_GT(run.ties, 50);
  EXPECT_EQ(run.coincident, 200);
}

}  // namespace
}  // namespace zt::test
