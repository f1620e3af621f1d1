// Checks of edges that touch segments (see segment_checks.hpp).
#include "voronoi/detail/segment_checks.hpp"

#include <cmath>
#include <cstdio>

#include "voronoi/detail/diagram.hpp"
#include "voronoi/detail/node_check.hpp"
#include "voronoi/detail/node_on_edge.hpp"

namespace zt::vd {
namespace {

// Samples along an edge for the monotonicity check.
constexpr int kSamples = 8;

std::string Fail(const char* what, std::int32_t e, double value) {
  char buf[160];
  std::snprintf(buf, sizeof buf, "edge %d: %s (%.3g)", e, what, value);
  return buf;
}

bool Checked(std::int32_t kind) { return kind == PNT || kind == SEG; }

}  // namespace

std::string CheckSegmentEdges() {
  const Engine& g = Vd();
  if (g.nodeRadiiSquared) return {};
  for (std::int32_t e = 0; e < g.edges.count; ++e) {
    const EdgeRecord& er = g.edges[e];
    if (er.deleted || er.n1 < 4 || er.n2 < 4) continue;  // far nodes close the outer face
    if (!Checked(er.ltype) || !Checked(er.rtype) || (er.ltype != SEG && er.rtype != SEG)) continue;
    geo::EdgeFrame f = EdgeFromRecords(e);
    f.n1.deleted = false;  // sample from n1 (u = 0) to n2 (u = 1)
    f.n2.deleted = true;
    const Point2d mid = geo::edge_point(f, 0.5);
    const double dl = f.left.dist(mid), dr = f.right.dist(mid);
    if (!(std::fabs(dl - dr) <= kEdgeCheckTolerance * (1.0 + dl))) return Fail("midpoint not equidistant", e, dl - dr);
    const bool ownEnd = (er.ltype == SEG && er.rtype == PNT && f.left.seg.has_end(er.rgt)) ||
                        (er.rtype == SEG && er.ltype == PNT && f.right.seg.has_end(er.lft));
    if (!ownEnd && !(er.ltype == SEG && er.rtype == SEG)) continue;
    double prev = f.left.dist(geo::edge_point(f, 0.0));
    int direction = 0;
    for (int i = 1; i <= kSamples; ++i) {
      const double r = f.left.dist(geo::edge_point(f, static_cast<double>(i) / kSamples));
      const double tol = kEdgeCheckTolerance * (1.0 + r);
      const int step = r > prev + tol ? 1 : (r < prev - tol ? -1 : 0);
      if (step != 0 && direction != 0 && step != direction) return Fail("clearance not monotone", e, r - prev);
      if (step != 0) direction = step;
      prev = r;
    }
  }
  return {};
}

}  // namespace zt::vd
