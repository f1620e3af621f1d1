// Construction of the diagram of points: the invariant checker after every
// insertion on random, clustered, lattice and collinear input, and the edge
// cases of a computation (single point, duplicates, restarts, scaling,
// reproducibility).
#include <gtest/gtest.h>

#include "vd_test_util.hpp"

namespace zt {
namespace {

using namespace vdtest;

void RunChecked(const std::vector<Pt>& pts, int every = 1) {
  Store(pts);
  CheckingObserver obs;
  obs.every = every;
  obs.Attach();
  ASSERT_TRUE(ComputePoints());
  EXPECT_EQ(obs.firstError, "");
  EXPECT_EQ(FinalCheck(), "");
}

TEST(PointDiagram, RandomPointsKeepInvariantsAfterEveryInsertion) {
  RunChecked(UniformPoints(2000, 1, 100.0));
}

TEST(PointDiagram, SmallRandomSets) {
  for (int n = 1; n <= 40; ++n) RunChecked(UniformPoints(n, 100 + n));
}

}  // namespace
}  // namespace zt

namespace zt {
namespace {

using namespace vdtest;

TEST(PointDiagram, ClusteredPointsTakeTheQuadtree) {
  // Enough points that the search samples, and clustered enough to leave the grid.
  const std::vector<Pt> pts = ClusteredPoints(6400, 7);
  Store(pts);
  CheckingObserver obs;
  // Every insertion up to 2000 (the search leaves the grid after 1536
  // sampled points), then every 50th.
  obs.allUpTo = 2000;
  obs.every = 50;
  obs.Attach();
  ASSERT_TRUE(ComputePoints());
  EXPECT_TRUE(vd::Vd().usedQuadtree);
  EXPECT_EQ(obs.firstError, "");
  EXPECT_EQ(FinalCheck(false), "");
}

TEST(PointDiagram, LatticePointsAreCocircular) {
  RunChecked(LatticePoints(45));  // 2025 points, every cell cocircular
}

TEST(PointDiagram, CollinearPoints) { RunChecked(CollinearPoints(2000, 3)); }

TEST(PointDiagram, UniformInputStaysOnTheGrid) {
  Store(UniformPoints(8000, 9));
  ASSERT_TRUE(ComputePoints());
  EXPECT_FALSE(vd::Vd().usedQuadtree);
  EXPECT_EQ(FinalCheck(false), "");
}

TEST(PointDiagram, SinglePointIsTheInitialDiagram) {
  Store({{3.0, 4.0}});
  ASSERT_TRUE(ComputePoints());
  EXPECT_EQ(VD_GetNodeCount(), 8);
  EXPECT_EQ(VD_GetEdgeCount(), 12);
  EXPECT_EQ(FinalCheck(), "");
}

TEST(PointDiagram, IdenticalPointIsCountedAsDuplicate) {
  Store({{1.0, 2.0}, {1.0, 2.0}});
  ASSERT_TRUE(ComputePoints());
  EXPECT_EQ(VD_GetDuplicateCount(), 1);
  EXPECT_EQ(VD_GetRestartCount(), 0);
  EXPECT_EQ(vd::Vd().points[3].deleted, 1);
  EXPECT_EQ(VD_GetNodeCount(), 8);  // the diagram of one point
  EXPECT_EQ(FinalCheck(), "");
}

TEST(PointDiagram, PointsCloserThanTheToleranceMergeAfterOneRestart) {
  // Extent 1 keeps the internal frame equal to the user frame.
  Store({{0.0, 0.0}, {1.0, 1.0}, {0.5, 0.5}, {0.5 + 1e-12, 0.5}});
  ASSERT_TRUE(ComputePoints());
  EXPECT_EQ(VD_GetRestartCount(), 1);
  EXPECT_EQ(VD_GetDuplicateCount(), 1);
  EXPECT_EQ(vd::Vd().points.count, 3 + 4);
  EXPECT_EQ(FinalCheck(), "");
  bool found = false;
  for (std::int32_t i = 2; i < vd::Vd().points.count - 2; ++i)
    found |= vd::Vd().points[i].x == 0.5 + 0.5e-12 && vd::Vd().points[i].y == 0.5;
  EXPECT_TRUE(found);
}

TEST(PointDiagram, ScalingFollowsThePowerOfTwoRule) {
  struct Case {
    std::vector<Pt> pts;
    double scale, shiftX, shiftY;
    bool scaled;
  };
  const Case cases[] = {
      {{{0, 0}, {1, 0.6}}, 1.0, 0.0, 0.0, false},
      {{{0, 0}, {0.3, 0.3}}, 2.0, 0.0, 0.0, true},
      {{{5, 7}, {1005, 507}}, 1.0 / 1024, 5.0, 7.0, true},
      {{{-0.25, 0}, {0.5, 0.5}}, 1.0, -0.25, 0.0, true},  // extent in range, shift needed
  };
  for (const Case& c : cases) {
    Store(c.pts);
    ASSERT_TRUE(ComputePoints());
    EXPECT_EQ(vd::Vd().scale, c.scale);
    EXPECT_EQ(vd::Vd().shiftX, c.shiftX);
    EXPECT_EQ(vd::Vd().shiftY, c.shiftY);
    EXPECT_EQ(vd::Vd().scaled, c.scaled);
  }
}

TEST(PointDiagram, RepeatedComputationIsReproducible) {
  const std::vector<Pt> pts = UniformPoints(500, 11, 10.0);
  auto snapshot = [] {
    std::vector<double> v;
    for (std::int32_t i = 0; i < VD_GetNodeCount(); ++i) {
      const VD_NodeInfo n = VD_GetNode(i);
      v.insert(v.end(), {n.live ? 1.0 : 0.0, n.x, n.y, n.r});
    }
    for (std::int32_t i = 0; i < VD_GetEdgeCount(); ++i) {
      const VD_EdgeInfo e = VD_GetEdge(i);
      v.insert(v.end(), {double(e.n1), double(e.n2), double(e.lft), double(e.rgt)});
    }
    return v;
  };
  Store(pts);
  ASSERT_TRUE(ComputePoints());
  const auto first = snapshot();
  Store(pts);
  ASSERT_TRUE(ComputePoints());
  EXPECT_EQ(snapshot(), first);
  // Computing again without a reset gives the same diagram too.
  ASSERT_TRUE(ComputePoints());
  EXPECT_EQ(snapshot(), first);
}

TEST(PointDiagram, InsertionOrderDrawsLargePositionsDirectly) {
  // A generator of 15 bits a draw could never pick a position beyond 32767
  // first; ours draws 32 bits.
  vd::Vd().random.seed(0);
  std::uint32_t largest = 0;
  for (int i = 0; i < 100; ++i) largest = std::max<std::uint32_t>(largest, vd::Vd().random());
  EXPECT_GT(largest, 1u << 31);
}

TEST(PointDiagram, CornerPointsReturnToTheirSlotsAfterARepairAppendedAPoint) {
  Store(UniformPoints(50, 12));
  ASSERT_TRUE(ComputePoints());
  vd::Engine& g = vd::Vd();
  const double c2x = g.points[g.points.count - 2].x, c3y = g.points[g.points.count - 1].y;
  // As a crossing repair does: a new point, then the restart.
  const std::int32_t added = vd::AppendRepairPoint(0.25, 0.25);
  EXPECT_EQ(added, g.points.count - 3);
  EXPECT_EQ(g.points[g.points.count - 2].x, c2x);
  EXPECT_EQ(g.points[g.points.count - 1].y, c3y);
  vd::ComputeArgs args;
  args.newInput = false;
  args.pointsOnly = true;
  bool finished = false;
  while (g.restartPending) vd::ComputeVD(args, finished);
  EXPECT_TRUE(finished);
  EXPECT_EQ(g.restartCount, 1);
  EXPECT_EQ(g.points[0].x, g.points[1].x);
  EXPECT_LT(g.points[0].y, g.points[1].y);
  EXPECT_EQ(g.points[g.points.count - 2].x, c2x);
  EXPECT_EQ(g.points[g.points.count - 1].y, c3y);
  EXPECT_EQ(FinalCheck(), "");
}

}  // namespace
}  // namespace zt

namespace zt {
namespace {

using namespace vdtest;

TEST(PointDiagram, CornerPointsFixTheMaximalOffset) {
  Store({{0, 0}, {1, 0}, {1, 1}, {0, 1}});
  ASSERT_TRUE(ComputePoints());  // points only: bound factor 1 becomes 5
  const vd::Engine& g = vd::Vd();
  const double w = 5.01;
  EXPECT_DOUBLE_EQ(g.maxOffset, 0.49 * std::sqrt(2 * w * w));
  EXPECT_EQ(g.points[0].x, -w);
  EXPECT_EQ(g.points[0].y, -w);
  EXPECT_EQ(g.points[g.points.count - 1].x, 1 + w);
  EXPECT_EQ(g.points[g.points.count - 2].y, -w);
  // A wide box: the height margin is raised to half the width margin.
  Store({{0, 0}, {1, 0.1}});
  ASSERT_TRUE(VD_ComputeDiagram(false, 2, true, false, 0, 0, 0.0, 0.0, true));
  EXPECT_DOUBLE_EQ(g.points[1].y - 0.1, 2.01 / 2);
}

TEST(PointDiagramDeathTest, TooManyRestartsIsFatal) {
  // Every pair closer than the merge distance costs one restart.
  std::vector<Pt> pts{{0, 0}, {1, 1}};
  for (int i = 0; i < 600; ++i) {
    const double x = (i + 0.5) / 601.0, y = std::fmod(i * 0.618, 1.0);
    pts.push_back({x, y});
    pts.push_back({x + 1e-13, y});
  }
  EXPECT_EXIT(
      {
        Store(pts);
        ComputePoints();
      },
      testing::ExitedWithCode(2), "\nerror in ComputeVD\\(\\) - aborting computation -- too many restarts!");
}

}  // namespace
}  // namespace zt
