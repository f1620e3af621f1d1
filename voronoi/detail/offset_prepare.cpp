// Offset preparation and side classification (see offset_prepare.hpp).
#include "voronoi/detail/offset_prepare.hpp"

#include <cassert>
#include <cmath>
#include <cstdio>

#include "voronoi/detail/bisector_split.hpp"
#include "voronoi/detail/diagram.hpp"
#include "voronoi/detail/offset_edge.hpp"
#include "voronoi/detail/offset_state.hpp"

namespace zt::vd {

namespace {

// The four outer edges of the initial diagram never carry offsets.
constexpr std::int32_t kFirstInnerEdge = 4;

void SquareRootRadii() {
  Engine& g = Vd();
  if (!g.nodeRadiiSquared) return;
  for (std::int32_t n = 0; n < g.nodes.count; ++n) g.nodes[n].r = std::sqrt(std::fmax(g.nodes[n].r, 0.0));
  g.nodeRadiiSquared = false;
}

// Position of node n along direction (dx, dy) from (ox, oy).
double Along(std::int32_t n, double ox, double oy, double dx, double dy) {
  const NodeRecord& r = Vd().nodes[n];
  return (r.x - ox) * dx + (r.y - oy) * dy;
}

bool Straddles(double u1, double u2) {
  return (u1 < -kOffsetZero && u2 > kOffsetZero) || (u1 > kOffsetZero && u2 < -kOffsetZero);
}

// A reflex corner facing a wall across a narrow neck: the clearance along
// the edge between the corner point and the wall falls to the parabola's
// apex and rises again. A sweep that takes the clearance of an edge to run
// between its end radii would skip the edge and cut through the neck, so
// the edge is split at the apex (the midpoint of the point and its foot).
// Bisectors of two points that still pass the points' midpoint (the split
// after the points were inserted skips edges ending at degree-2 nodes) are
// split there for the same reason.
void SplitAtClearanceMinima() {
  Engine& g = Vd();
  const std::int32_t edgeCount = g.edges.count;  // the new halves need no split
  for (std::int32_t e = kFirstInnerEdge; e < edgeCount; ++e) {
    const EdgeRecord r = g.edges[e];
    if (r.deleted) continue;
    const OffsetEdgeKind kind = EdgeKindOf(r);
    if (kind == OffsetEdgeKind::kParabola) {
      const bool pointLeft = r.ltype == PNT;
      const PointRecord& p = g.points[pointLeft ? r.lft : r.rgt];
      const SegmentRecord& s = g.segments[pointLeft ? r.rgt : r.lft];
      const double d = s.a * p.x + s.b * p.y + s.c;
      if (std::fabs(d) <= kOffsetZero) continue;
      const double fx = p.x - d * s.a, fy = p.y - d * s.b;
      if (!Straddles(Along(r.n1, fx, fy, -s.b, s.a), Along(r.n2, fx, fy, -s.b, s.a))) continue;
      SplitEdge(e, NewNode(0.5 * (p.x + fx), 0.5 * (p.y + fy), 0.5 * std::fabs(d)), false);
    } else if (kind == OffsetEdgeKind::kPointPoint) {
      const PointRecord& p = g.points[r.lft];
      const PointRecord& q = g.points[r.rgt];
      const double dx = q.x - p.x, dy = q.y - p.y, len = std::hypot(dx, dy);
      if (len <= kOffsetZero) continue;
      const double mx = 0.5 * (p.x + q.x), my = 0.5 * (p.y + q.y);
      if (!Straddles(Along(r.n1, mx, my, -dy / len, dx / len), Along(r.n2, mx, my, -dy / len, dx / len))) continue;
      SplitEdge(e, NewNode(mx, my, 0.5 * len), false);
    }
  }
}

bool IsDummyPoint(std::int32_t p) {
  const Engine& g = Vd();
  return p <= 1 || p >= g.points.count - 2;
}

// Step 2 of the edge choice: a live edge between two real sites.
bool Qualifies(const EdgeRecord& r) {
  if (r.deleted || r.lft < 0 || r.rgt < 0) return false;
  if (r.ltype == kNoSiteKind || r.rtype == kNoSiteKind) return false;
  if (r.ltype == PNT && IsDummyPoint(r.lft)) return false;
  if (r.rtype == PNT && IsDummyPoint(r.rgt)) return false;
  return true;
}

void Push(std::int32_t edge, std::int32_t node) {
  Offs().stack.Append(TraversalEntry{edge, node}, kTraversalGrowth);
}

// Takes edge e into the current part: clears its flag and lists it.
void Take(std::int32_t e) {
  OffsetState& o = Offs();
  o.candidate[e] = 0;
  o.component.Append(e, kTraversalGrowth);
}

// Flood fill of the part of the diagram around edge e0 bounded by the input
// segments (nodes of zero clearance are never passed): one face of the
// input, whose edges end up in `component`.
void CollectPart(std::int32_t e0, std::int32_t start) {
  Engine& g = Vd();
  OffsetState& o = Offs();
  o.stack.count = 0;
  o.component.count = 0;
  Take(e0);
  Push(e0, start);
  Push(e0, OtherNode(g.edges[e0], start));
  while (o.stack.count > 0) {
    const TraversalEntry t = o.stack[--o.stack.count];
    if (g.nodes[t.node].r <= kOffsetZero) continue;
    const EdgeRecord& r = g.edges[t.edge];
    const std::int32_t ccw = CcwAt(r, t.node), cw = CwAt(r, t.node);
    for (const std::int32_t f : {ccw, cw}) {
      if (f < 0 || !ValidEdge(f) || !o.candidate[f]) continue;
      Take(f);
      Push(f, OtherNode(g.edges[f], t.node));
    }
  }
}

// Sides of a segment that the current part lies on.
constexpr std::uint8_t kOnLeft = 1;
constexpr std::uint8_t kOnRight = 2;

// Notes the side of segment `seg` on which edge r (one of its region's
// edges) lies, judged at r's node of larger clearance.
void NoteSide(const EdgeRecord& r, std::int32_t seg) {
  Engine& g = Vd();
  OffsetState& o = Offs();
  const NodeRecord& n = g.nodes[g.nodes[r.n1].r >= g.nodes[r.n2].r ? r.n1 : r.n2];
  if (n.r <= kOffsetZero) return;
  const SegmentRecord& s = g.segments[seg];
  const double side = s.a * n.x + s.b * n.y + s.c;
  if (std::fabs(side) <= kOffsetZero) return;
  std::uint8_t& m = o.segmentSides[seg];
  if (m == 0) o.bordered.Append(seg, kTraversalGrowth);
  m |= side > 0.0 ? kOnLeft : kOnRight;
}

// Whether the current part lies on the wanted side of the input. A segment
// with the part on both of its sides (a spike, a there-and-back contour, an
// open polyline) lies on both sides of it and decides nothing; the others
// decide by their lengths, so the answer is the same whatever edge the part
// was reached from. A part bordered only by such two-sided segments lies on
// both sides: its offsets are strokes around them.
bool PartOnSide(bool left) {
  Engine& g = Vd();
  OffsetState& o = Offs();
  for (std::int32_t i = 0; i < o.component.count; ++i) {
    const EdgeRecord& r = g.edges[o.component[i]];
    if (r.ltype == SEG && r.lft >= 0) NoteSide(r, r.lft);
    if (r.rtype == SEG && r.rgt >= 0) NoteSide(r, r.rgt);
  }
  double leftLength = 0.0, rightLength = 0.0;
  for (std::int32_t i = 0; i < o.bordered.count; ++i) {
    std::uint8_t& m = o.segmentSides[o.bordered[i]];
    if (m == kOnLeft) leftLength += g.segments[o.bordered[i]].length;
    if (m == kOnRight) rightLength += g.segments[o.bordered[i]].length;
    m = 0;
  }
  o.bordered.count = 0;
  return left ? leftLength >= rightLength : rightLength >= leftLength;
}

}  // namespace

void PrepareDiagramForOffsets() {
  Engine& g = Vd();
  OffsetState& o = Offs();
  if (o.preparedGeneration == g.generation && !g.nodeRadiiSquared && g.bisectorsSplit) return;
  SquareRootRadii();
  SplitPointBisectors();
  if (o.preparedGeneration != g.generation) SplitAtClearanceMinima();
  o.preparedGeneration = g.generation;
}

void InitializeEdgeData(bool left, bool right) {
  Engine& g = Vd();
  OffsetState& o = Offs();
  const std::int32_t n = g.edges.count;
  o.candidate.Reserve(std::int64_t{n} + 1);
  o.crossedPass.Reserve(std::int64_t{n} + 1);
  o.data.Reserve(std::int64_t{n} + 1);
  if (o.dataGeneration != g.generation || o.data.count != n) {
    for (std::int32_t e = 0; e < n; ++e) {
      o.data[e].needsComputing = 1;
      o.crossedPass[e] = -1;
    }
    if (!g.medialAxisComputed)
      for (std::int32_t e = 0; e < n; ++e) g.edges[e].maMark = 0;
    o.dataGeneration = g.generation;
  }
  o.candidate.count = o.crossedPass.count = o.data.count = n;
  o.workList.count = 0;
  for (std::int32_t e = 0; e < n; ++e) o.candidate[e] = 1;

  if (!left && !right) {
    for (std::int32_t e = kFirstInnerEdge; e < n; ++e)
      if (Qualifies(g.edges[e])) o.workList.Append(e, kTraversalGrowth);
  } else {
    o.segmentSides.Reserve(std::int64_t{g.segments.count} + 1);
    o.segmentSides.count = g.segments.count;
    for (std::int32_t k = 0; k < g.segments.count; ++k) o.segmentSides[k] = 0;
    for (std::int32_t e = kFirstInnerEdge; e < n; ++e) {
      if (!o.candidate[e]) continue;
      const EdgeRecord& r = g.edges[e];
      if (!Qualifies(r)) continue;
      if (r.ltype == ARC || r.rtype == ARC) {
        std::fputs("InitializeEdgeData: circular arcs not supported\n", stderr);
        continue;
      }
      if (r.ltype != SEG && r.rtype != SEG) continue;
      const std::int32_t start = g.nodes[r.n1].r >= g.nodes[r.n2].r ? r.n1 : r.n2;
      if (g.nodes[start].r <= kOffsetZero) continue;
      CollectPart(e, start);
      if (!PartOnSide(left)) continue;
      for (std::int32_t i = 0; i < o.component.count; ++i) {
        const std::int32_t f = o.component[i];
        if (f >= kFirstInnerEdge && Qualifies(g.edges[f])) o.workList.Append(f, kTraversalGrowth);
      }
    }
  }
  for (std::int32_t e = 0; e < n; ++e) o.candidate[e] = e >= kFirstInnerEdge ? 1 : 0;
}

void ResetOffsetState() {
  OffsetState& o = Offs();
  o.candidate.count = 0;
  o.crossedPass.count = 0;
  o.data.count = 0;
  o.workList.count = 0;
  o.stack.count = 0;
  o.component.count = 0;
  o.bordered.count = 0;
  o.finished = true;
  o.written = false;
  o.failed = false;
  o.lastGeneration = -1;
  o.preparedGeneration = -1;
  o.dataGeneration = -1;
}

void FreeOffsetState() {
  OffsetState& o = Offs();
  ResetOffsetState();
  o.candidate.Free();
  o.crossedPass.Free();
  o.data.Free();
  o.workList.Free();
  o.stack.Free();
  o.component.Free();
  o.bordered.Free();
  o.segmentSides.Free();
}

}  // namespace zt::vd
