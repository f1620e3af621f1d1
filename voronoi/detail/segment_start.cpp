// Stage 1 of a segment insertion: the start nodes at both end points.
#include <cmath>

#include "voronoi/detail/diagram.hpp"
#include "voronoi/detail/input_repair.hpp"
#include "voronoi/detail/node_check.hpp"
#include "voronoi/detail/node_on_edge.hpp"
#include "voronoi/detail/preprocess.hpp"
#include "voronoi/detail/segment_insertion.hpp"

namespace zt::vd {
namespace {

// Halvings of the search for the point where a curved edge crosses a line.
constexpr int kCrossingSteps = 200;

struct Candidate {
  std::int32_t node = kNone;
  double value = 0.0;
};

// The node of p's region with the smallest conflict value; a node on an
// edge between p and `other` (the segment's other end) wins when it
// conflicts. Nodes placed on input points and the far nodes do not count.
Candidate SearchRegion(const SegmentInsertion& si, std::int32_t p, std::int32_t other, double tol) {
  Engine& g = Vd();
  Candidate best, bestShared;
  const std::int32_t e0 = g.points[p].vd;
  if (e0 < 0) return best;
  std::int32_t e = e0;
  std::int64_t guard = 0;
  do {
    const std::int32_t n = RegionExitNode(e, p, PNT);
    const EdgeRecord& er = g.edges[e];
    if (n >= 0) g.edges.Prefetch(CwAt(er, n));  // the walk's next edge
    if (n >= 0 && !IsFarNode(n) && g.nodes[n].site < 0) {
      const double v = ConflictValue(si, n, tol);
      if (best.node < 0 || v < best.value) best = {n, v};
      const bool shared = (er.lft == other && er.ltype == PNT) || (er.rgt == other && er.rtype == PNT);
      if (shared && (bestShared.node < 0 || v < bestShared.value)) bestShared = {n, v};
    } else if (n >= 0 && g.nodes[n].site == p) {
      // A node on p itself: where segments meet at p with no angle wider
      // than a half turn, p's region shrinks to such nodes, and the new
      // segment starts in a neighbouring region; its nodes count too.
      const std::int32_t f0 = g.nodes[n].edge;
      std::int32_t f = f0;
      do {
        const std::int32_t w = OtherNode(g.edges[f], n);
        if (!IsFarNode(w) && g.nodes[w].site < 0) {
          const double v = ConflictValue(si, w, tol);
          if (best.node < 0 || v < best.value) best = {w, v};
        }
        f = CcwAt(g.edges[f], n);
      } while (f != f0);
    }
    e = NextRegionEdge(e, p, PNT);
  } while (e >= 0 && e != e0 && ++guard < g.edges.count + 4);
  if (bestShared.node >= 0 && bestShared.value < 0.0) return bestShared;
  return best;
}

// Where segments meet at p leaving it no angle wider than a half turn on
// the new segment's side, p's region does not reach that side: the new
// segment starts in the regions of the segments at p. The node most in
// conflict among those regions is a node of the deleted tree (the tree is
// connected and does not pass through p). kNone if none conflicts.
std::int32_t SearchRegionsOfSegmentsAt(const SegmentInsertion& si, std::int32_t p) {
  Engine& g = Vd();
  if (!g.xrefBuilt) BuildCrossReference();
  Candidate best;
  ForEachSegmentAt(p, [&](std::int32_t t) {
    if (t == si.s || g.segments[t].vd < 0) return;
    const std::int32_t e0 = g.segments[t].vd;
    std::int32_t e = e0;
    std::int64_t guard = 0;
    do {
      const std::int32_t n = RegionExitNode(e, t, SEG);
      if (n >= 0 && !IsFarNode(n) && g.nodes[n].site < 0 && g.nodes[n].r > kZeroRadius) {
        const double v = ConflictValue(si, n, kStartTolFirst);
        if (best.node < 0 || v < best.value) best = {n, v};
      }
      e = NextRegionEdge(e, t, SEG);
    } while (e >= 0 && e != e0 && ++guard < g.edges.count + 4);
  });
  return best.node >= 0 && best.value < 0.0 ? best.node : kNone;
}

// Where the segment leaves p's region: a node made on the region's edge
// that the segment crosses there. Every point of the segment lies closer to
// the segment than to any other site, so that node is in conflict. Returns
// the node, or kNone when no crossing is found.
std::int32_t MakeStartAtExit(const SegmentInsertion& si, std::int32_t p) {
  Engine& g = Vd();
  const geo::SegSite& s = si.line;
  const std::int32_t e0 = g.points[p].vd;
  if (e0 < 0) return kNone;
  std::int32_t e = e0;
  std::int64_t guard = 0;
  do {
    const EdgeRecord er = g.edges[e];
    if (!IsFarNode(er.n1) && !IsFarNode(er.n2)) {
      geo::EdgeFrame f = EdgeFromRecords(e);
      f.n1.deleted = false;  // the curve runs from n1 (u = 0) to n2 (u = 1)
      f.n2.deleted = true;
      const double d1 = s.D(f.n1.p), d2 = s.D(f.n2.p);
      if ((d1 <= 0.0) != (d2 <= 0.0)) {
        double lo = 0.0, hi = 1.0;
        for (int i = 0; i < kCrossingSteps; ++i) {
          const double mid = 0.5 * (lo + hi);
          if (mid <= lo || mid >= hi) break;
          if ((s.D(geo::edge_point(f, mid)) <= 0.0) == (d1 <= 0.0)) {
            lo = mid;
          } else {
            hi = mid;
          }
        }
        const Point2d x = geo::edge_point(f, 0.5 * (lo + hi));
        const double lam = s.lambda(x);
        if (lam > 0.0 && lam < s.len) {
          const PointRecord& pr = g.points[p];
          const std::int32_t n = NewNode(x.x, x.y, std::hypot(x.x - pr.x, x.y - pr.y));
          SplitEdge(e, n, false);  // deleted with the tree
          return n;
        }
      }
    }
    e = NextRegionEdge(e, p, PNT);
  } while (e >= 0 && e != e0 && ++guard < g.edges.count + 4);
  return kNone;
}

// The start node at end point p: a conflicting node of its region, found
// with the two start tolerances; else the input repair; else a node made
// where the segment leaves the region; else (recovery) a copy of an end
// node of the region pointer's edge. kNone with a restart pending.
std::int32_t StartAt(SegmentInsertion& si, std::int32_t p, std::int32_t other) {
  Engine& g = Vd();
  for (const double tol : {kStartTolFirst, kStartTolSecond}) {
    const Candidate c = SearchRegion(si, p, other, tol);
    if (c.node >= 0 && c.value < 0.0) return c.node;
  }
  if (RepairInput(si.s, SEG, false)) return kNone;
  const std::int32_t beside = SearchRegionsOfSegmentsAt(si, p);
  if (beside >= 0) return beside;
  const std::int32_t made = MakeStartAtExit(si, p);
  if (made >= 0) return made;
  // Fallback: the end node of the region pointer's edge with the smaller
  // value, copied into a permanent degree-2 node on that edge.
  g.recoveryMode = true;
  const std::int32_t e = g.points[p].vd;
  const EdgeRecord er = g.edges[e];
  const auto value = [&](std::int32_t n) {
    return g.nodes[n].site == p ? 0.0 : ConflictValue(si, n, kStartTolSecond);
  };
  const std::int32_t pick = value(er.n2) < value(er.n1) - kStartTolSecond ? er.n2 : er.n1;
  const NodeRecord src = g.nodes[pick];
  const std::int32_t n = NewNode(src.x, src.y, src.r);
  SplitEdge(e, n, false);
  return n;
}

}  // namespace

double NextTolerance(double tol) {
  if (tol < 0.0) return 0.0;
  if (tol == 0.0) return 1e-14;
  return tol * 10.0;
}

double ConflictValue(const SegmentInsertion& si, std::int32_t node, double tol) {
  const Engine& g = Vd();
  const NodeRecord& n = g.nodes[node];
  const Point2d p{n.x, n.y};
  const double lam = si.line.lambda(p);
  const double dist = (lam >= -tol && lam <= si.line.len + tol) ? std::fabs(si.line.D(p)) : g.LARGE;
  return dist - n.r;
}

bool FindStartNodes(SegmentInsertion& si) {
  Engine& g = Vd();
  si.start = StartAt(si, si.i1, si.i2);
  if (si.start < 0) return false;
  g.nodes[si.start].status = UNCHECKED;
  // The start node serves at i2 too when it bounds i2's region.
  bool serves = false;
  const std::int32_t e0 = g.nodes[si.start].edge;
  std::int32_t e = e0;
  do {
    const EdgeRecord& er = g.edges[e];
    if ((er.lft == si.i2 && er.ltype == PNT) || (er.rgt == si.i2 && er.rtype == PNT)) serves = true;
    e = CcwAt(er, si.start);
  } while (e != e0);
  if (serves) {
    si.end = si.start;
    return true;
  }
  si.end = StartAt(si, si.i2, si.i1);
  if (si.end < 0) return false;
  g.nodes[si.end].status = UNCHECKED;
  return true;
}

}  // namespace zt::vd
