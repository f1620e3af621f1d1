// Invariant checker (see checker.hpp).
#include "voronoi/detail/checker.hpp"

#include <cmath>
#include <cstdio>
#include <vector>

#include "voronoi/detail/diagram.hpp"

namespace zt::vd {

namespace {

// The far nodes closing the outer face are always the first four nodes.
constexpr std::int32_t kFarNodes = 4;

std::string Fail(const char* fmt, long a = 0, long b = 0, long c = 0) {
  char buf[256];
  std::snprintf(buf, sizeof buf, fmt, a, b, c);
  return buf;
}

bool LiveEdge(std::int32_t e) { return ValidEdge(e) && !Vd().edges[e].deleted; }
bool LiveNode(std::int32_t n) { return ValidNode(n) && Vd().nodes[n].status != DELETED; }

inline double sq(double v) { return v * v; }

double Radius(const NodeRecord& n) {
  return Vd().nodeRadiiSquared ? std::sqrt(std::fmax(n.r, 0.0)) : n.r;
}

double SiteDistance(std::int32_t site, std::int32_t kind, double x, double y) {
  const Engine& g = Vd();
  if (kind == PNT) return std::sqrt(sq(g.points[site].x - x) + sq(g.points[site].y - y));
  if (kind == SEG) {
    const SegmentRecord& s = g.segments[site];
    const PointRecord& a = g.points[s.i1];
    const PointRecord& b = g.points[s.i2];
    const double dx = b.x - a.x, dy = b.y - a.y;
    const double l2 = dx * dx + dy * dy;
    double t = l2 > 0 ? ((x - a.x) * dx + (y - a.y) * dy) / l2 : 0.0;
    t = std::fmin(1.0, std::fmax(0.0, t));
    return std::sqrt(sq(a.x + t * dx - x) + sq(a.y + t * dy - y));
  }
  return NAN;  // arcs are never in the diagram
}

// True when the foot of (x, y) on the segment's line lies on the segment
// within tol.
bool WithinExtent(std::int32_t site, double x, double y, double tol) {
  const Engine& g = Vd();
  const SegmentRecord& s = g.segments[site];
  const PointRecord& a = g.points[s.i1];
  const PointRecord& b = g.points[s.i2];
  const double dx = b.x - a.x, dy = b.y - a.y;
  const double len = std::sqrt(dx * dx + dy * dy);
  if (!(len > 0.0)) return true;
  const double t = ((x - a.x) * dx + (y - a.y) * dy) / len;
  return t >= -tol && t <= len + tol;
}

std::string CheckTopology(std::int32_t& liveNodes, std::int32_t& liveEdges) {
  const Engine& g = Vd();
  liveNodes = liveEdges = 0;
  for (std::int32_t n = 0; n < g.nodes.count; ++n) {
    if (!LiveNode(n)) continue;
    ++liveNodes;
    const std::int32_t e = g.nodes[n].edge;
    if (!LiveEdge(e)) return Fail("node %ld: edge field %ld is not a live edge", n, e);
    if (g.edges[e].n1 != n && g.edges[e].n2 != n) return Fail("node %ld: edge %ld does not end at it", n, e);
  }
  for (std::int32_t e = 0; e < g.edges.count; ++e) {
    if (!LiveEdge(e)) continue;
    ++liveEdges;
    const EdgeRecord& r = g.edges[e];
    if (!LiveNode(r.n1) || !LiveNode(r.n2)) return Fail("edge %ld: end node %ld or %ld not live", e, r.n1, r.n2);
    if (r.n1 == r.n2) return Fail("edge %ld: both ends at node %ld", e, r.n1);
    for (const std::int32_t n : {r.n1, r.n2}) {
      const std::int32_t ccw = CcwAt(r, n), cw = CwAt(r, n);
      if (!LiveEdge(ccw) || !LiveEdge(cw)) return Fail("edge %ld: neighbour at node %ld not live", e, n);
      const EdgeRecord& a = g.edges[ccw];
      if (a.n1 != n && a.n2 != n) return Fail("edge %ld: ccw neighbour %ld misses node %ld", e, ccw, n);
      if (CwAt(a, n) != e) return Fail("edge %ld: cw of its ccw neighbour %ld at node %ld differs", e, ccw, n);
      const std::int32_t degree = g.nodes[n].degree2 ? 2 : 3;
      std::int32_t f = e;
      std::int32_t steps = 0;
      do {
        f = CcwAt(g.edges[f], n);
        ++steps;
      } while (f != e && steps <= degree);
      if (steps != degree) return Fail("node %ld: rotation from edge %ld takes %ld steps", n, e, steps);
    }
  }
  return {};
}

// Walks every region boundary once; checks one site per cycle and one
// cycle per site.
std::string CheckFaces(std::int32_t& faces, const CheckOptions& options) {
  const Engine& g = Vd();
  faces = 0;
  std::vector<std::uint8_t> seen(2 * static_cast<std::size_t>(g.edges.count), 0);
  std::vector<std::int32_t> pointFaces(g.points.count, 0), segmentFaces(g.segments.count, 0);
  std::int32_t outerFaces = 0;
  for (std::int32_t e0 = 0; e0 < g.edges.count; ++e0) {
    if (!LiveEdge(e0)) continue;
    for (int side = 0; side < 2; ++side) {
      if (seen[2 * e0 + side]) continue;
      const std::int32_t site = side == 0 ? g.edges[e0].lft : g.edges[e0].rgt;
      const std::int32_t kind = side == 0 ? g.edges[e0].ltype : g.edges[e0].rtype;
      ++faces;
      std::int32_t e = e0;
      int s = side;
      std::int64_t steps = 0;
      do {
        seen[2 * e + s] = 1;
        const EdgeRecord& r = g.edges[e];
        if ((s == 0 ? r.lft : r.rgt) != site || (s == 0 ? r.ltype : r.rtype) != kind)
          return Fail("region of site %ld (kind %ld) continues into edge %ld of another site", site, kind, e);
        const std::int32_t exit = s == 0 ? r.n2 : r.n1;
        const std::int32_t next = CwAt(r, exit);
        s = g.edges[next].n1 == exit ? 0 : 1;
        e = next;
        if (++steps > 2 * std::int64_t{g.edges.count}) return Fail("region of site %ld does not close", site);
      } while (e != e0 || s != side);
      if (site < 0) {
        ++outerFaces;
      } else if (kind == PNT) {
        ++pointFaces[site];
      } else if (kind == SEG) {
        ++segmentFaces[site];
      }
    }
  }
  if (outerFaces != 1) return Fail("%ld outer faces", outerFaces);
  for (std::int32_t i = 0; i < g.points.count; ++i) {
    const PointRecord& p = g.points[i];
    if (pointFaces[i] > 1) return Fail("point %ld has %ld regions", i, pointFaces[i]);
    if (p.vd >= 0) {
      if (pointFaces[i] != 1) return Fail("point %ld has a region pointer but no region", i);
      const EdgeRecord& r = g.edges[p.vd];
      if (!LiveEdge(p.vd) || !((r.lft == i && r.ltype == PNT) || (r.rgt == i && r.rtype == PNT)))
        return Fail("point %ld: region pointer %ld does not bound it", i, p.vd);
    } else if (pointFaces[i] != 0) {
      return Fail("point %ld has a region but no region pointer", i);
    } else if (options.complete && !p.deleted) {
      return Fail("point %ld has no region", i);
    }
  }
  for (std::int32_t i = 0; i < g.segments.count; ++i) {
    if (segmentFaces[i] > 1) return Fail("segment %ld has %ld regions", i, segmentFaces[i]);
    if (options.complete && segmentFaces[i] != 1) return Fail("segment %ld has no region", i);
  }
  return {};
}

std::string CheckGeometry(const CheckOptions& options) {
  const Engine& g = Vd();
  for (std::int32_t n = kFarNodes; n < g.nodes.count; ++n) {
    if (!LiveNode(n)) continue;
    const NodeRecord& node = g.nodes[n];
    const double r = Radius(node);
    const double tol = kCheckTolerance * (1.0 + r);
    const std::int32_t e0 = node.edge;
    std::int32_t e = e0;
    do {
      const EdgeRecord& er = g.edges[e];
      const std::int32_t site = LeftSiteFrom(er, n), kind = LeftKindFrom(er, n);
      if (site >= 0) {
        const double d = SiteDistance(site, kind, node.x, node.y);
        if (!(std::fabs(d - r) <= tol))
          return Fail("node %ld: distance to site %ld differs from its radius (x1e12: %ld)", n, site,
                      static_cast<long>((d - r) * 1e12));
        // A segment's region lies over the segment: beyond its ends the
        // end points own the plane. At a tie of distances only this tells a
        // region handed to the wrong site.
        if (kind == SEG && !WithinExtent(site, node.x, node.y, tol))
          return Fail("node %ld: lies beyond the ends of segment %ld, whose region it bounds", n, site);
      }
      // Local emptiness: the site beyond the neighbour node.
      const std::int32_t w = OtherNode(er, n);
      if (!options.bruteForce && w >= kFarNodes && !g.nodes[w].degree2 && !node.degree2) {
        const EdgeRecord& next = g.edges[CcwAt(er, w)];
        const std::int32_t across = LeftSiteFrom(next, w), akind = LeftKindFrom(next, w);
        if (across >= 0) {
          const double d = SiteDistance(across, akind, node.x, node.y);
          if (!(d >= r - tol)) return Fail("node %ld: site %ld beyond edge %ld lies inside its circle", n, across, e);
        }
      }
      e = CcwAt(er, n);
    } while (e != e0);
    if (options.bruteForce) {
      for (std::int32_t i = 0; i < g.points.count; ++i) {
        if (g.points[i].vd < 0) continue;
        const double d = SiteDistance(i, PNT, node.x, node.y);
        if (!(d >= r - tol)) return Fail("node %ld: point %ld lies inside its circle", n, i);
      }
      for (std::int32_t i = 0; i < g.segments.count; ++i) {
        if (g.segments[i].vd < 0) continue;
        const double d = SiteDistance(i, SEG, node.x, node.y);
        if (!(d >= r - tol)) return Fail("node %ld: segment %ld lies inside its circle", n, i);
      }
    }
  }
  return {};
}

}  // namespace

std::string CheckDiagram(const CheckOptions& options) {
  std::int32_t v = 0, e = 0, f = 0;
  std::string error = CheckTopology(v, e);
  if (error.empty()) error = CheckFaces(f, options);
  if (error.empty() && v - e + f != 2) error = Fail("V - E + F is not 2: V %ld, E %ld, F %ld", v, e, f);
  if (error.empty() && options.geometry) error = CheckGeometry(options);
  return error;
}

}  // namespace zt::vd
