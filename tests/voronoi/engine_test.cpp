// The diagram of points and the engine around it: the point-set rows of
// data/point_sets.txt (invariant checker after insertions and in full); the
// edge cases that need more than a row (reproducibility, restarts, corner
// points); the facade's life cycle, indices and staleness (bad coordinates
// are rows); edge splits and the degree-2 clean-up; record arrays through
// growth; the allocation failure report.
#include <gtest/gtest.h>

#include "vd_test_util.hpp"
#include "voronoi/detail/diagram.hpp"
#include "voronoi/detail/records.hpp"
#include "voronoi/detail/storage.hpp"

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
  for (int n = 1; n <= 40; ++n) {
    Store(UniformPoints(n, 100 + n));
    EXPECT_EQ(CheckedCompute(), "") << n;
  }
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

// The live nodes' positions, sorted.
std::vector<std::pair<double, double>> LiveNodes() {
  std::vector<std::pair<double, double>> v;
  for (std::int32_t i = 0; i < VD_GetNodeCount(); ++i)
    if (VD_GetNode(i).live) v.push_back({VD_GetNode(i).x, VD_GetNode(i).y});
  std::sort(v.begin(), v.end());
  return v;
}

TEST(Facade, InitialiseTwiceAndResetBeforeInitialise) {
  VD_Terminate();
  VD_Reset();      // nothing while not initialised
  VD_Terminate();  // likewise
  EXPECT_TRUE(VD_Initialize());
  EXPECT_FALSE(VD_Initialize());
  VD_Terminate();
  EXPECT_TRUE(VD_Initialize());
}

TEST(Facade, IndicesFrom2AndSegmentsNamingNoCallerPointAreRefused) {
  VD_Initialize();
  VD_Reset();
  EXPECT_EQ(API_AddPoint(0, 0, 0), 2);
  EXPECT_EQ(API_AddPoint(1, 0, 0), 3);
  for (auto [a, b] : {std::pair{0, 2}, {1, 3}, {2, 4}, {-1, 2}, {3, 100}}) {
    EXPECT_EQ(API_AddSegment(a, b, 0), -1) << a << " " << b;
  }
  EXPECT_EQ(vd::Vd().segments.count, 0);
  EXPECT_EQ(API_AddSegment(2, 3, 0), 0);
}

TEST(Facade, AddingSitesAfterAComputationMakesItStaleAndTheNextOneSound) {
  const std::vector<Pt> pts = UniformPoints(100, 21, 50.0);
  Store(pts);
  ASSERT_TRUE(ComputePoints());
  ASSERT_TRUE(VD_IsUpToDate());
  EXPECT_EQ(API_AddPoint(25.0, 25.0, 100), 102);
  EXPECT_FALSE(VD_IsUpToDate());
  ASSERT_TRUE(ComputePoints());
  EXPECT_EQ(FinalCheck(), "");
  // The same diagram as storing all 101 points at once.
  const auto before = LiveNodes();
  std::vector<Pt> all = pts;
  all.push_back({25.0, 25.0});
  Store(all);
  ASSERT_TRUE(ComputePoints());
  EXPECT_EQ(LiveNodes(), before);
}

TEST(DataModel, TemporaryDegree2NodesAreFoldedBackOut) {
  Store(UniformPoints(20, 5));
  ASSERT_TRUE(ComputePoints());
  vd::Engine& g = vd::Vd();
  const auto before = LiveNodes();
  // Split a few inner edges in either direction of travel, chosen before
  // any split (a split's new edge may reuse a freed index among them).
  std::vector<std::int32_t> chosen;
  for (std::int32_t e = 12; e < g.edges.count && chosen.size() < 6; e += 3)
    if (!g.edges[e].deleted) chosen.push_back(e);
  for (const std::int32_t e : chosen) {
    const vd::NodeRecord& a = g.nodes[g.edges[e].n1];
    const vd::NodeRecord& b = g.nodes[g.edges[e].n2];
    vd::SplitEdge(e, vd::NewNode(0.5 * (a.x + b.x), 0.5 * (a.y + b.y), 0.0), true);
  }
  EXPECT_EQ(vd::CheckDiagram(vd::CheckOptions{false, false, true}), "");
  vd::RemoveDegree2Nodes();
  EXPECT_EQ(LiveNodes(), before);
  for (std::int32_t e = 0; e < g.edges.count; ++e)
    EXPECT_TRUE(g.edges[e].deleted || (g.nodes[g.edges[e].n1].status != vd::DELETED && g.nodes[g.edges[e].n2].status != vd::DELETED)) << e;
  EXPECT_EQ(FinalCheck(), "");
}

TEST(DataModelDeathTest, AllocationFailureReportsAndExitsWithStatus2) {
  EXPECT_EXIT(vd::ReallocateArray(nullptr, std::int64_t{1} << 40, 48), testing::ExitedWithCode(2),
              "ReallocateArray\\(\\) - Cannot get .* elements of 48 bytes...\n\nerror in "
              "ReallocateArray\\(\\) - memory allocation failed!");
}

TEST(Storage, LargeArraysKeepTheirRecordsThroughGrowth) {
  vd::RecordArray<vd::EdgeRecord> a;
  const std::int32_t n = 300000;  // 14.4 MB: advised for huge pages
  a.Reserve(n);
  for (std::int32_t i = 0; i < n; ++i) {
    vd::EdgeRecord r{};
    r.n1 = i;
    r.spare = ~i;
    a.Append(r, 65536);
  }
  for (std::int32_t i = 0; i < 3 * 65536; ++i) a.Append(vd::EdgeRecord{}, 65536);
  for (std::int32_t i = 0; i < n; ++i) {
    ASSERT_EQ(a[i].n1, i);
    ASSERT_EQ(a[i].spare, ~i);
  }
  a.Free();
}

TEST(Storage, PrefetchOutsideTheArrayIsIgnored) {
  vd::RecordArray<vd::NodeRecord> a;
  a.Prefetch(0);  // no storage at all
  a.Reserve(4);
  for (const std::int32_t i : {-1, 4, 3}) a.Prefetch(i);
  a.Free();
  SUCCEED();
}

}  // namespace
}  // namespace zt::test
