// Node constructions on hand-made edges: the worked examples and degenerate
// inputs of data/node_examples.txt, and the same point twice.
#include <gtest/gtest.h>

#include <map>

#include "support/case_rows.hpp"
#include "voronoi/detail/node_check.hpp"
#include "voronoi/detail/node_constructions.hpp"

namespace zt::vd::geo {
namespace {

using test::Keys;
using test::Nums;

// The sites of a row by name: "p2", "s0", "arc".
std::map<std::string, SiteRef> ReadSites(const std::string& text) {
  std::map<std::string, SiteRef> sites;
  std::map<int, PointSite> points;
  for (const std::string& part : test::Parts(text, ';')) {
    const std::string name = test::Split(part).at(0);
    const std::vector<double> v = Nums(test::Trim(part).substr(name.size()));
    const std::int32_t index = std::stoi(name.substr(1));
    if (name[0] == 'p') {
      points[index] = {index, {v.at(0), v.at(1)}};
      sites[name] = SiteRef::point(points[index]);
    } else {
      const PointSite a = points.at(int(v.at(0))), b = points.at(int(v.at(1)));
      sites[name] = SiteRef::segment(SegSite::make(index, a.index, a.p, b.index, b.p));
    }
  }
  sites["arc"].kind = kKindArc;
  return sites;
}

EdgeEnd End(const std::string& text) {
  const std::vector<double> v = Nums(text);
  return {{v.at(0), v.at(1)}, v.at(2), v.at(3) != 0};
}

std::int32_t KindOf(const std::string& w) { return w == "pnt" ? kKindPnt : w == "seg" ? kKindSeg : -2; }

class NodeExamples : public test::CaseRows {};

TEST_P(NodeExamples, GiveTheirNodeOrNameTheirSuspects) {
  auto sites = ReadSites(row().field(0));
  const Keys edge(row().field(1)), want(row().field(2));
  const EdgeFrame e{End(edge.str("n1")), End(edge.str("n2")), sites.at(edge.str("left")), sites.at(edge.str("right"))};
  NodeMemory memory;
  SuspectPair suspect;
  NodeResult out;
  out.copied = true;  // compute_node must clear it
  out.on_point = 99;
  const bool ok = compute_node(e, sites.at(edge.str("fresh")), memory, suspect, out);
  ASSERT_EQ(ok, want.num("ok") != 0);
  const double tol = want.num("tol", 0);
  const std::pair<const char*, double> values[] = {
      {"copied", out.copied}, {"on", out.on_point}, {"x", out.n.x}, {"y", out.n.y}, {"r", out.r}};
  for (const auto& [key, value] : values) {
    if (want.has(key)) { EXPECT_NEAR(value, want.num(key), tol) << key; }
  }
  if (want.has("suspect")) {
    ASSERT_TRUE(suspect.set);
    const std::vector<std::string> p = test::List(want.str("suspect"));
    if (p.size() == 4) {
      EXPECT_EQ(suspect.site1, std::stoi(p[0]));
      EXPECT_EQ(suspect.kind1, KindOf(p[1]));
      EXPECT_EQ(suspect.site2, std::stoi(p[2]));
      EXPECT_EQ(suspect.kind2, KindOf(p[3]));
    }
  }
  if (want.has("memory")) {
    EXPECT_TRUE(memory.orient_by_kept);
    memory.reset();
    EXPECT_FALSE(memory.orient_by_kept);
  }
}

INSTANTIATE_TEST_SUITE_P(Data, NodeExamples, test::RowsOf("node_examples.txt"), test::RowName);

TEST(NodeExamples, TheSamePointTwiceIsNoConstruction) {
  const PointSite p{6, {0.5, 0.5}};
  const SegSite s = SegSite::make(1, 4, {0, 0}, 5, {1, 0});
  const EdgeFrame same{{{0, 1}, 1, false}, {{1, 0.5}, 1, true}, SiteRef::point(p), SiteRef::segment(s)};
  SuspectPair sp;
  NodeResult out;
  EXPECT_FALSE(node_pps(same, SiteRef::point(p), p, p, s, sp, out));
  EXPECT_FALSE(sp.set);
}

}  // namespace
}  // namespace zt::vd::geo
