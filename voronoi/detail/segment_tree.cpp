// Stage 3 of a segment insertion: the collected nodes must form a tree.
// A cycle would enclose regions whose sites keep part of their regions
// inside it; it is broken by a temporary degree-2 node that stays.
#include <cmath>

#include "voronoi/detail/diagram.hpp"
#include "voronoi/detail/input_repair.hpp"
#include "voronoi/detail/segment_insertion.hpp"

namespace zt::vd {
namespace {

thread_local ThreadScratch<std::int32_t> gCycle;  // edges of the cycle found
thread_local ThreadScratch<std::int32_t> gPath;   // scratch for the tree paths

std::int32_t ParentNode(std::int32_t n) {
  const Engine& g = Vd();
  const std::int32_t e = g.nodes[n].spare;
  return e < 0 ? kNone : OtherNode(g.edges[e], n);
}

// Depth first from the start node through VISITED nodes, marking them
// DELETED with their tree edge in `spare`. On a cycle, lists its edges in
// gCycle and returns true.
bool FindCycle(const SegmentInsertion& si) {
  Engine& g = Vd();
  g.deletedNodes.count = 0;
  g.stack.count = 0;
  g.nodes[si.start].status = DELETED;
  g.nodes[si.start].spare = kNone;
  g.deletedNodes.Append(si.start, kScratchGrowth);
  g.stack.Append(si.start, kScratchGrowth);
  while (g.stack.count > 0) {
    const std::int32_t n = g.stack[--g.stack.count];
    const std::int32_t e0 = g.nodes[n].edge;
    std::int32_t e = e0;
    do {
      const EdgeRecord& er = g.edges[e];
      const std::int32_t w = OtherNode(er, n);
      if (e != g.nodes[n].spare) {
        if (g.nodes[w].status == VISITED) {
          g.nodes[w].status = DELETED;
          g.nodes[w].spare = e;
          g.deletedNodes.Append(w, kScratchGrowth);
          g.stack.Append(w, kScratchGrowth);
        } else if (g.nodes[w].status == DELETED) {
          // Closing edge e between n and w: the cycle runs through their
          // lowest common ancestor.
          gCycle.count = 0;
          gCycle.Append(e, kScratchGrowth);
          gPath.count = 0;
          for (std::int32_t a = n; a >= 0; a = ParentNode(a)) {
            g.nodes[a].status = MISC;
            gPath.Append(a, kScratchGrowth);
          }
          std::int32_t b = w;
          while (g.nodes[b].status != MISC) {
            gCycle.Append(g.nodes[b].spare, kScratchGrowth);
            b = ParentNode(b);
          }
          for (std::int32_t i = 0; i < gPath.count && gPath[i] != b; ++i) {
            gCycle.Append(g.nodes[gPath[i]].spare, kScratchGrowth);
          }
          for (std::int32_t i = 0; i < gPath.count; ++i) g.nodes[gPath[i]].status = DELETED;
          return true;
        }
      }
      e = CcwAt(er, n);
    } while (e != e0);
  }
  return false;
}

void UndoDeletion() {
  Engine& g = Vd();
  for (std::int32_t i = 0; i < g.deletedNodes.count; ++i) {
    NodeRecord& n = g.nodes[g.deletedNodes[i]];
    n.status = VISITED;
    n.spare = kNone;
  }
  g.deletedNodes.count = 0;
}

// The point site of edge e that the cut goes through: of two, the one
// closer to the segment's line within its extent. kNone if none.
std::int32_t CutPoint(const SegmentInsertion& si, const EdgeRecord& er) {
  const Engine& g = Vd();
  const bool l = er.ltype == PNT, r = er.rtype == PNT;
  if (!l && !r) return kNone;
  if (l != r) return l ? er.lft : er.rgt;
  const auto score = [&](std::int32_t p) {
    const Point2d q{g.points[p].x, g.points[p].y};
    const double lam = si.line.lambda(q);
    return (lam >= 0.0 && lam <= si.line.len) ? std::fabs(si.line.D(q)) : HUGE_VAL;
  };
  return score(er.rgt) < score(er.lft) ? er.rgt : er.lft;
}

// Breaks the cycle in gCycle. False when the insertion must return.
bool BreakCycle(const SegmentInsertion& si) {
  Engine& g = Vd();
  // A cycle through the node on one of the segment's end points encloses
  // that point's region, which has shrunk to the point (its segments leave
  // it no angle wider than a half turn on that side): the node stays, and
  // the region keeps its degenerate shape at the point.
  for (std::int32_t i = 0; i < gCycle.count; ++i) {
    const EdgeRecord& er = g.edges[gCycle[i]];
    for (const std::int32_t n : {er.n1, er.n2}) {
      const std::int32_t site = g.nodes[n].site;
      if (n != si.start && n != si.end && (site == si.i1 || site == si.i2)) {
        g.nodes[n].status = CHECKED;
        return true;
      }
    }
  }
  for (double tol = kProtectTol; tol <= kLadderTop; tol = NextTolerance(tol)) {
    for (std::int32_t i = 0; i < gCycle.count; ++i) {
      const std::int32_t e = gCycle[i];
      const std::int32_t p = CutPoint(si, g.edges[e]);
      if (p < 0) continue;
      const PointRecord& pr = g.points[p];
      if (p != si.i1 && p != si.i2 && si.line.contains({pr.x, pr.y})) {
        g.suspect = SuspectPair{true, si.s, SEG, p, PNT};
        if (RepairInput(si.s, SEG, false)) return false;
        continue;
      }
      if (PlaceOnRay(e, p, ProtectDirection(si, p), tol)) return true;
    }
  }
  // Fallback: the end node farthest from the segment's line, copied next to
  // it on its edge.
  std::int32_t bestEdge = kNone, bestNode = kNone;
  double bestD = -1.0;
  for (std::int32_t i = 0; i < gCycle.count; ++i) {
    const EdgeRecord& er = g.edges[gCycle[i]];
    for (const std::int32_t n : {er.n2, er.n1}) {
      const double d = std::fabs(si.line.D({g.nodes[n].x, g.nodes[n].y}));
      if (d > bestD) {
        bestD = d;
        bestEdge = gCycle[i];
        bestNode = n;
      }
    }
  }
  CopyIntoDegree2(bestEdge, bestNode);
  return true;
}

}  // namespace

bool MakeTree(SegmentInsertion& si) {
  Engine& g = Vd();
  if (si.grownTree) {
    // The depth-first walk below would find no cycle and mark the nodes in
    // the order the growth met them, the same walk over the same nodes.
    g.deletedNodes.count = 0;
    for (std::int32_t i = 0; i < g.checkedNodes.count; ++i) {
      const std::int32_t n = g.checkedNodes[i];
      if (g.nodes[n].status != VISITED) continue;
      g.nodes[n].status = DELETED;
      g.deletedNodes.Append(n, kScratchGrowth);
    }
    return true;
  }
  // Each round splits an edge of the collected set; the set is finite.
  const std::int64_t limit = 4 * std::int64_t{g.checkedNodes.count} + 16;
  for (std::int64_t round = 0; round < limit; ++round) {
    if (!FindCycle(si)) return true;
    UndoDeletion();
    if (!BreakCycle(si)) return false;
  }
  // No tree within the limit: the insertion is given up (recovery mode).
  UndoDeletion();
  g.errorFlag = true;
  g.recoveryMode = true;
  return false;
}

}  // namespace zt::vd
