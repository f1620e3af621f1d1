// Oracle: the diagram of integer, non-crossing polygons against Boost.Polygon's
// segment Voronoi diagram. Every Boost vertex inside the corner box whose
// circle holds no corner point must match one of our nodes within 1e-9 of
// the extent; every proper node of ours (three incident edges, no corner
// site) must match a Boost vertex.
#include <gtest/gtest.h>

#include <algorithm>
#include <boost/polygon/segment_data.hpp>
#include <boost/polygon/voronoi.hpp>
#include <cmath>
#include <random>
#include <string>
#include <vector>

#include "node_match.hpp"

namespace zt {
namespace {

using namespace vdtest;
using BPoint = boost::polygon::point_data<long long>;
using BSegment = boost::polygon::segment_data<long long>;

using Polygon = std::vector<BPoint>;

double Orient(const BPoint& a, const BPoint& b, const BPoint& c) {
  return double(b.x() - a.x()) * double(c.y() - a.y()) - double(b.y() - a.y()) * double(c.x() - a.x());
}
bool Crosses(const BPoint& a, const BPoint& b, const BPoint& c, const BPoint& d) {
  return Orient(a, b, c) * Orient(a, b, d) < 0 && Orient(c, d, a) * Orient(c, d, b) < 0;
}
// True when no two edges of the polygons cross, touch or overlap (beyond
// consecutive edges sharing their vertex) and no vertex repeats.
bool Simple(const std::vector<Polygon>& polys) {
  std::vector<std::pair<BPoint, BPoint>> edges;
  for (const Polygon& p : polys)
    for (std::size_t i = 0; i < p.size(); ++i) edges.push_back({p[i], p[(i + 1) % p.size()]});
  for (std::size_t i = 0; i < edges.size(); ++i) {
    if (edges[i].first == edges[i].second) return false;
    for (std::size_t j = i + 1; j < edges.size(); ++j) {
      const auto& [a, b] = edges[i];
      const auto& [c, d] = edges[j];
      const bool adjacent = b == c || a == d;
      if (!adjacent && (a == c || a == d || b == c || b == d)) return false;
      if (Crosses(a, b, c, d)) return false;
      // Collinear touching or overlapping.
      for (const BPoint& q : {c, d}) {
        if (q == a || q == b || Orient(a, b, q) != 0) continue;
        if (std::min(a.x(), b.x()) <= q.x() && q.x() <= std::max(a.x(), b.x()) && std::min(a.y(), b.y()) <= q.y() &&
            q.y() <= std::max(a.y(), b.y()))
          return false;
      }
    }
  }
  return true;
}

Polygon IntegerStar(int n, std::mt19937& rng, double cx, double cy, double rmin, double rmax, bool reverse) {
  std::uniform_real_distribution<double> ua(0.0, 0.8), ur(rmin, rmax);
  Polygon p;
  for (int i = 0; i < n; ++i) {
    const double a = 2 * M_PI * (i + ua(rng)) / n, r = ur(rng);
    p.emplace_back(std::llround(cx + r * std::cos(a)), std::llround(cy + r * std::sin(a)));
  }
  if (reverse) std::reverse(p.begin(), p.end());
  return p;
}

struct Outcome {
  int boostChecked = 0, oursChecked = 0;
  std::string error;
};

Outcome Compare(const std::vector<Polygon>& polys) {
  Outcome out;
  VD_Initialize();
  VD_Reset();
  std::vector<BSegment> segs;
  double minX = 1e300, maxX = -1e300, minY = 1e300, maxY = -1e300;
  for (const Polygon& p : polys) {
    std::vector<std::int32_t> idx;
    for (const BPoint& q : p) {
      idx.push_back(API_AddPoint(double(q.x()), double(q.y()), 1));
      minX = std::min(minX, double(q.x())), maxX = std::max(maxX, double(q.x()));
      minY = std::min(minY, double(q.y())), maxY = std::max(maxY, double(q.y()));
    }
    for (std::size_t i = 0; i < p.size(); ++i) {
      API_AddSegment(idx[i], idx[(i + 1) % p.size()], 2);
      segs.emplace_back(p[i], p[(i + 1) % p.size()]);
    }
  }
  if (!VD_ComputeDiagram(false, 1, false, false, 0, 0, 0.0, 0.0, true)) {
    out.error = "not computed";
    return out;
  }
  if (VD_GetRestartCount() != 0 || VD_InRecoveryMode()) {
    out.error = "restart or recovery on clean input";
    return out;
  }
  const double tol = 1e-9 * std::max({maxX - minX, maxY - minY, 1.0});
  // Proper nodes of ours: degree 3 and no corner site around.
  const auto corner = [](std::int32_t site, std::int32_t kind) {
    return kind == 8 || (kind == 2 && VD_GetPointTag(site) < 0);
  };
  const OurNodes nodes = CollectNodes(
      [&](const VD_EdgeInfo& info) { return corner(info.lft, info.ltype) || corner(info.rgt, info.rtype); }, true);

  boost::polygon::voronoi_diagram<double> bd;
  boost::polygon::construct_voronoi(segs.begin(), segs.end(), &bd);
  // Clearance: distance to the site of one incident cell.
  const auto clearance = [&](const auto& v, XY p) {
    const auto* cell = v.incident_edge()->cell();
    const BSegment& s = segs[cell->source_index()];
    if (cell->contains_point()) {
      const BPoint q = cell->source_category() == boost::polygon::SOURCE_CATEGORY_SEGMENT_START_POINT ? s.low() : s.high();
      return std::hypot(p.x - double(q.x()), p.y - double(q.y()));
    }
    const double ax = double(s.low().x()), ay = double(s.low().y()), bx = double(s.high().x()), by = double(s.high().y());
    return std::fabs((bx - ax) * (p.y - ay) - (by - ay) * (p.x - ax)) / std::hypot(bx - ax, by - ay);
  };
  MatchCounts counts;
  out.error = MatchBothWays(bd, clearance, nodes, tol, counts);
  out.boostChecked = counts.theirsChecked, out.oursChecked = counts.oursChecked;
  return out;
}

TEST(BoostSegmentOracle, IntegerStarPolygons) {
  std::mt19937 rng(7);
  int checked = 0, cases = 0;
  for (int round = 0; round < 40; ++round) {
    const int n = 4 + round * 13;
    const double scale = round % 2 ? 1e6 : 1e4;
    std::vector<Polygon> polys{IntegerStar(n, rng, 0, 0, 0.4 * scale, scale, false)};
    if (!Simple(polys)) continue;
    ++cases;
    const Outcome o = Compare(polys);
    ASSERT_EQ(o.error, "") << "round " << round;
    checked += o.boostChecked;
  }
  EXPECT_GT(cases, 30);
  EXPECT_GT(checked, 5000);
}

TEST(BoostSegmentOracle, PocketWithIslands) {
  std::mt19937 rng(11);
  int checked = 0, cases = 0;
  for (int round = 0; round < 6; ++round) {
    std::vector<Polygon> polys{IntegerStar(60, rng, 0, 0, 900000, 1000000, false)};
    for (int i = 0; i < 3; ++i)
      for (int j = 0; j < 3; ++j)
        polys.push_back(IntegerStar(7, rng, -400000 + 400000 * i, -400000 + 400000 * j, 60000, 150000, true));
    if (!Simple(polys)) continue;
    ++cases;
    const Outcome o = Compare(polys);
    ASSERT_EQ(o.error, "") << "round " << round;
    checked += o.boostChecked;
  }
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
  const Outcome o = Compare({p});
  EXPECT_EQ(o.error, "");
  EXPECT_GT(o.boostChecked, 100);
}

}  // namespace
}  // namespace zt
