// Edge splitting and the degree-2 clean-up leave a sound diagram; the
// allocation failure report.
#include <gtest/gtest.h>

#include <algorithm>
#include <utility>
#include <string>
#include <vector>

#include "vd_test_util.hpp"
#include "voronoi/detail/diagram.hpp"

namespace zt {
namespace {

using namespace test;
using namespace vd;

// The live nodes' positions, sorted.
std::vector<std::pair<double, double>> LiveNodes() {
  std::vector<std::pair<double, double>> v;
  for (std::int32_t i = 0; i < VD_GetNodeCount(); ++i)
    if (VD_GetNode(i).live) v.push_back({VD_GetNode(i).x, VD_GetNode(i).y});
  std::sort(v.begin(), v.end());
  return v;
}

TEST(DataModel, TemporaryDegree2NodesAreFoldedBackOut) {
  Store(UniformPoints(20, 5));
  ASSERT_TRUE(ComputePoints());
  Engine& g = Vd();
  const auto before = LiveNodes();
  // Split a few inner edges in either direction of travel, chosen before
  // any split (a split's new edge may reuse a freed index among them).
  std::vector<std::int32_t> chosen;
  for (std::int32_t e = 12; e < g.edges.count && chosen.size() < 6; e += 3)
    if (!g.edges[e].deleted) chosen.push_back(e);
  for (const std::int32_t e : chosen) {
    const NodeRecord& a = g.nodes[g.edges[e].n1];
    const NodeRecord& b = g.nodes[g.edges[e].n2];
    const std::int32_t n = NewNode(0.5 * (a.x + b.x), 0.5 * (a.y + b.y), 0.0);
    SplitEdge(e, n, true);
    EXPECT_EQ(g.nodes[n].status, DUMMY);
    EXPECT_EQ(g.nodes[n].degree2, 1);
  }
  EXPECT_EQ(g.degree2.count, static_cast<std::int32_t>(chosen.size()));
  EXPECT_EQ(CheckDiagram(CheckOptions{false, false, true}), "");
  RemoveDegree2Nodes();
  EXPECT_EQ(g.degree2.count, 0);
  EXPECT_EQ(LiveNodes(), before);
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
