// Records, free lists, edge splitting and degree-2 clean-up, region
// pointers, debug printers and the allocation failure report.
#include <gtest/gtest.h>

#include <cstdio>
#include <string>
#include <vector>

#include "vd_test_util.hpp"
#include "voronoi/detail/debug_print.hpp"
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

TEST(DataModel, FreedEdgeIndexIsReusedWithoutGrowingTheCount) {
  SmallDiagram();
  Engine& g = Vd();
  const std::int32_t count = g.edges.count;
  const std::int32_t freeBefore = g.freeEdges.count;
  const std::int32_t e = NewEdge(4, 5, 2, 3, PNT, PNT);
  EXPECT_EQ(g.edges.count, freeBefore > 0 ? count : count + 1);
  FreeEdge(e);
  EXPECT_EQ(g.edges[e].deleted, 1);
  EXPECT_EQ(g.edges[e].lft, -1);
  const std::int32_t again = NewEdge(4, 5, 2, 3, PNT, PNT);
  EXPECT_EQ(again, e);
  EXPECT_EQ(g.edges[again].deleted, 0);
  EXPECT_EQ(g.edges[again].s_ccw, -1);
  EXPECT_EQ(g.edges[again].spare, -1);
  FreeEdge(again);
}

TEST(DataModel, FreeStackIndexBeyondTheCountRaisesTheCount) {
  SmallDiagram();
  Engine& g = Vd();
  const std::int32_t count = g.nodes.count;
  g.freeNodes.Append(count + 5, kFreeStackGrowth);
  const std::int32_t n = NewNode(0.5, 0.5, 0.0);
  EXPECT_EQ(n, count + 5);
  EXPECT_EQ(g.nodes.count, count + 6);
  EXPECT_EQ(g.nodes[n].status, UNCHECKED);
  EXPECT_EQ(g.nodes[n].site, -1);
}

TEST(DataModel, SetVDPtrWithAnUnknownKindOnlyPrintsTheAlarm) {
  SmallDiagram();
  Engine& g = Vd();
  const std::int32_t before = g.points[2].vd;
  testing::internal::CaptureStdout();
  SetVDPtr(kNoSiteKind, 2, 7);
  EXPECT_EQ(testing::internal::GetCapturedStdout(), "alarm in SetVDPtr: unknown site type 8\n");
  EXPECT_EQ(g.points[2].vd, before);
  SetVDPtr(PNT, 2, 7);
  EXPECT_EQ(g.points[2].vd, 7);
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

TEST(DataModel, DebugPrintersKeepTheirTexts) {
  Store({{0.25, 0.5}});
  ASSERT_TRUE(ComputePoints());
  testing::internal::CaptureStdout();
  PrintEdge("here", 8);
  PrintNode("here", 0);
  PrintSummary();
  const std::string out = testing::internal::GetCapturedStdout();
  EXPECT_NE(out.find("here, edge 8: n1=0, n2=1\nn1: ("), std::string::npos);
  EXPECT_NE(out.find("     lft = -1, rgt = 1, ltype = 8, rtype = 2\n"), std::string::npos);
  EXPECT_NE(out.find("     s_ccw = 11, s_cw = 0, e_ccw = 1, e_cw = 9.\n"), std::string::npos);
  EXPECT_NE(out.find("    status UNCHECKED, edge: 0, site: -1, degree-3 node.\n"), std::string::npos);
  EXPECT_NE(out.find("\nnum_free_nodes: 0\nnum_free_edges: 0\nnum_nodes:      8\nnum_edges:      12\n"
                     "nodes used:     8\nedges used:     12\n"),
            std::string::npos);
}

TEST(DataModelDeathTest, AllocationFailureReportsAndExitsWithStatus2) {
  EXPECT_EXIT(ReallocateArray(nullptr, std::int64_t{1} << 40, 48), testing::ExitedWithCode(2),
              "ReallocateArray\\(\\) - Cannot get .* elements of 48 bytes...\n\nerror in "
              "ReallocateArray\\(\\) - memory allocation failed!");
}

}  // namespace
}  // namespace zt
