// Point insertion (see point_insertion.hpp).
#include "voronoi/detail/point_insertion.hpp"

#include <cassert>
#include <cmath>

#include "voronoi/detail/circumcentre.hpp"
#include "voronoi/detail/diagram.hpp"
#include "voronoi/detail/input_repair.hpp"
#include "voronoi/detail/nearest_search.hpp"
#include "voronoi/detail/nearest_walk.hpp"
#include "voronoi/detail/point_lookahead.hpp"
#include "voronoi/detail/preprocess.hpp"

namespace zt::vd {

namespace {

double Dist2(const NodeRecord& n, const PointRecord& p) {
  const double dx = n.x - p.x, dy = n.y - p.y;
  return dx * dx + dy * dy;
}

void MarkSite(std::int32_t site) {
  Engine& g = Vd();
  if (site < 0 || g.points[site].marked) return;
  g.points[site].marked = 1;
  g.markedSites.Append(site, kScratchGrowth);
}

void MarkChecked(std::int32_t n) {
  Engine& g = Vd();
  if (g.nodes[n].status != UNCHECKED) return;
  g.nodes[n].status = CHECKED;
  g.checkedNodes.Append(n, kScratchGrowth);
}

void ClearMarks() {
  Engine& g = Vd();
  for (std::int32_t i = 0; i < g.markedSites.count; ++i) g.points[g.markedSites[i]].marked = 0;
  g.markedSites.count = 0;
  for (std::int32_t i = 0; i < g.checkedNodes.count; ++i) {
    NodeRecord& n = g.nodes[g.checkedNodes[i]];
    if (n.status == CHECKED) n.status = UNCHECKED;
  }
  g.checkedNodes.count = 0;
}

// The seed: among the nodes of q's region whose circle contains p, the one
// with the largest r^2/d^2 (compared by cross-multiplication); -1 if none.
std::int32_t FindSeed(std::int32_t q, std::int32_t p, PointLookahead& ahead) {
  Engine& g = Vd();
  const PointRecord& pt = g.points[p];
  std::int32_t best = -1;
  double bestR2 = 0.0, bestD2 = 1.0;
  const std::int32_t start = g.points[q].vd;
  std::int32_t e = start;
  for (std::int32_t steps = 0; e >= 0 && steps <= g.edges.count; ++steps) {
    const std::int32_t n = RegionExitNode(e, q, PNT);
    if (n < 0) break;
    ahead.Step(g);
    const NodeRecord& node = g.nodes[n];
    const double d2 = Dist2(node, pt);
    if (node.r > d2 && (best < 0 || node.r * bestD2 > bestR2 * d2)) {
      best = n;
      bestR2 = node.r;
      bestD2 = d2;
    }
    e = NextRegionEdge(e, q, PNT);
    if (e == start) break;
  }
  return best;
}

// The fallback seed when no node conflicts: the node of q's region with the
// largest r - d.
std::int32_t FallbackSeed(std::int32_t q, std::int32_t p) {
  Engine& g = Vd();
  const PointRecord& pt = g.points[p];
  std::int32_t best = -1;
  double bestMargin = -HUGE_VAL;
  const std::int32_t start = g.points[q].vd;
  std::int32_t e = start;
  for (std::int32_t steps = 0; e >= 0 && steps <= g.edges.count; ++steps) {
    const std::int32_t n = RegionExitNode(e, q, PNT);
    if (n < 0) break;
    const NodeRecord& node = g.nodes[n];
    const double margin = std::sqrt(node.r) - std::sqrt(Dist2(node, pt));
    if (margin > bestMargin) {
      bestMargin = margin;
      best = n;
    }
    e = NextRegionEdge(e, q, PNT);
    if (e == start) break;
  }
  return best;
}

// Whether node v, reached from a tree node through edge f, joins the tree.
bool Joins(std::int32_t f, std::int32_t v, const PointRecord& pt) {
  Engine& g = Vd();
  const NodeRecord& node = g.nodes[v];
  // The conflict test first: it needs only v's own record, and most nodes
  // reached fail it.
  if (node.status != UNCHECKED || !(node.r > Dist2(node, pt))) return false;
  const EdgeRecord& ef = g.edges[f];
  const std::int32_t g1 = CcwAt(ef, v);
  const std::int32_t g2 = CcwAt(g.edges[g1], v);
  const std::int32_t across = LeftSiteFrom(g.edges[g1], v);
  if (across < 0 || LeftKindFrom(g.edges[g1], v) != PNT || g.points[across].marked) return false;
  if (g.nodes[OtherNode(g.edges[g1], v)].status == DELETED) return false;
  return g.nodes[OtherNode(g.edges[g2], v)].status != DELETED;
}

// Grows the tree from the seed depth first, in counter-clockwise order
// around every node, and lists the edges leaving it (with their tree end)
// in tour order. Tree edges go to the stack for freeing.
struct Leaving {
  std::int32_t edge;
  std::int32_t treeNode;
};

struct Frame {
  std::int32_t node;
  std::int32_t arrival;  // edge we came through (-1 at the seed)
  std::int32_t next;     // next edge to look at
  std::int32_t stop;     // edge at which the rotation ends
};
thread_local ThreadScratch<Frame> gFrames;  // reused by every insertion

void GrowTree(std::int32_t seed, const PointRecord& pt, RecordArray<Leaving>& leaving,
              RecordArray<std::int32_t>& treeEdges, PointLookahead& ahead) {
  Engine& g = Vd();
  RecordArray<Frame>& stack = gFrames;
  stack.count = 0;
  const std::int32_t first = g.nodes[seed].edge;
  stack.Append(Frame{seed, -1, first, first}, kScratchGrowth);
  bool seedStarted = false;
  while (stack.count > 0) {
    Frame& fr = stack[stack.count - 1];
    if (fr.arrival < 0 ? (seedStarted && fr.next == fr.stop) : fr.next == fr.stop) {
      --stack.count;
      continue;
    }
    if (fr.arrival < 0) seedStarted = true;
    ahead.Step(g);
    const std::int32_t f = fr.next;
    const std::int32_t u = fr.node;
    fr.next = CcwAt(g.edges[f], u);
    const std::int32_t v = OtherNode(g.edges[f], u);
    if (Joins(f, v, pt)) {
      const std::int32_t g1 = CcwAt(g.edges[f], v);
      MarkSite(LeftSiteFrom(g.edges[g1], v));
      g.nodes[v].status = DELETED;
      g.deletedNodes.Append(v, kScratchGrowth);
      treeEdges.Append(f, kScratchGrowth);
      stack.Append(Frame{v, f, g1, f}, kScratchGrowth);
    } else {
      assert(g.nodes[v].status != DELETED);
      MarkChecked(v);
      leaving.Append(Leaving{f, u}, kScratchGrowth);
    }
  }
}

thread_local ThreadScratch<Leaving> gLeaving;
thread_local ThreadScratch<std::int32_t> gTreeEdges;
struct Cut {
  double x, y, r2;
};
thread_local ThreadScratch<Cut> gCuts;

}  // namespace

void ReleaseInsertionScratch() {
  gLeaving.Free();
  gTreeEdges.Free();
  gCuts.Free();
  gFrames.Free();
}

void InsertPoint(std::int32_t p, const Nearest& nearest, PointLookahead& ahead) {
  Engine& g = Vd();
  PointRecord& pt = g.points[p];
  if (pt.deleted) return;
  const std::int32_t q = nearest.point;
  const double d2 = nearest.dist2;
  assert(q >= 0);
  if (d2 <= kCoincidentDist2) {
    PointRecord& other = g.points[q];
    if (pt.x == other.x && pt.y == other.y) {
      pt.deleted = 1;
      g.dataModified = true;
      ++g.duplicatePoints;
      if (g.segments.count > 0 || g.arcs.count > 0) {
        if (!g.xrefBuilt) BuildCrossReference();
        RedirectSegmentEnds(p, q);
      }
    } else {
      MergePointsToMidpoint(p, q);
    }
    return;
  }

  std::int32_t seed = FindSeed(q, p, ahead);
  if (seed < 0 && g.orderPresorted && g.nearestRescans < kMaxNearestRescans) {
    // The nearest point came from a walk through the diagram, which relies
    // on the diagram being exact: before treating this as an input defect,
    // check the walk's answer against every inserted point.
    ++g.nearestRescans;
    const Nearest scanned = ScanNearest(p);
    if (scanned.point >= 0 && scanned.dist2 < d2) {
      InsertPoint(p, scanned, ahead);
      return;
    }
  }
  if (seed < 0) {
    g.errorFlag = true;
    if (RepairInput(p, PNT, true)) return;
    seed = FallbackSeed(q, p);
    g.recoveryMode = true;
    if (seed < 0) return;  // q has no region: nothing sound to insert into
  }

  // Grow the tree of deleted nodes.
  g.deletedNodes.count = 0;
  gLeaving.count = 0;
  gTreeEdges.count = 0;
  g.nodes[seed].status = DELETED;
  g.deletedNodes.Append(seed, kScratchGrowth);
  {
    const std::int32_t e0 = g.nodes[seed].edge;
    std::int32_t e = e0;
    do {
      MarkSite(LeftSiteFrom(g.edges[e], seed));
      e = CcwAt(g.edges[e], seed);
    } while (e != e0);
  }
  GrowTree(seed, pt, gLeaving, gTreeEdges, ahead);
  const std::int32_t k = gLeaving.count;
  assert(k >= 3);

  // Positions of the new nodes first, so a failure leaves the diagram as it was.
  gCuts.count = 0;
  for (std::int32_t i = 0; i < k; ++i) {
    ahead.Step(g);
    const EdgeRecord& f = g.edges[gLeaving[i].edge];
    Cut c{};
    if (!Circumcentre(p, f.lft, f.rgt, c.x, c.y, c.r2)) {
      g.errorFlag = true;
      if (RepairInput(p, PNT, true)) {
        for (std::int32_t j = 0; j < g.deletedNodes.count; ++j) g.nodes[g.deletedNodes[j]].status = UNCHECKED;
        ClearMarks();
        return;
      }
      // No defect found: put the node on the kept end, where the edge's
      // conflict test changed its answer.
      const NodeRecord& kept = g.nodes[OtherNode(f, gLeaving[i].treeNode)];
      c = Cut{kept.x, kept.y, Dist2(kept, pt)};
      g.recoveryMode = true;
    }
    gCuts.Append(c, kScratchGrowth);
  }

  // New nodes, cut into the leaving edges.
  g.newNodes.count = 0;
  for (std::int32_t i = 0; i < k; ++i) {
    const std::int32_t m = NewNode(gCuts[i].x, gCuts[i].y, gCuts[i].r2);
    g.newNodes.Append(m, kScratchGrowth);
  }
  // New edges: E_i from m_i to m_{i+1}, p on the left, on the right the
  // site whose face the tour crossed between the two leaving edges.
  const std::int32_t firstNew = g.edges.count;  // only for the assert below
  (void)firstNew;
  g.boundaryEdges.count = 0;
  for (std::int32_t i = 0; i < k; ++i) {
    ahead.Step(g);
    const Leaving& l = gLeaving[i];
    const EdgeRecord& f = g.edges[l.edge];
    const std::int32_t site = LeftSiteFrom(f, l.treeNode);
    const std::int32_t kind = LeftKindFrom(f, l.treeNode);
    const std::int32_t e = NewEdge(g.newNodes[i], g.newNodes[(i + 1) % k], p, site, PNT, kind);
    g.boundaryEdges.Append(e, kScratchGrowth);
  }
  for (std::int32_t i = 0; i < k; ++i) {
    const Leaving& l = gLeaving[i];
    const std::int32_t m = g.newNodes[i];
    const std::int32_t ei = g.boundaryEdges[i];
    const std::int32_t eprev = g.boundaryEdges[(i + k - 1) % k];
    EdgeRecord& f = g.edges[l.edge];
    if (f.n1 == l.treeNode) {
      f.n1 = m;
      f.s_ccw = ei;
      f.s_cw = eprev;
    } else {
      f.n2 = m;
      f.e_ccw = ei;
      f.e_cw = eprev;
    }
    EdgeRecord& a = g.edges[ei];
    a.s_ccw = eprev;
    a.s_cw = l.edge;
    EdgeRecord& b = g.edges[eprev];
    b.e_ccw = l.edge;
    b.e_cw = ei;
    g.nodes[m].edge = ei;
    SetVDPtr(a.rtype, a.rgt, ei);
  }
  pt.vd = g.boundaryEdges[0];

  for (std::int32_t i = 0; i < gTreeEdges.count; ++i) FreeEdge(gTreeEdges[i]);
  for (std::int32_t i = 0; i < g.deletedNodes.count; ++i) FreeNode(g.deletedNodes[i]);
  g.deletedNodes.count = 0;
  ClearMarks();
}

}  // namespace zt::vd
