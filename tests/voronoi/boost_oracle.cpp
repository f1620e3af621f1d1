// Oracle: our diagrams of integer point sets and of integer, non-crossing
// polygons against Boost.Polygon's Voronoi diagrams. Every Boost vertex
// inside the corner box whose circle holds no corner point (so that it is a
// vertex of our diagram too) must match one of our nodes within 1e-9 of the
// extent; every proper node of ours must match a Boost vertex: for points,
// a node between three caller points (nodes of cocircular groups may
// coincide); for polygons, a node with three incident edges and no corner
// site.
#include <gtest/gtest.h>

#include <algorithm>
#include <boost/polygon/segment_data.hpp>
#include <boost/polygon/voronoi.hpp>
#include <cmath>
#include <cstdint>
#include <random>
#include <sstream>
#include <string>
#include <vector>

#include "vd_test_util.hpp"

namespace zt::test {
namespace {

// ---- Matching our nodes against their vertices: the corner points of our
// diagram (a vertex whose circle holds one is no vertex of ours), our nodes,
// and the search both ways within a tolerance.

void SortByX(std::vector<Pt>& v) {
  std::sort(v.begin(), v.end(), [](Pt a, Pt b) { return a.x < b.x; });
}

// Whether some point of `b` (sorted by x) lies within tol of p.
bool Near(const std::vector<Pt>& b, Pt p, double tol) {
  auto it = std::lower_bound(b.begin(), b.end(), p.x - tol, [](const Pt& q, double v) { return q.x < v; });
  for (; it != b.end() && it->x <= p.x + tol; ++it)
    if (std::fabs(it->y - p.y) <= tol) return true;
  return false;
}

// The four corner points of the computed diagram, in user coordinates.
struct Corners {
  std::vector<Pt> points;
  double x0 = 1e300, x1 = -1e300, y0 = 1e300, y1 = -1e300;

  Corners() {
    const vd::Engine& g = vd::Vd();
    for (std::int32_t i : {0, 1, g.points.count - 2, g.points.count - 1})
      points.push_back({vd::ToUserX(g.points[i].x), vd::ToUserY(g.points[i].y)});
    for (const Pt& c : points) x0 = std::min(x0, c.x), x1 = std::max(x1, c.x), y0 = std::min(y0, c.y), y1 = std::max(y1, c.y);
  }
  bool inBox(Pt p) const { return !(p.x < x0 || p.x > x1 || p.y < y0 || p.y > y1); }
  // Whether the circle of radius r around p holds a corner point.
  bool anyWithin(Pt p, double r) const {
    bool holds = false;
    for (const Pt& c : points) holds |= std::hypot(p.x - c.x, p.y - c.y) < r;
    return holds;
  }
};

// Our live nodes past the four corner nodes: all of them (sorted by x), and
// the proper ones, which touch no edge that `cornerEdge` names and, when
// asked, are no degree-2 nodes.
struct OurNodes {
  std::vector<Pt> all, proper;
};

template <class CornerEdge>
OurNodes CollectNodes(CornerEdge cornerEdge, bool skipDegree2) {
  std::vector<char> real(VD_GetNodeCount(), 1);
  for (std::int32_t e = 0; e < VD_GetEdgeCount(); ++e) {
    const VD_EdgeInfo info = VD_GetEdge(e);
    if (info.live && cornerEdge(info)) real[info.n1] = real[info.n2] = 0;
  }
  OurNodes out;
  for (std::int32_t n = 4; n < VD_GetNodeCount(); ++n) {
    const VD_NodeInfo info = VD_GetNode(n);
    if (!info.live) continue;
    out.all.push_back({info.x, info.y});
    if (real[n] && !(skipDegree2 && info.degree2)) out.proper.push_back({info.x, info.y});
  }
  SortByX(out.all);
  return out;
}

std::string Describe(Pt p) {
  std::ostringstream s;
  s << "(" << p.x << ", " << p.y << ")";
  return s.str();
}

// What a match looked at (vertices of theirs checked and skipped, nodes of
// ours checked), and "" or the first point that failed.
struct Match {
  int theirsChecked = 0, oursChecked = 0, skipped = 0;
  std::string error;
};

// Every vertex of `diagram` inside the corner box whose circle (of the radius
// `clearance(vertex, p)`) holds no corner point must be one of our nodes
// within tol; then every proper node of ours must be one of the vertices.
template <class Diagram, class Clearance>
Match MatchBothWays(const Diagram& diagram, Clearance clearance, const OurNodes& nodes, double tol) {
  const Corners corners;
  Match m;
  std::vector<Pt> theirs;
  for (const auto& v : diagram.vertices()) {
    const Pt p{v.x(), v.y()};
    theirs.push_back(p);
    if (!corners.inBox(p)) continue;
    if (corners.anyWithin(p, clearance(v, p))) {
      ++m.skipped;
      continue;
    }
    ++m.theirsChecked;
    if (!Near(nodes.all, p, tol)) return m.error = "boost vertex " + Describe(p) + " has no node", m;
  }
  SortByX(theirs);
  for (const Pt& p : nodes.proper) {
    ++m.oursChecked;
    if (!Near(theirs, p, tol)) return m.error = "node " + Describe(p) + " is no boost vertex", m;
  }
  return m;
}

// ---- The oracle cases.

using BPoint = boost::polygon::point_data<int>;
using LPoint = boost::polygon::point_data<long long>;
using BSegment = boost::polygon::segment_data<long long>;
using Polygon = std::vector<LPoint>;

Match ComparePoints(const std::vector<BPoint>& input) {
  std::vector<Pt> pts;
  for (const BPoint& p : input) pts.push_back({double(p.x()), double(p.y())});
  Store(pts);
  if (!ComputePoints()) return {0, 0, 0, "not computed"};
  if (std::string e = FinalCheck(pts.size() < 3000); !e.empty()) return {0, 0, 0, "checker: " + e};
  // Our nodes whose sites are all caller points.
  const OurNodes nodes = CollectNodes(
      [](const VD_EdgeInfo& info) {
        return info.ltype != 2 || info.rtype != 2 || VD_GetPointTag(info.lft) < 0 || VD_GetPointTag(info.rgt) < 0;
      },
      false);
  boost::polygon::voronoi_diagram<double> bd;
  boost::polygon::construct_voronoi(input.begin(), input.end(), &bd);
  // The circle of a vertex: through the site of one of its cells.
  const auto clearance = [&](const auto& v, Pt p) {
    const BPoint& s = input[v.incident_edge()->cell()->source_index()];
    return std::hypot(p.x - s.x(), p.y - s.y());
  };
  return MatchBothWays(bd, clearance, nodes, 1e-9 * std::max(Extent(pts), 1.0));
}

Match CompareSites(const std::string& text) {
  std::vector<BPoint> pts;
  for (const Pt& p : Generate(text)) pts.emplace_back(int(p.x), int(p.y));
  return ComparePoints(pts);
}

// Random integer points in small ranges (duplicates and cocircular points)
// and large ones.
TEST(BoostOracle, RandomIntegerPoints) {
  int checked = 0, skipped = 0;
  for (int round = 0; round < 60; ++round) {
    const int range = round % 3 == 0 ? 60 : 200000;
    const Match o = CompareSites("dice " + std::to_string(3 + round * 25) + " " + std::to_string(42 + round) + " " + std::to_string(range));
    ASSERT_EQ(o.error, "") << "round " << round;
    checked += o.theirsChecked;
    skipped += o.skipped;
  }
  EXPECT_GT(checked, 10000);
  // Vertices hidden by a corner point are rare: only far out, beyond the hull.
  EXPECT_LT(skipped, checked / 100);
}

TEST(BoostOracle, IntegerLatticeIsCocircularEverywhereAndCollinearPoints) {
  const Match o = CompareSites("lattice 35 7");
  EXPECT_EQ(o.error, "");
  EXPECT_GT(o.theirsChecked, 1000);
  // One point off the line gives vertices between real points.
  EXPECT_EQ(CompareSites("collinear 500 3; points 0 1").error, "");
}

// Nearest points by walks through the diagram (the partly sorted order), and
// by the quadtree (a random order).
TEST(BoostOracle, ClusteredIntegerPoints) {
  for (const bool presorted : {true, false}) {
    vd::Vd().presortPointOrder = presorted;
    const Match o = CompareSites("blocks 9000 5 80");
    vd::Vd().presortPointOrder = true;
    EXPECT_EQ(o.error, "") << presorted;
    EXPECT_EQ(vd::Vd().usedQuadtree, !presorted);
    EXPECT_GT(o.oursChecked, 5000);
  }
}

double Orient(const LPoint& a, const LPoint& b, const LPoint& c) {
  return double(b.x() - a.x()) * double(c.y() - a.y()) - double(b.y() - a.y()) * double(c.x() - a.x());
}
// True when no two edges of the polygons cross, touch or overlap (beyond
// consecutive edges sharing their vertex) and no vertex repeats.
bool Simple(const std::vector<Polygon>& polys) {
  std::vector<std::pair<LPoint, LPoint>> edges;
  for (const Polygon& p : polys)
    for (std::size_t i = 0; i < p.size(); ++i) edges.push_back({p[i], p[(i + 1) % p.size()]});
  for (std::size_t i = 0; i < edges.size(); ++i) {
    if (edges[i].first == edges[i].second) return false;
    for (std::size_t j = i + 1; j < edges.size(); ++j) {
      const auto& [a, b] = edges[i];
      const auto& [c, d] = edges[j];
      const bool adjacent = b == c || a == d;
      if (!adjacent && (a == c || a == d || b == c || b == d)) return false;
      if (Orient(a, b, c) * Orient(a, b, d) < 0 && Orient(c, d, a) * Orient(c, d, b) < 0) return false;
      // Collinear touching or overlapping.
      for (const LPoint& q : {c, d}) {
        if (q == a || q == b || Orient(a, b, q) != 0) continue;
        if (std::min(a.x(), b.x()) <= q.x() && q.x() <= std::max(a.x(), b.x()) && std::min(a.y(), b.y()) <= q.y() &&
            q.y() <= std::max(a.y(), b.y()))
          return false;
      }
    }
  }
  return true;
}

Polygon IntegerStar(int n, std::mt19937& rng, double cx, double cy, double rmin, double rmax, bool clockwise) {
  Polygon p;
  for (const Pt& q : Star(rng, cx, cy, rmin, rmax, n, clockwise)) p.emplace_back(std::llround(q.x), std::llround(q.y));
  return p;
}

Match ComparePolygons(const std::vector<Polygon>& polys) {
  std::vector<Contour> contours;
  std::vector<Pt> pts;
  std::vector<BSegment> segs;
  for (const Polygon& p : polys) {
    contours.emplace_back();
    for (std::size_t i = 0; i < p.size(); ++i) {
      contours.back().push_back({double(p[i].x()), double(p[i].y())});
      segs.emplace_back(p[i], p[(i + 1) % p.size()]);
    }
    pts.insert(pts.end(), contours.back().begin(), contours.back().end());
  }
  StoreContours(contours);
  if (!ComputeSegments()) return {0, 0, 0, "not computed"};
  if (VD_GetRestartCount() != 0 || VD_InRecoveryMode()) return {0, 0, 0, "restart or recovery on clean input"};
  // Proper nodes of ours: degree 3 and no corner site around.
  const auto corner = [](std::int32_t site, std::int32_t kind) {
    return kind == 8 || (kind == 2 && VD_GetPointTag(site) < 0);
  };
  const OurNodes nodes = CollectNodes(
      [&](const VD_EdgeInfo& info) { return corner(info.lft, info.ltype) || corner(info.rgt, info.rtype); }, true);
  boost::polygon::voronoi_diagram<double> bd;
  boost::polygon::construct_voronoi(segs.begin(), segs.end(), &bd);
  // Clearance: distance to the site of one incident cell.
  const auto clearance = [&](const auto& v, Pt p) {
    const auto* cell = v.incident_edge()->cell();
    const BSegment& s = segs[cell->source_index()];
    if (cell->contains_point()) {
      const LPoint q = cell->source_category() == boost::polygon::SOURCE_CATEGORY_SEGMENT_START_POINT ? s.low() : s.high();
      return std::hypot(p.x - double(q.x()), p.y - double(q.y()));
    }
    const double ax = double(s.low().x()), ay = double(s.low().y()), bx = double(s.high().x()), by = double(s.high().y());
    return std::fabs((bx - ax) * (p.y - ay) - (by - ay) * (p.x - ax)) / std::hypot(bx - ax, by - ay);
  };
  return MatchBothWays(bd, clearance, nodes, 1e-9 * std::max(Extent(pts), 1.0));
}

// Runs `rounds` random polygon sets, keeping the simple ones; the counts
// of compared sets and of Boost vertices checked.
template <class Make>
void CompareSimple(int rounds, std::mt19937& rng, Make make, int& cases, int& checked) {
  for (int round = 0; round < rounds; ++round) {
    const std::vector<Polygon> polys = make(round, rng);
    if (!Simple(polys)) continue;
    ++cases;
    const Match o = ComparePolygons(polys);
    ASSERT_EQ(o.error, "") << "round " << round;
    checked += o.theirsChecked;
  }
}

TEST(BoostSegmentOracle, IntegerStarPolygons) {
  std::mt19937 rng(7);
  int checked = 0, cases = 0;
  CompareSimple(40, rng, [](int round, std::mt19937& r) {
    const double scale = round % 2 ? 1e6 : 1e4;
    return std::vector<Polygon>{IntegerStar(4 + round * 13, r, 0, 0, 0.4 * scale, scale, false)};
  }, cases, checked);
  EXPECT_GT(cases, 30);
  EXPECT_GT(checked, 5000);
}

TEST(BoostSegmentOracle, PocketWithIslands) {
  std::mt19937 rng(11);
  int checked = 0, cases = 0;
  CompareSimple(6, rng, [](int, std::mt19937& r) {
    std::vector<Polygon> polys{IntegerStar(60, r, 0, 0, 900000, 1000000, false)};
    for (int i = 0; i < 3; ++i)
      for (int j = 0; j < 3; ++j)
        polys.push_back(IntegerStar(7, r, -400000 + 400000 * i, -400000 + 400000 * j, 60000, 150000, true));
    return polys;
  }, cases, checked);
  EXPECT_GT(cases, 3);
  EXPECT_GT(checked, 1000);
}

TEST(BoostSegmentOracle, AxisAlignedStaircase) {
  Polygon p{{0, 0}};
  for (int i = 0; i < 30; ++i) {
    p.emplace_back((i + 1) * 1000, i * 1000);
    p.emplace_back((i + 1) * 1000, (i + 1) * 1000);
  }
  p.emplace_back(0, 30000);
  const Match o = ComparePolygons({p});
  EXPECT_EQ(o.error, "");
  EXPECT_GT(o.theirsChecked, 100);
}

}  // namespace
}  // namespace zt::test
