// Offset preparation and side classification (see offset_prepare.hpp).
#include "voronoi/detail/offset_prepare.hpp"

#include <algorithm>
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

// Sides of a segment that the current part lies on.
constexpr std::uint8_t kOnLeft = 1;
constexpr std::uint8_t kOnRight = 2;

// Notes the side of segment `seg` on which node n lies. n is a node of
// non-zero clearance on an edge of the segment's region: it lies in the
// segment's slab at its clearance from the segment's line, so the sign of
// the line's equation is the side of the whole edge.
void NoteSide(Engine& g, OffsetState& o, const NodeRecord& n, std::int32_t seg) {
  const SegmentRecord& s = g.segments[seg];
  const double side = s.a * n.x + s.b * n.y + s.c;
  if (std::fabs(side) <= kOffsetZero) return;
  std::uint8_t& m = o.segmentSides[seg];
  if (m == 0) o.bordered.Append(seg, kTraversalGrowth);
  m |= side > 0.0 ? kOnLeft : kOnRight;
}

// Takes edge e, reached at its node `at` (of non-zero clearance), into the
// current part: clears its flag, lists it when it may carry offsets and
// notes the sides of its segment sites while its records are at hand.
void Take(Engine& g, OffsetState& o, std::int32_t e, std::int32_t at) {
  o.candidate[e] = 0;
  const EdgeRecord& r = g.edges[e];
  if (e >= kFirstInnerEdge && Qualifies(r)) o.component.Append(e, kTraversalGrowth);
  const NodeRecord& n = g.nodes[at];
  if (r.ltype == SEG && r.lft >= 0) NoteSide(g, o, n, r.lft);
  if (r.rtype == SEG && r.rgt >= 0) NoteSide(g, o, n, r.rgt);
}

// Flood fill of the part of the diagram around edge e0 bounded by the input
// segments (nodes of zero clearance are never passed): one face of the
// input, whose edges that may carry offsets are appended to `component`.
// `start` is a node of e0 of non-zero clearance.
void CollectPart(std::int32_t e0, std::int32_t start) {
  Engine& g = Vd();
  OffsetState& o = Offs();
  o.stack.count = 0;
  Take(g, o, e0, start);
  Push(e0, start);
  Push(e0, OtherNode(g.edges[e0], start));
  while (o.stack.count > 0) {
    const TraversalEntry t = o.stack[--o.stack.count];
    if (g.nodes[t.node].r <= kOffsetZero) continue;
    const EdgeRecord& r = g.edges[t.edge];
    const std::int32_t ccw = CcwAt(r, t.node), cw = CwAt(r, t.node);
    for (const std::int32_t f : {ccw, cw}) {
      if (f < 0 || !ValidEdge(f) || !o.candidate[f]) continue;
      Take(g, o, f, t.node);
      Push(f, OtherNode(g.edges[f], t.node));
    }
  }
}

std::int32_t Group(OffsetState& o, std::int32_t p) {
  while (o.parts[p].parent != p) p = o.parts[p].parent = o.parts[o.parts[p].parent].parent;
  return p;
}

void Link(OffsetState& o, std::int32_t p, std::int32_t q) {
  p = Group(o, p);
  q = Group(o, q);
  if (p != q) o.parts[std::max(p, q)].parent = std::min(p, q);
}

// Closes part `p`, just collected, from the segments it borders. A segment
// with the part on one side votes by its length for that side, in the
// direction it was given most. A segment with the part on both of its
// sides (an open polyline, a there-and-back piece) decides nothing. A
// segment given both ways (a spike, an edge two touching contours share)
// bounds no area: it decides nothing either, and the parts on its two sides
// lie on the same side of the input, so they join one group.
void ClosePart(std::int32_t p) {
  Engine& g = Vd();
  OffsetState& o = Offs();
  PartRecord& part = o.parts[p];
  for (std::int32_t i = 0; i < o.bordered.count; ++i) {
    const std::int32_t seg = o.bordered[i];
    std::uint8_t& m = o.segmentSides[seg];
    const SegmentRecord& s = g.segments[seg];
    if (s.directions == 0) {
      std::int32_t& beside = o.segmentPart[seg];
      if (beside < 0) beside = p;
      else Link(o, beside, p);
    } else if (m != (kOnLeft | kOnRight)) {
      ((m == kOnLeft) == (s.directions > 0) ? part.leftLength : part.rightLength) += s.length;
    }
    m = 0;
  }
  o.bordered.count = 0;
}

// Whether the group of root `p` lies on the wanted side of the input, by
// the lengths its parts' one-sided segments vote for, so the answer is the
// same whatever edge, site or contour came first. A group with no such
// segment lies on both sides: its offsets are strokes around its segments.
// A tie leaves it out.
bool GroupOnSide(const PartRecord& root, bool left) {
  if (root.leftLength == 0.0 && root.rightLength == 0.0) return true;
  return left ? root.leftLength > root.rightLength : root.rightLength > root.leftLength;
}

// Splits the diagram into parts bounded by the input segments, groups the
// parts across segments given both ways and lists, part after part, the
// edges of the groups on the wanted side.
void ListEdgesOnSide(bool left) {
  Engine& g = Vd();
  OffsetState& o = Offs();
  const std::int32_t n = g.edges.count;
  o.segmentSides.Reserve(std::int64_t{g.segments.count} + 1);
  o.segmentPart.Reserve(std::int64_t{g.segments.count} + 1);
  o.segmentSides.count = o.segmentPart.count = g.segments.count;
  for (std::int32_t k = 0; k < g.segments.count; ++k) {
    o.segmentSides[k] = 0;
    o.segmentPart[k] = -1;
  }
  o.component.count = 0;
  o.parts.count = 0;
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
    const std::int32_t p = o.parts.count;
    o.parts.Append(PartRecord{o.component.count, p, 0.0, 0.0}, kTraversalGrowth);
    CollectPart(e, start);
    ClosePart(p);
  }
  for (std::int32_t p = 0; p < o.parts.count; ++p) {
    const std::int32_t root = Group(o, p);
    if (root == p) continue;
    o.parts[root].leftLength += o.parts[p].leftLength;
    o.parts[root].rightLength += o.parts[p].rightLength;
  }
  for (std::int32_t p = 0; p < o.parts.count; ++p) {
    if (!GroupOnSide(o.parts[Group(o, p)], left)) continue;
    const std::int32_t end = p + 1 < o.parts.count ? o.parts[p + 1].firstEdge : o.component.count;
    for (std::int32_t i = o.parts[p].firstEdge; i < end; ++i) o.workList.Append(o.component[i], kTraversalGrowth);
  }
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
    ListEdgesOnSide(left);
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
  o.parts.count = 0;
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
  o.parts.Free();
  o.bordered.Free();
  o.segmentSides.Free();
  o.segmentPart.Free();
}

}  // namespace zt::vd
