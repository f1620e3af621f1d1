// The point phase. Its partly sorted order against a fully random one: the
// same diagram, node for node (position and clearance) and edge for edge
// (the two sites on each); only the numbering of the records may differ,
// and, where four or more sites are cocircular, which of them the
// zero-length edges between the coinciding nodes separate. The nearest-point
// search (grid and quadtree) and the walk through a finished diagram against
// brute force: the least squared distance, compared exactly, with ties
// (lattices, blocks) and coincident queries. Looking a few insertions ahead
// (draws, searches, prefetch walks) may not change a diagram: on an input
// whose near-coincident pairs force a restart in the middle of the point
// phase, zonetool voronoi must print, byte for byte, the same diagram every
// time. The digest was first taken from the engine that drew and searched
// one point at a time, when each pair cost a restart of its own (ten); it
// was retaken when the first restart came to mend every pair at once, and
// when large point sets went over to a partly sorted order (which renumbers
// the records). Underneath, the generator of a random order must give the
// sequence of a plain generator however its values are peeked at and given
// back.
#include <gtest/gtest.h>

#include <cstdio>
#include <limits>
#include <numeric>
#include <sstream>

#include "support/scratch_dir.hpp"
#include "support/subprocess.hpp"
#include "vd_test_util.hpp"
#include "voronoi/detail/nearest_search.hpp"
#include "voronoi/detail/nearest_walk.hpp"

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

// Inputs in the language of ParseSites; the walk is tried on those without
// segments.
const NamedList kInputs[] = {
    {"Uniform", "uniform 3000 7 1000"},
    {"Clustered", "clustered 3000 3"},
    {"HalfClustered", "uniform 1500 4 1000; uniform 1500 5 1"},
    {"LatticeCocircular", "lattice 40 1"},
    {"DiceTies", "dice 2000 5 60"},
    {"BlocksWithTies", "blocks 3000 9 40"},
    {"Collinear", "collinear 500 3"},
    {"StarPolygon", "burst 600 100 40 1"},
};

Diagram Compute(const Sites& input, bool presorted) {
  vd::Vd().presortPointOrder = presorted;
  Store(input);
  EXPECT_TRUE(input.segs.empty() ? ComputePoints() : ComputeSegments());
  vd::Vd().presortPointOrder = true;
  return Capture();
}

// The walk from random sites to queries at random, at midpoints of two
// points and on points ends at the least squared distance over the sites.
void ExpectWalksEndAtTheNearestSite() {
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

class PointPhase : public ::testing::TestWithParam<NamedList> {};

TEST_P(PointPhase, PresortedOrderGivesTheDiagramOfARandomOneAndWalksFindTheNearest) {
  const Sites input = ParseSites(GetParam().list);
  const Diagram random = Compute(input, false);
  const Diagram presorted = Compute(input, true);
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
  if (input.segs.empty()) ExpectWalksEndAtTheNearestSite();
}

INSTANTIATE_TEST_SUITE_P(Inputs, PointPhase, ::testing::ValuesIn(kInputs), NamedListName);

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

std::uint64_t Fnv1a(const std::string& s) {
  std::uint64_t h = 0xcbf29ce484222325ull;
  for (const unsigned char c : s) h = (h ^ c) * 0x100000001b3ull;
  return h;
}

// 3000 pseudo-random points in the unit square, then every 300th point again
// 3e-13 to its right: closer than the engine's coincidence tolerance, so
// each pair is merged by a restart.
std::string RestartingInput() {
  std::uint64_t s = 12345;
  const auto next = [&s] {
    s = s * 6364136223846793005ull + 1442695040888963407ull;
    return static_cast<double>(s >> 11) * 0x1p-53;
  };
  std::vector<std::pair<double, double>> pts;
  for (int i = 0; i < 3000; ++i) {
    const double x = next();
    pts.emplace_back(x, next());
  }
  for (int i = 0; i < 3000; i += 300) pts.emplace_back(pts[i].first + 3e-13, pts[i].second);
  std::string text;
  char line[80];
  for (const auto& [x, y] : pts) {
    std::snprintf(line, sizeof line, "p %.17g %.17g\n", x, y);
    text += line;
  }
  return text;
}

TEST(PointLookahead, DiagramWithRestartsIsThatOfOneDrawAtATime) {
  const ScratchDir dir;
  write_text(dir.file("in.txt"), RestartingInput());
  const CommandRun r =
      run_command(zonetool_path() + " voronoi " + dir.file("in.txt") + " 2>/dev/null");
  ASSERT_EQ(r.status, 0);
  ASSERT_NE(r.out.find("restarts 1 recovery 0\n"), std::string::npos) << r.out.substr(r.out.size() - 60);
  EXPECT_EQ(Fnv1a(r.out), 0xf2be7d938f806782ull);
}

// A random script of draws, peeks and give-backs against the plain
// sequence: pos values are consumed, `back` of them given back and not yet
// drawn again.
TEST(OrderRandom, PeeksAndGiveBacksKeepTheSequenceOfOneDrawAtATime) {
  std::mt19937 plain(0);
  std::vector<std::uint32_t> seq(20000);
  for (auto& v : seq) v = static_cast<std::uint32_t>(plain());
  vd::OrderRandom r;
  r.seed(0);
  std::mt19937 script(7);
  std::size_t pos = 0;
  int back = 0;
  while (pos + vd::OrderRandom::kMaxPeek < seq.size()) {
    const unsigned op = script() % 8;
    if (op < 5) {
      ASSERT_EQ(r(), seq[pos]) << "draw " << pos;
      ++pos;
      back = std::max(back - 1, 0);
    } else if (op < 7) {
      const int j = static_cast<int>(script() % vd::OrderRandom::kMaxPeek);
      ASSERT_EQ(r.Peek(j), seq[pos + j]) << "peek " << j << " at " << pos;
    } else {
      const int k = std::min<int>(static_cast<int>(script() % 8), vd::OrderRandom::kMaxGivenBack - back);
      for (int i = 0; i < k && pos > 0; ++i, ++back) r.GiveBack(seq[--pos]);
    }
  }
}

TEST(ZonetoolVoronoi, PrintsNodesEdgesAndFigures) {
  const ScratchDir dir;
  write_text(dir.file("in.txt"), "# a triangle\np 0 0\np 4 0\n\np 0 3\n");
  const CommandRun r = run_command(zonetool_path() + " voronoi " + dir.file("in.txt") + " 2>&1");
  ASSERT_EQ(r.status, 0) << r.out;
  std::istringstream in(r.out);
  int nodes = 0, edges = 0;
  bool circumcentre = false;
  std::string line, last;
  while (std::getline(in, line)) {
    last = line;
    nodes += line.rfind("node ", 0) == 0;
    edges += line.rfind("edge ", 0) == 0;
    // The circumcentre of the right triangle: the hypotenuse's midpoint.
    circumcentre |= line.find(" 2 1.5 2.5") != std::string::npos;
  }
  EXPECT_TRUE(circumcentre) << r.out;
  EXPECT_EQ(last, "restarts 0 recovery 0");
  // Euler with 7 sites (three points, four corners) and the outer face.
  EXPECT_EQ(nodes - edges + 8, 2);
  // An edge between points 0 and 1, in one direction or the other.
  EXPECT_TRUE(r.out.find(" 0 2 1 2\n") != std::string::npos || r.out.find(" 1 2 0 2\n") != std::string::npos)
      << r.out;
}

}  // namespace
}  // namespace zt::test
