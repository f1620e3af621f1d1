// Edge splitting and the degree-2 clean-up leave a sound diagram of the same
// size; the allocation failure report.
#include <gtest/gtest.h>

#include <cstdio>
#include <string>
#include <vector>

#include "vd_test_util.hpp"
#include "voronoi/detail/diagram.hpp"

namespace zt {
namespace {

using namespace test;
using namespace vd;

// A small live diagram to operate on.
void SmallDiagram() {
  Store(UniformPoints(20, 5));
  ASSERT_TRUE(ComputePoints());
}

TEST(DataModel, TemporaryDegree2NodesAreFoldedBackOut) {
  SmallDiagram();
  Engine& g = Vd();
  const std::int32_t usedEdges = g.edges.count - g.freeEdges.count;
  const std::int32_t usedNodes = g.nodes.count - g.freeNodes.count;
  // Split a few inner edges in either direction of travel, chosen before
  // any split (a split's new edge may reuse a freed index among them).
  std::vector<std::int32_t> chosen;
  for (std::int32_t e = 12; e < g.edges.count && chosen.size() < 6; e += 3)
    if (!g.edges[e].deleted) chosen.push_back(e);
  int split = 0;
  for (const std::int32_t e : chosen) {
    const NodeRecord& a = g.nodes[g.edges[e].n1];
    const NodeRecord& b = g.nodes[g.edges[e].n2];
    const std::int32_t n = NewNode(0.5 * (a.x + b.x), 0.5 * (a.y + b.y), 0.0);
    SplitEdge(e, n, true);
    EXPECT_EQ(g.nodes[n].status, DUMMY);
    EXPECT_EQ(g.nodes[n].degree2, 1);
    ++split;
  }
  EXPECT_EQ(g.degree2.count, split);
  EXPECT_EQ(CheckDiagram(CheckOptions{false, false, true}), "");
  RemoveDegree2Nodes();
  EXPECT_EQ(g.degree2.count, 0);
  EXPECT_EQ(g.edges.count - g.freeEdges.count, usedEdges);
  EXPECT_EQ(g.nodes.count - g.freeNodes.count, usedNodes);
  for (std::int32_t e = 0; e < g.edges.count; ++e) {
    if (g.edges[e].deleted) continue;
    EXPECT_NE(g.nodes[g.edges[e].n1].status, DELETED);
    EXPECT_NE(g.nodes[g.edges[e].n2].status, DELETED);
  }
  EXPECT_EQ(FinalCheck(), "");
}

TEST(DataModelDeathTest, AllocationFailureReportsAndExitsWithStatus2) {
  EXPECT_EXIT(ReallocateArray(nullptr, std::int64_t{1} << 40, 48), testing::ExitedWithCode(2),
              "ReallocateArray\\(\\) - Cannot get .* elements of 48 bytes...\n\nerror in "
              "ReallocateArray\\(\\) - memory allocation failed!");
}

}  // namespace
}  // namespace zt
