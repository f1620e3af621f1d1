// Stage 4 of a segment insertion: the new nodes on the edges that leave the
// deleted tree, the boundary of the segment's region through them, and the
// freeing of the tree.
//
// The boundary edges are met in order by a tour around the tree: arriving
// at a node along an edge, the tour turns to the next edge clockwise; it
// walks along tree edges and only notes the others. The region between two
// consecutive noted edges is the site across the new edge that joins their
// new nodes, which keeps every region connected.
#include <cmath>

#include "voronoi/detail/diagram.hpp"
#include "voronoi/detail/input_repair.hpp"
#include "voronoi/detail/node_on_edge.hpp"
#include "voronoi/detail/segment_insertion.hpp"
#include "voronoi/detail/segment_repair.hpp"

namespace zt::vd {
namespace {

struct BoundaryEntry {
  std::int32_t edge;  // edge leaving the tree
  std::int32_t gone;  // its end in the tree
  std::int32_t site;  // site of the region after it in the tour
  std::int32_t kind;
  double x, y, r;     // the new node
  std::int32_t onPoint;
};

thread_local ThreadScratch<BoundaryEntry> gBoundary;
thread_local ThreadScratch<std::int32_t> gTreeEdges;
thread_local ThreadScratch<std::int32_t> gNewEdges;

bool InTree(std::int32_t n) { return Vd().nodes[n].status == DELETED; }

// The tour; false when it does not close (a broken diagram).
bool Tour(const SegmentInsertion& si) {
  Engine& g = Vd();
  gBoundary.count = 0;
  gTreeEdges.count = 0;
  const std::int32_t n0 = si.start;
  const std::int32_t e0 = g.nodes[n0].edge;
  std::int32_t n = n0, e = e0;
  const std::int64_t limit = 4 * (std::int64_t{g.deletedNodes.count} + 1) * 3;
  for (std::int64_t step = 0; step < limit; ++step) {
    const EdgeRecord& er = g.edges[e];
    const std::int32_t w = OtherNode(er, n);
    if (InTree(w)) {
      if (er.n1 == n) gTreeEdges.Append(e, kScratchGrowth);
      n = w;
    } else {
      BoundaryEntry b{e, n, RightSiteFrom(er, n), RightKindFrom(er, n), 0, 0, 0, kNone};
      gBoundary.Append(b, kScratchGrowth);
    }
    e = CwAt(g.edges[e], n);
    if (n == n0 && e == e0) return true;
  }
  return false;
}

// The repair that a copied node asks for, limited to the sites beside the
// segment's new region (the sites across the boundary edges, and the end
// points of the segments among them): a point on the segment, an end point
// near another point, a crossing or repeated segment all border the region.
// Scanning every site instead costs a pass over the whole input per copied
// node. True when the input was changed.
bool RepairBesideRegion(const SegmentInsertion& si) {
  Engine& g = Vd();
  if (RepairSuspectPair()) return true;
  const auto pointNear = [&](std::int32_t p) {
    if (RepairSegmentPoint(si.s, p)) return true;
    const PointRecord& q = g.points[p];
    if (q.deleted) return false;
    for (const std::int32_t e : {si.i1, si.i2}) {
      const PointRecord& r = g.points[e];
      if (p != e && !r.deleted && std::hypot(q.x - r.x, q.y - r.y) <= kRepairPointDistance) {
        MergePointsToMidpoint(e, p);
        return true;
      }
    }
    return false;
  };
  for (std::int32_t k = 0; k < gBoundary.count; ++k) {
    const BoundaryEntry& b = gBoundary[k];
    if (b.site < 0) continue;
    if (b.kind == PNT && pointNear(b.site)) return true;
    if (b.kind == SEG) {
      if (RepairSegmentSegment(si.s, b.site)) return true;
      const SegmentRecord t = g.segments[b.site];
      if (pointNear(t.i1) || pointNear(t.i2)) return true;
    }
  }
  return false;
}

// The new node on every boundary edge. False with a restart pending.
bool ComputeNewNodes(const SegmentInsertion& si) {
  Engine& g = Vd();
  bool repairTried = false;  // one local repair per insertion is enough
  const geo::SiteRef fresh = geo::SiteRef::segment(si.line);
  for (std::int32_t k = 0; k < gBoundary.count; ++k) {
    BoundaryEntry& b = gBoundary[k];
    bool copied = false;
    if (!ComputeNodeOnEdge(b.edge, fresh, b.x, b.y, b.r, copied, b.onPoint)) {
      if (RepairInput(si.s, SEG, true)) return false;
      const EdgeRecord& er = g.edges[b.edge];
      const NodeRecord& kept = g.nodes[InTree(er.n1) ? er.n2 : er.n1];
      b.x = kept.x;
      b.y = kept.y;
      b.r = kept.r;
      b.onPoint = kNone;
      g.recoveryMode = true;
    } else if (copied) {
      // The sites beside the region do not change between the copies of one
      // insertion: they are scanned once, a new suspect pair every time.
      if (repairTried ? RepairSuspectPair() : RepairBesideRegion(si)) return false;
      repairTried = true;
    }
  }
  return true;
}

// Places a node of radius 0 on end point p of the segment, splitting edge e
// (between the segment and p) there, when e passes through p; true when it
// did.
bool SplitAtEndPoint(const geo::SegSite& line, std::int32_t e, std::int32_t p) {
  Engine& g = Vd();
  const EdgeRecord& er = g.edges[e];
  const NodeRecord& a = g.nodes[er.n1];
  const NodeRecord& b = g.nodes[er.n2];
  if (!(a.r > 0.0) || !(b.r > 0.0)) return false;
  const double da = line.D({a.x, a.y}), db = line.D({b.x, b.y});
  if (!((da > kSideBand && db < -kSideBand) || (da < -kSideBand && db > kSideBand))) return false;
  PointRecord& pr = g.points[p];
  const std::int32_t n = NewNode(pr.x, pr.y, 0.0);
  g.nodes[n].site = p;
  SplitEdge(e, n, false);
  pr.hasNode = 1;
  pr.node = n;
  return true;
}

}  // namespace

std::int32_t SplitRegionAtEndPoints(std::int32_t s) {
  Engine& g = Vd();
  const std::int32_t e0 = g.segments[s].vd;
  if (e0 < 0) return 0;
  const geo::SegSite line = SiteFromRecords(s, SEG).seg;
  gNewEdges.count = 0;
  std::int32_t e = e0;
  std::int64_t guard = 0;
  do {
    gNewEdges.Append(e, kScratchGrowth);
    e = NextRegionEdge(e, s, SEG);
  } while (e >= 0 && e != e0 && ++guard < g.edges.count + 4);
  std::int32_t splits = 0;
  for (std::int32_t i = 0; i < gNewEdges.count; ++i) {
    const EdgeRecord& er = g.edges[gNewEdges[i]];
    const bool leftIsSeg = er.lft == s && er.ltype == SEG;
    const std::int32_t p = leftIsSeg ? er.rgt : er.lft;
    const std::int32_t kind = leftIsSeg ? er.rtype : er.ltype;
    if (kind == PNT && (p == line.i1 || p == line.i2) && SplitAtEndPoint(line, gNewEdges[i], p)) ++splits;
  }
  return splits;
}

bool RebuildRegion(SegmentInsertion& si) {
  Engine& g = Vd();
  if (!Tour(si) || gBoundary.count < 2) {
    for (std::int32_t i = 0; i < g.deletedNodes.count; ++i) {
      g.nodes[g.deletedNodes[i]].status = VISITED;
      g.nodes[g.deletedNodes[i]].spare = kNone;
    }
    g.deletedNodes.count = 0;
    g.errorFlag = true;
    g.recoveryMode = true;
    return false;
  }
  if (!ComputeNewNodes(si)) return false;
  const std::int32_t m = gBoundary.count;
  // New nodes cut the boundary edges at their tree end.
  for (std::int32_t k = 0; k < m; ++k) {
    BoundaryEntry& b = gBoundary[k];
    const std::int32_t n = NewNode(b.x, b.y, b.r);
    if (b.onPoint >= 0) g.nodes[n].site = b.onPoint;
    b.gone = n;  // from here on: the new node
  }
  gNewEdges.count = 0;
  for (std::int32_t k = 0; k < m; ++k) {
    const BoundaryEntry& b = gBoundary[k];
    const BoundaryEntry& next = gBoundary[(k + 1) % m];
    gNewEdges.Append(NewEdge(b.gone, next.gone, b.site, si.s, b.kind, SEG), kScratchGrowth);
  }
  for (std::int32_t k = 0; k < m; ++k) {
    const BoundaryEntry& b = gBoundary[k];
    const std::int32_t ek = gNewEdges[k];
    const std::int32_t prev = gNewEdges[(k + m - 1) % m];
    const std::int32_t next = gNewEdges[(k + 1) % m];
    EdgeRecord& be = g.edges[b.edge];
    if (InTree(be.n1)) {
      be.n1 = b.gone;
      be.s_ccw = prev;
      be.s_cw = ek;
    } else {
      be.n2 = b.gone;
      be.e_ccw = prev;
      be.e_cw = ek;
    }
    EdgeRecord& ne = g.edges[ek];
    ne.s_ccw = b.edge;
    ne.s_cw = prev;
    ne.e_ccw = next;
    ne.e_cw = gBoundary[(k + 1) % m].edge;
    g.nodes[b.gone].edge = b.edge;
    SetVDPtr(b.kind, b.site, ek);
  }
  SetVDPtr(SEG, si.s, gNewEdges[0]);
  for (std::int32_t i = 0; i < gTreeEdges.count; ++i) FreeEdge(gTreeEdges[i]);
  for (std::int32_t i = 0; i < g.deletedNodes.count; ++i) {
    g.nodes[g.deletedNodes[i]].spare = kNone;
    FreeNode(g.deletedNodes[i]);
  }
  g.deletedNodes.count = 0;
  RemoveDegree2Nodes();
  for (const std::int32_t p : {si.i1, si.i2}) {
    PointRecord& pr = g.points[p];
    if (pr.node >= 0 && g.nodes[pr.node].status == DELETED) {
      pr.node = kNone;
      pr.hasNode = 0;
    }
  }
  // End points: a new node on one of them stands for it; an edge between
  // the segment and an end point that passes through it is split there.
  for (std::int32_t k = 0; k < m; ++k) {
    const std::int32_t p = gBoundary[k].onPoint;
    if (p >= 0) {
      g.points[p].hasNode = 1;
      g.points[p].node = gBoundary[k].gone;
    }
  }
  for (std::int32_t k = 0; k < m; ++k) {
    const BoundaryEntry& b = gBoundary[k];
    if (b.kind == PNT && (b.site == si.i1 || b.site == si.i2)) SplitAtEndPoint(si.line, gNewEdges[k], b.site);
  }
  return true;
}

}  // namespace zt::vd
