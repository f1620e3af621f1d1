// Stage 2 of a segment insertion: the growth of the deleted tree from the
// start node, and the protection of point regions that it would swallow.
#include <cmath>

#include "voronoi/detail/diagram.hpp"
#include "voronoi/detail/input_repair.hpp"
#include "voronoi/detail/node_check.hpp"
#include "voronoi/detail/node_on_edge.hpp"
#include "voronoi/detail/root_selection.hpp"
#include "voronoi/detail/segment_insertion.hpp"
#include "voronoi/detail/segment_repair.hpp"

namespace zt::vd {
namespace {

// Conflict values within this of zero are ties of rounding (internal units).
constexpr double kTieBand = 1e-9;

thread_local ThreadScratch<std::int32_t> gSegmentsBeside;  // segment sites beside the tree

void RecordSite(std::int32_t site, std::int32_t kind) {
  Engine& g = Vd();
  if (kind == SEG && site >= 0 && !g.segments[site].flag) {
    g.segments[site].flag = 1;
    gSegmentsBeside.Append(site, kScratchGrowth);
    return;
  }
  if (kind != PNT || site < 0) return;
  PointRecord& p = g.points[site];
  if (p.marked || p.hasNode) return;
  p.marked = 1;
  g.markedSites.Append(site, kScratchGrowth);
}

// A node whose conflict with the segment (value) is a tie within rounding (a node
// on a circle through one of the segment's end points, its foot at that
// end) may sit at the far end of an edge whose middle is plainly outside
// the conflict: taking it would hand the whole edge to the segment and cut
// the region on its side off from its site. Such a node is not reached
// along that edge.
bool TieAcrossEdge(const SegmentInsertion& si, std::int32_t e, double value, double tol) {
  if (!(value > -kTieBand)) return false;
  const geo::EdgeFrame f = EdgeFromRecords(e);
  const Point2d mid = geo::edge_point(f, 0.5);
  const double lam = si.line.lambda(mid);
  if (!(lam >= -tol && lam <= si.line.len + tol)) return true;
  return std::fabs(si.line.D(mid)) - f.left.dist(mid) > kTieBand;
}

// One attempt: depth first from the start node, through every node in
// conflict within tol. True when the end node was reached. `isTree` tells
// whether the nodes marked VISITED form a tree: they are connected, so they
// do when their edges among themselves number one less than they.
bool GrowOnce(const SegmentInsertion& si, double tol, bool& isTree) {
  Engine& g = Vd();
  g.stack.count = 0;
  TouchNode(si.start, VISITED);
  g.stack.Append(si.start, kScratchGrowth);
  // Nodes on the segment's end points are marked VISITED but not entered: an
  // edge between two entered nodes is met from both, one to such a leaf once.
  std::int64_t visited = 1, twiceInner = 0, leafEdges = 0;
  const auto isLeaf = [&](std::int32_t w) { return w != si.start && g.nodes[w].site >= 0; };
  while (g.stack.count > 0) {
    const std::int32_t n = g.stack[--g.stack.count];
    const std::int32_t e0 = g.nodes[n].edge;
    std::int32_t e = e0;
    do {
      const EdgeRecord er = g.edges[e];
      const std::int32_t w = OtherNode(er, n);
      g.edges.Prefetch(CcwAt(er, n));
      g.nodes.Prefetch(w);
      RecordSite(er.lft, er.ltype);
      RecordSite(er.rgt, er.rtype);
      const NodeRecord& wn = g.nodes[w];
      if (wn.status == VISITED) {
        ++(isLeaf(w) ? leafEdges : twiceInner);
      } else if (wn.status == UNCHECKED) {
        if (wn.site >= 0) {
          // A node on an input point: part of the tree only when the point
          // ends this segment, and never passed through.
          const bool end = wn.site == si.i1 || wn.site == si.i2;
          TouchNode(w, end ? VISITED : CHECKED);
          if (end) {
            ++visited, ++leafEdges;
            // Edges between two such leaves are met from neither.
            const std::int32_t f0 = wn.edge;
            std::int32_t f = f0;
            do {
              const EdgeRecord& fr = g.edges[f];
              const std::int32_t u = OtherNode(fr, w);
              if (u != w && g.nodes[u].status == VISITED && isLeaf(u)) ++leafEdges;
              f = CcwAt(fr, w);
            } while (f != f0);
          }
        } else if (double v; !IsFarNode(w) && (v = ConflictValue(si, w, tol)) <= tol && !TieAcrossEdge(si, e, v, tol)) {
          TouchNode(w, VISITED);
          ++visited, ++twiceInner;
          g.stack.Append(w, kScratchGrowth);
          // The growth goes on from w along its other edges.
          g.edges.Prefetch(CcwAt(er, w));
          g.edges.Prefetch(CwAt(er, w));
        } else {
          TouchNode(w, CHECKED);
        }
      }
      e = CcwAt(er, n);
    } while (e != e0);
  }
  isTree = twiceInner % 2 == 0 && twiceInner / 2 + leafEdges == visited - 1;
  return g.nodes[si.end].status == VISITED;
}

// True when every node of p's region is VISITED.
bool RegionSwallowed(std::int32_t p) {
  Engine& g = Vd();
  const std::int32_t e0 = g.points[p].vd;
  if (e0 < 0) return false;
  std::int32_t e = e0;
  std::int64_t guard = 0;
  do {
    const std::int32_t n = RegionExitNode(e, p, PNT);
    if (n < 0 || g.nodes[n].status != VISITED) return false;
    e = NextRegionEdge(e, p, PNT);
  } while (e >= 0 && e != e0 && ++guard < g.edges.count + 4);
  return true;
}

// Keeps part of p's region: a temporary degree-2 node where the ray away
// from the segment leaves the region (ladder), else the fallback copy of
// the region's node farthest from the segment's line. False: restart.
bool Protect(const SegmentInsertion& si, std::int32_t p) {
  Engine& g = Vd();
  const PointRecord& pr = g.points[p];
  const bool isEnd = p == si.i1 || p == si.i2;
  if (!isEnd && si.line.contains({pr.x, pr.y})) {
    g.suspect = SuspectPair{true, si.s, SEG, p, PNT};
    if (RepairInput(si.s, SEG, false)) return false;
  }
  const Point2d u = ProtectDirection(si, p);
  const std::int32_t e0 = g.points[p].vd;
  for (double tol = kProtectTol; tol <= kLadderTop; tol = NextTolerance(tol)) {
    std::int32_t e = e0;
    std::int64_t guard = 0;
    do {
      if (PlaceOnRay(e, p, u, tol)) return true;
      e = NextRegionEdge(e, p, PNT);
    } while (e >= 0 && e != e0 && ++guard < g.edges.count + 4);
  }
  std::int32_t far = kNone, farEdge = kNone;
  double farD = -1.0;
  std::int32_t e = e0;
  std::int64_t guard = 0;
  do {
    const std::int32_t n = RegionExitNode(e, p, PNT);
    const double d = std::fabs(si.line.D({g.nodes[n].x, g.nodes[n].y}));
    if (d > farD) {
      farD = d;
      far = n;
      farEdge = e;
    }
    e = NextRegionEdge(e, p, PNT);
  } while (e >= 0 && e != e0 && ++guard < g.edges.count + 4);
  if (far >= 0) CopyIntoDegree2(farEdge, far);
  return true;
}

}  // namespace

void TouchNode(std::int32_t n, std::uint32_t status) {
  Engine& g = Vd();
  g.nodes[n].status = status;
  g.checkedNodes.Append(n, kScratchGrowth);
}

void ResetInsertionMarks() {
  Engine& g = Vd();
  for (std::int32_t i = 0; i < g.markedSites.count; ++i) g.points[g.markedSites[i]].marked = 0;
  g.markedSites.count = 0;
  for (std::int32_t i = 0; i < g.checkedNodes.count; ++i) {
    NodeRecord& n = g.nodes[g.checkedNodes[i]];
    if (n.status == VISITED || n.status == CHECKED) n.status = UNCHECKED;
  }
  g.checkedNodes.count = 0;
  for (std::int32_t i = 0; i < gSegmentsBeside.count; ++i) g.segments[gSegmentsBeside[i]].flag = 0;
  gSegmentsBeside.count = 0;
}

Point2d ProtectDirection(const SegmentInsertion& si, std::int32_t p) {
  const Engine& g = Vd();
  const geo::SegSite& s = si.line;
  const Point2d dir{s.b, -s.a};
  if (p == si.i1) return {-dir.x, -dir.y};
  if (p == si.i2) return dir;
  const Point2d q{g.points[p].x, g.points[p].y};
  const double d = s.D(q);
  if (d > 0.0) return {s.a, s.b};
  if (d < 0.0) return {-s.a, -s.b};
  return s.lambda(q) < 0.0 ? Point2d{-dir.x, -dir.y} : dir;
}

bool PlaceOnRay(std::int32_t e, std::int32_t p, Point2d u, double tol) {
  Engine& g = Vd();
  const EdgeRecord er = g.edges[e];
  const NodeRecord& a = g.nodes[er.n1];
  const NodeRecord& b = g.nodes[er.n2];
  if (!(a.r > kZeroRadius) || !(b.r > kZeroRadius)) return false;
  const Point2d pp{g.points[p].x, g.points[p].y};
  // The edge's site other than p.
  std::int32_t site, kind;
  if (er.lft == p && er.ltype == PNT) {
    site = er.rgt;
    kind = er.rtype;
  } else if (er.rgt == p && er.rtype == PNT) {
    site = er.lft;
    kind = er.ltype;
  } else {
    return false;
  }
  // A straight edge meets the ray's line once, between end nodes on opposite
  // sides of it. A parabola around p (a segment not ending at p) may meet it
  // twice with both end nodes on one side: there the foot positions decide.
  const bool parabola = kind == SEG && g.segments[site].i1 != p && g.segments[site].i2 != p;
  if (!parabola) {
    const double sa = geo::cross(u, {a.x - pp.x, a.y - pp.y});
    const double sb = geo::cross(u, {b.x - pp.x, b.y - pp.y});
    if (!((sa > kSideBand && sb < -kSideBand) || (sa < -kSideBand && sb > kSideBand))) return false;
  }
  double t;
  if (kind == PNT) {
    const Point2d q{g.points[site].x - pp.x, g.points[site].y - pp.y};
    const double den = 2.0 * geo::dot(u, q);
    if (std::fabs(den) <= geo::kDenomTol) return false;
    t = geo::norm2(q) / den;
  } else if (kind == SEG) {
    const SegmentRecord& t2 = g.segments[site];
    const double d = t2.a * pp.x + t2.b * pp.y + t2.c;
    const double sigma = d > 0.0 ? 1.0 : (d < 0.0 ? -1.0 : 0.0);
    const double den = t2.a * u.x + t2.b * u.y - sigma;
    if (std::fabs(den) <= geo::kDenomTol) return false;
    t = -d / den;
  } else {
    return false;
  }
  if (t < -kSideBand) return false;
  const Point2d x{pp.x + t * u.x, pp.y + t * u.y};
  const geo::EdgeFrame f = EdgeFromRecords(e);
  const auto sign = [&](const geo::EdgeEnd& end) {
    const double v = geo::edge_position(f, end, x);
    return v > tol ? 1 : (v < -tol ? -1 : 0);
  };
  if (sign(f.n1) * sign(f.n2) > 0) return false;
  const std::int32_t n = NewNode(x.x, x.y, std::fabs(t));
  SplitEdge(e, n, true);
  return true;
}

void CopyIntoDegree2(std::int32_t e, std::int32_t n) {
  Engine& g = Vd();
  const NodeRecord src = g.nodes[n];
  const std::int32_t c = NewNode(src.x, src.y, src.r);
  // Split e on the side of n: e must end at n for the copy to sit next to it.
  EdgeRecord& er = g.edges[e];
  if (er.n1 == n) {
    std::swap(er.n1, er.n2);
    std::swap(er.lft, er.rgt);
    std::swap(er.ltype, er.rtype);
    std::swap(er.s_ccw, er.e_ccw);
    std::swap(er.s_cw, er.e_cw);
  }
  // e = (a, n): splitting makes (a, c) and (c, n).
  SplitEdge(e, c, true);
  g.errorFlag = true;
  g.recoveryMode = true;
}

bool GrowDeletedTree(SegmentInsertion& si) {
  Engine& g = Vd();
  bool reached = false, isTree = false;
  si.grownTree = false;
  for (double tol = kGrowthTol; tol <= kLadderTop; tol = NextTolerance(tol)) {
    ResetInsertionMarks();
    if ((reached = GrowOnce(si, tol, isTree))) break;
  }
  if (!reached) {
    if (RepairInput(si.s, SEG, false)) {
      ResetInsertionMarks();
      return false;
    }
    ResetInsertionMarks();
    si.end = si.start;
    GrowOnce(si, kLadderTop, isTree);
    isTree = false;
    g.errorFlag = true;
    g.recoveryMode = true;
  }
  // A segment already in the diagram that crosses this one (or repeats it)
  // borders the tree wherever the two meet: such input is repaired here,
  // before it can produce a diagram that only looks sound.
  for (std::int32_t i = 0; i < gSegmentsBeside.count; ++i) {
    if (RepairSegmentSegment(si.s, gSegmentsBeside[i])) {
      ResetInsertionMarks();
      return false;
    }
  }
  // Every recorded point keeps part of its region.
  const std::int32_t degree2Before = g.degree2.count;
  for (std::int32_t i = 0; i < g.markedSites.count; ++i) {
    const std::int32_t p = g.markedSites[i];
    if (!RegionSwallowed(p)) continue;
    if (!Protect(si, p)) {
      ResetInsertionMarks();
      return false;
    }
  }
  // A protection splits an edge of the collected set: the tree check must
  // walk the set again.
  si.grownTree = isTree && g.degree2.count == degree2Before && !g.errorFlag;
  return true;
}

}  // namespace zt::vd
