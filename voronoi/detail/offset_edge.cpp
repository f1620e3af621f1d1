// Per-edge data and crossing points (see offset_edge.hpp).
#include "voronoi/detail/offset_edge.hpp"

#include <cassert>
#include <cmath>
#include <cstdio>
#include <utility>

namespace zt::vd {

namespace {

// A degenerate line edge is sampled at tenths of its radius range.
constexpr int kDegenerateLineSteps = 10;

bool SegmentEndsAt(std::int32_t seg, std::int32_t point) {
  const SegmentRecord& s = Vd().segments[seg];
  return s.i1 == point || s.i2 == point;
}

// The end nodes of an edge by increasing clearance.
struct Ends {
  const NodeRecord& lo;
  const NodeRecord& hi;
};
Ends EndsOf(const EdgeRecord& r) {
  const NodeRecord& a = Vd().nodes[r.n1];
  const NodeRecord& b = Vd().nodes[r.n2];
  return a.r < b.r ? Ends{a, b} : Ends{b, a};
}
// An edge whose clearance does not vary (within kOffsetZero) has no
// crossing formula: its data is marked degenerate.
bool FlatClearance(const NodeRecord& lo, const NodeRecord& hi) { return std::fabs(hi.r - lo.r) <= kOffsetZero; }

void LineData(const EdgeRecord& r, OffsetEdgeData& d) {
  const auto [lo, hi] = EndsOf(r);
  if (FlatClearance(lo, hi)) {
    d.degenerate = 1;
    return;
  }
  d.v0 = hi.x - lo.x;
  d.v1 = hi.y - lo.y;
}

// The edge lies on one side of the midpoint M of its points (bisectors are
// split there), so its points at clearance t are M + sqrt(t^2 - h^2) u with
// u the unit normal of the points' chord pointing towards the edge. Taking
// the crossing from M rather than from an end node keeps it exact where the
// node's radius is close to h and sqrt(r^2 - h^2) would amplify its error.
void PointPointData(const EdgeRecord& r, OffsetEdgeData& d) {
  const Engine& g = Vd();
  const auto [lo, hi] = EndsOf(r);
  if (FlatClearance(lo, hi) || std::hypot(hi.x - lo.x, hi.y - lo.y) <= kOffsetZero) {
    d.degenerate = 1;
    return;
  }
  const PointRecord& p1 = g.points[r.lft];
  const PointRecord& p2 = g.points[r.rgt];
  const double dx = p1.x - p2.x, dy = p1.y - p2.y;
  const double len = std::hypot(dx, dy);
  if (len <= kOffsetZero) {
    d.degenerate = 1;
    return;
  }
  double ux = -dy / len, uy = dx / len;
  const double mx = 0.5 * (p1.x + p2.x), my = 0.5 * (p1.y + p2.y);
  if ((hi.x - mx) * ux + (hi.y - my) * uy < 0.0) {
    ux = -ux;
    uy = -uy;
  }
  d.v0 = ux;
  d.v1 = uy;
  d.v2 = (dx * dx + dy * dy) / 4.0;
}

// The diagram leaves the segment on either side of such an edge, so the
// swap is routine here: its diagnostic is written once per diagram, not once
// per edge, to keep the console of a batch run readable.
void ParabolaData(const EdgeRecord& r, OffsetEdgeData& d) {
  const Engine& g = Vd();
  std::int32_t seg = r.lft, pnt = r.rgt;
  if (r.ltype != SEG) {
    thread_local std::int32_t reportedGeneration = -1;
    if (reportedGeneration != g.generation) {
      reportedGeneration = g.generation;
      std::fputs("CreateParabolaData(): in else branch!\n", stderr);
    }
    std::swap(seg, pnt);
  }
  const auto [lo, hi] = EndsOf(r);
  if (FlatClearance(lo, hi)) {
    d.degenerate = 1;
    return;
  }
  const SegmentRecord& s = g.segments[seg];
  const PointRecord& p = g.points[pnt];
  const double dist = s.a * p.x + s.b * p.y + s.c;
  d.v0 = p.x - dist * s.a;
  d.v1 = p.y - dist * s.b;
  d.v2 = dist;
  double side = dist;
  if (std::fabs(dist) <= kOffsetZero) side = s.a * hi.x + s.b * hi.y + s.c;
  const double nx = side < 0.0 ? -s.a : s.a;
  const double ny = side < 0.0 ? -s.b : s.b;
  // tau = (n.y, -n.x)
  d.branch = (hi.x - p.x) * ny + (hi.y - p.y) * -nx > 0.0 ? 1 : 0;
}

}  // namespace

OffsetEdgeKind EdgeKindOf(const EdgeRecord& r) {
  if (r.lft < 0 || r.rgt < 0) return OffsetEdgeKind::kOther;
  const std::int32_t lt = r.ltype, rt = r.rtype;
  if (lt == PNT && rt == PNT) return OffsetEdgeKind::kPointPoint;
  if (lt == SEG && rt == SEG) return OffsetEdgeKind::kLine;
  if (lt == SEG && rt == PNT)
    return SegmentEndsAt(r.lft, r.rgt) ? OffsetEdgeKind::kLine : OffsetEdgeKind::kParabola;
  if (lt == PNT && rt == SEG)
    return SegmentEndsAt(r.rgt, r.lft) ? OffsetEdgeKind::kLine : OffsetEdgeKind::kParabola;
  return OffsetEdgeKind::kOther;
}

void EnsureEdgeData(std::int32_t e) {
  OffsetEdgeData& d = Offs().data[e];
  if (!d.needsComputing) return;
  const EdgeRecord& r = Vd().edges[e];
  d = OffsetEdgeData{};
  d.kind = EdgeKindOf(r);
  switch (d.kind) {
    case OffsetEdgeKind::kLine: LineData(r, d); break;
    case OffsetEdgeKind::kPointPoint: PointPointData(r, d); break;
    case OffsetEdgeKind::kParabola: ParabolaData(r, d); break;
    case OffsetEdgeKind::kOther: d.degenerate = 1; break;
  }
}

OffsetPoint CrossingPoint(std::int32_t e, double t) {
  const Engine& g = Vd();
  const EdgeRecord& r = g.edges[e];
  const OffsetEdgeData& d = Offs().data[e];
  assert(!d.needsComputing);
  const NodeRecord& a = g.nodes[r.n1];
  const NodeRecord& b = g.nodes[r.n2];
  const NodeRecord& lo = a.r < b.r ? a : b;
  const NodeRecord& hi = a.r < b.r ? b : a;
  const OffsetPoint mid{0.5 * (a.x + b.x), 0.5 * (a.y + b.y)};
  switch (d.kind) {
    case OffsetEdgeKind::kLine: {
      if (d.degenerate) {
        // The radii agree within kOffsetZero: any point of the edge will do;
        // prefer an end node that has exactly the distance.
        if (a.r == t) return {a.x, a.y};
        if (b.r == t) return {b.x, b.y};
        int k = 1;
        while (k < kDegenerateLineSteps + 1 && !(t <= lo.r + k * (hi.r - lo.r) / kDegenerateLineSteps)) ++k;
        const double f = (k - 0.5) / kDegenerateLineSteps;
        return {lo.x + f * (hi.x - lo.x), lo.y + f * (hi.y - lo.y)};
      }
      const double f = (t - lo.r) / (hi.r - lo.r);
      return {lo.x + f * d.v0, lo.y + f * d.v1};
    }
    case OffsetEdgeKind::kPointPoint: {
      if (d.degenerate) return mid;
      const PointRecord& p1 = g.points[r.lft];
      const PointRecord& p2 = g.points[r.rgt];
      const double s = std::sqrt(std::fmax(0.0, t * t - d.v2));
      return {0.5 * (p1.x + p2.x) + s * d.v0, 0.5 * (p1.y + p2.y) + s * d.v1};
    }
    case OffsetEdgeKind::kParabola: {
      if (d.degenerate) return mid;
      const SegmentRecord& s = g.segments[r.ltype == SEG ? r.lft : r.rgt];
      double dist = d.v2, nx = s.a, ny = s.b;
      if (dist < 0.0) {
        dist = -dist;
        nx = -nx;
        ny = -ny;
      }
      const double w2 = (2.0 * t - dist) * dist;
      if (w2 < 0.0) return {d.v0 + 0.5 * dist * nx, d.v1 + 0.5 * dist * ny};
      const double sgn = d.branch ? 1.0 : -1.0;
      const double w = std::sqrt(w2);
      return {d.v0 + t * nx + sgn * w * ny, d.v1 + t * ny - sgn * w * nx};
    }
    case OffsetEdgeKind::kOther: break;
  }
  return mid;
}

}  // namespace zt::vd
