// Matching our diagram's nodes against another diagram's vertices, for the
// oracle suites: the corner points of our diagram (a vertex whose circle
// holds one is no vertex of ours), our nodes, and the search both ways
// within a tolerance.
#pragma once

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <sstream>
#include <string>
#include <vector>

#include "vd_test_util.hpp"

namespace zt::vdtest {

inline void SortByX(std::vector<Pt>& v) {
  std::sort(v.begin(), v.end(), [](Pt a, Pt b) { return a.x < b.x; });
}

// Whether some point of `b` (sorted by x) lies within tol of p.
inline bool Near(const std::vector<Pt>& b, Pt p, double tol) {
  auto it = std::lower_bound(b.begin(), b.end(), p.x - tol, [](const Pt& q, double v) { return q.x < v; });
  for (; it != b.end() && it->x <= p.x + tol; ++it)
    if (std::fabs(it->y - p.y) <= tol) return true;
  return false;
}

// 1e-9 of the extent of the points (at least of 1).
inline double ExtentTolerance(const std::vector<Pt>& pts) {
  double minX = 1e300, maxX = -1e300, minY = 1e300, maxY = -1e300;
  for (const Pt& p : pts) {
    minX = std::min(minX, p.x), maxX = std::max(maxX, p.x);
    minY = std::min(minY, p.y), maxY = std::max(maxY, p.y);
  }
  return 1e-9 * std::max({maxX - minX, maxY - minY, 1.0});
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

inline std::string Describe(Pt p) {
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

}  // namespace zt::vdtest
