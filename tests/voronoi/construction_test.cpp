// Construction of the diagram of points: the point-set cases of
// data/point_sets.txt (invariant checker after insertions and in full), and
// the edge cases of a computation that need more than a row (merge
// distance, restarts, reproducibility, corner points).
#include <gtest/gtest.h>

#include <cmath>

#include "support/case_rows.hpp"
#include "vd_test_util.hpp"

namespace zt::test {
namespace {

class PointSets : public CaseRows {};

TEST_P(PointSets, KeepTheInvariantsAndTheExpectations) {
  const Keys k(row().field(1));
  Store(Generate(row().field(0)));
  vd::Vd().presortPointOrder = k.num("random", 0) == 0;
  const std::string error = CheckedCompute(true, int(k.num("every", 1)), k.num("brute", 1) != 0, int(k.num("allUpTo", 0)));
  vd::Vd().presortPointOrder = true;
  if (k.num("computed", 1) == 0) {
    EXPECT_EQ(error, "not computed");
    EXPECT_FALSE(VD_IsUpToDate());
    EXPECT_EQ(VD_GetNodeCount(), 0);
    return;
  }
  ASSERT_EQ(error, "");
  const vd::Engine& g = vd::Vd();
  const std::pair<const char*, double> values[] = {
      {"nodes", VD_GetNodeCount()},    {"edges", VD_GetEdgeCount()},  {"dups", VD_GetDuplicateCount()},
      {"restarts", g.restartCount},    {"count", g.points.count},     {"quadtree", g.usedQuadtree},
      {"scaled", g.scaled},            {"scale", g.scale},            {"shiftX", g.shiftX},
      {"shiftY", g.shiftY}};
  for (const auto& [key, value] : values) {
    if (k.has(key)) { EXPECT_EQ(value, k.num(key)) << key; }
  }
  if (k.has("deleted")) {
    EXPECT_EQ(g.points[static_cast<int>(k.num("deleted"))].deleted, 1);
  }
  if (k.has("point")) {
    const std::vector<double> xy = Nums(k.str("point"));
    bool found = false;
    for (std::int32_t i = 2; i < g.points.count - 2; ++i) found |= g.points[i].x == xy[0] && g.points[i].y == xy[1];
    EXPECT_TRUE(found);
  }
}

INSTANTIATE_TEST_SUITE_P(Data, PointSets, RowsOf("point_sets.txt"), RowName);

TEST(PointDiagram, SmallRandomSets) {
  for (int n = 1; n <= 40; ++n) EXPECT_EQ(CheckedRun(UniformPoints(n, 100 + n)), "") << n;
}

TEST(PointDiagram, PairsJustAboveAndBelowTheMergeDistance) {
  // Extent 1: internal units are user units. Pairs 2e-11 apart stay apart
  // without a restart; pairs 5e-12 apart merge. The restart that follows a
  // merge mends every pair within the repair distance at once, so both
  // kinds merge, in one restart.
  const auto pairs = [](bool near, bool far) {
    std::vector<Pt> pts{{0, 0}, {1, 1}};
    for (int i = 1; i < 20; ++i) {
      const double x = i / 20.0, y = std::fmod(i * 0.37, 1.0);
      pts.push_back({x, y});
      if (i % 2 ? far : near) pts.push_back({x + (i % 2 ? 2e-11 : 5e-12), y});
    }
    return pts;
  };
  EXPECT_EQ(CheckedRun(pairs(false, true)), "");
  EXPECT_EQ(VD_GetRestartCount(), 0);
  EXPECT_EQ(vd::Vd().points.count, 2 + 2 + 19 + 10 + 2);
  EXPECT_EQ(CheckedRun(pairs(true, true)), "");
  EXPECT_EQ(VD_GetRestartCount(), 1);
  EXPECT_EQ(VD_GetDuplicateCount(), 19);
  EXPECT_EQ(vd::Vd().points.count, 2 + 2 + 19 + 2);  // slots, corners, points kept
}

TEST(PointDiagram, RepeatedComputationIsReproducible) {
  const std::vector<Pt> pts = UniformPoints(500, 11, 10.0);
  Store(pts);
  ASSERT_TRUE(ComputePoints());
  const auto first = Snapshot();
  Store(pts);
  ASSERT_TRUE(ComputePoints());
  EXPECT_EQ(Snapshot(), first);
  // Computing again without a reset gives the same diagram too.
  ASSERT_TRUE(ComputePoints());
  EXPECT_EQ(Snapshot(), first);
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

TEST(PointDiagram, ManyClosePairsMergeInOneRestart) {
  std::vector<Pt> pts{{0, 0}, {1, 1}};
  for (int i = 0; i < 600; ++i) {
    const double x = (i + 0.5) / 601.0, y = std::fmod(i * 0.618, 1.0);
    pts.push_back({x, y});
    pts.push_back({x + 1e-13, y});
  }
  EXPECT_EQ(CheckedRun(pts), "");
  EXPECT_EQ(VD_GetRestartCount(), 1);
  EXPECT_EQ(VD_GetDuplicateCount(), 600);
}

TEST(PointDiagramDeathTest, TooManyRestartsIsFatal) {
  // The guard against a repair that never ends: one restart beyond the limit.
  EXPECT_EXIT(
      {
        Store({{0, 0}, {1, 1}, {0.5, 0.25}});
        ComputePoints();
        vd::Vd().restartPending = true;
        vd::Vd().restartCount = vd::kMaxRestarts;
        bool finished = false;
        vd::ComputeVD(vd::ComputeArgs{}, finished);
      },
      testing::ExitedWithCode(2), "\nerror in ComputeVD\\(\\) - aborting computation -- too many restarts!");
}

}  // namespace
}  // namespace zt::test
