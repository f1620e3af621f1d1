// The point phase's partly sorted order against a fully random one: the same
// diagram, node for node (position and clearance) and edge for edge (the two
// sites on each), on the point sets and polygons the oracles use; only the
// numbering of the records may differ, and, where four or more sites are
// cocircular, which of them the zero-length edges between the coinciding
// nodes separate.
#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <string>
#include <vector>

#include "vd_test_util.hpp"
#include "voronoi/detail/engine_state.hpp"

namespace zt::test {
namespace {

struct Diagram {
  std::vector<std::array<double, 3>> nodes;       // x, y, r of the live nodes, sorted
  std::vector<std::array<std::int32_t, 4>> edges;  // the two sites (type, index), sorted
};

// Nodes closer than this (relative to the extent) are one point of the
// diagram: the nodes of a cocircular group, up to rounding.
constexpr double kSameNode = 1e-9;

Diagram Capture() {
  Diagram d;
  double extent = 1.0;
  for (std::int32_t i = 0; i < VD_GetNodeCount(); ++i) {
    const VD_NodeInfo n = VD_GetNode(i);
    if (!n.live) continue;
    d.nodes.push_back({n.x, n.y, n.r});
    extent = std::max({extent, std::fabs(n.x), std::fabs(n.y)});
  }
  for (std::int32_t i = 0; i < VD_GetEdgeCount(); ++i) {
    const VD_EdgeInfo e = VD_GetEdge(i);
    if (!e.live) continue;
    const VD_NodeInfo a = VD_GetNode(e.n1), b = VD_GetNode(e.n2);
    if (std::hypot(a.x - b.x, a.y - b.y) <= kSameNode * extent) continue;
    std::array<std::int32_t, 4> s{e.ltype, e.lft, e.rtype, e.rgt};
    if (std::make_pair(s[0], s[1]) > std::make_pair(s[2], s[3])) s = {e.rtype, e.rgt, e.ltype, e.lft};
    d.edges.push_back(s);
  }
  std::sort(d.nodes.begin(), d.nodes.end());
  std::sort(d.edges.begin(), d.edges.end());
  return d;
}

// Rows: name, generator list (vd_test_util.hpp), or "star n" for a star
// polygon of n spikes of uneven lengths (segments).
const NamedList kInputs[] = {
    {"Uniform", "uniform 3000 7 1000"},
    {"Clustered", "clustered 3000 3"},
    {"LatticeCocircular", "lattice 40 1"},
    {"DiceTies", "dice 2000 5 60"},
    {"Blocks", "blocks 3000 9 40"},
    {"StarPolygon", "star 300"},
};

Diagram Compute(const std::string& input, bool presorted) {
  vd::Vd().presortPointOrder = presorted;
  if (input.rfind("star ", 0) == 0) {
    const int n = std::stoi(input.substr(5));
    Contour star;
    for (int k = 0; k < 2 * n; ++k) {
      const double t = M_PI * k / n, r = (k % 2 ? 40.0 : 100.0) + std::sin(7.3 * k);
      star.push_back({r * std::cos(t), r * std::sin(t)});
    }
    StoreContours({star});
    EXPECT_TRUE(ComputeSegments());
  } else {
    Store(Generate(input));
    EXPECT_TRUE(ComputePoints());
  }
  vd::Vd().presortPointOrder = true;
  return Capture();
}

class InsertionOrder : public ::testing::TestWithParam<NamedList> {};

TEST_P(InsertionOrder, PresortedOrderGivesTheDiagramOfARandomOne) {
  const Diagram random = Compute(GetParam().list, false);
  const Diagram presorted = Compute(GetParam().list, true);
  ASSERT_EQ(presorted.nodes.size(), random.nodes.size());
  ASSERT_EQ(presorted.edges, random.edges);
  // Circumcentres are computed from their sites in index order, so the same
  // node comes out the same whatever the order; nodes of cocircular groups
  // coincide up to rounding.
  double extent = 1.0;
  for (const auto& n : random.nodes) extent = std::max({extent, std::fabs(n[0]), std::fabs(n[1])});
  for (std::size_t i = 0; i < random.nodes.size(); ++i)
    for (int k = 0; k < 3; ++k)
      ASSERT_NEAR(presorted.nodes[i][k], random.nodes[i][k], kSameNode * extent) << "node " << i;
}

INSTANTIATE_TEST_SUITE_P(Inputs, InsertionOrder, ::testing::ValuesIn(kInputs),
                         NamedListName);

}  // namespace
}  // namespace zt::test
