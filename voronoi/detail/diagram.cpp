// Node and edge bookkeeping of the diagram (see diagram.hpp).
#include "voronoi/detail/diagram.hpp"

#include <cassert>
#include <cmath>
#include <cstdio>

namespace zt::vd {

namespace {

std::int32_t PopOrAppend(RecordArray<std::int32_t>& freeStack, std::int32_t& count,
                         std::int32_t capacity, std::int32_t growth, auto& records) {
  std::int32_t index;
  if (freeStack.count > 0) {
    index = freeStack[--freeStack.count];
  } else {
    index = count;
  }
  if (index >= capacity) records.Reserve(records.GrownCapacity(growth));
  if (index >= count) count = index + 1;
  return index;
}

void Push(RecordArray<std::int32_t>& stack, std::int32_t v) { stack.Append(v, kFreeStackGrowth); }

// Replaces the reference to edge `from` by `to` in edge f's neighbour
// fields at node n.
void Redirect(std::int32_t f, std::int32_t n, std::int32_t from, std::int32_t to) {
  EdgeRecord& r = Vd().edges[f];
  if (r.n1 == n) {
    if (r.s_ccw == from) r.s_ccw = to;
    if (r.s_cw == from) r.s_cw = to;
  }
  if (r.n2 == n) {
    if (r.e_ccw == from) r.e_ccw = to;
    if (r.e_cw == from) r.e_cw = to;
  }
}

}  // namespace

std::int32_t NewNode(double x, double y, double r) {
  Engine& g = Vd();
  assert(std::isfinite(x) && std::isfinite(y) && std::isfinite(r) && r >= 0.0);
  const std::int32_t n =
      PopOrAppend(g.freeNodes, g.nodes.count, g.nodes.capacity, kNodeGrowth, g.nodes);
  g.nodes[n] = NodeRecord{x, y, r, UNCHECKED, kNone, kNone, 0, kNone};
  return n;
}

void FreeNode(std::int32_t n) {
  Engine& g = Vd();
  assert(ValidNode(n));
  Push(g.freeNodes, n);
  g.nodes[n].status = DELETED;
}

std::int32_t NewEdge(std::int32_t n1, std::int32_t n2, std::int32_t lft, std::int32_t rgt,
                     std::int32_t ltype, std::int32_t rtype) {
  Engine& g = Vd();
  const std::int32_t e =
      PopOrAppend(g.freeEdges, g.edges.count, g.edges.capacity, kEdgeGrowth, g.edges);
  g.edges[e] = EdgeRecord{n1, n2, lft, rgt, ltype, rtype, kNone, kNone, kNone, kNone, 0, 0, kNone};
  return e;
}

void FreeEdge(std::int32_t e) {
  Engine& g = Vd();
  assert(ValidEdge(e));
  EdgeRecord& r = g.edges[e];
  r.lft = kNone;
  r.rgt = kNone;
  r.deleted = 1;
  Push(g.freeEdges, e);
}

std::int32_t SplitEdge(std::int32_t e, std::int32_t n, bool temporary) {
  Engine& g = Vd();
  assert(ValidEdge(e) && ValidNode(n));
  const EdgeRecord old = g.edges[e];
  const std::int32_t f = NewEdge(n, old.n2, old.lft, old.rgt, old.ltype, old.rtype);
  EdgeRecord& nf = g.edges[f];
  nf.e_ccw = old.e_ccw;
  nf.e_cw = old.e_cw;
  nf.s_ccw = e;
  nf.s_cw = e;
  // Neighbours at the far node now meet f instead of e.
  if (old.e_ccw >= 0) Redirect(old.e_ccw, old.n2, e, f);
  if (old.e_cw >= 0 && old.e_cw != old.e_ccw) Redirect(old.e_cw, old.n2, e, f);
  if (g.nodes[old.n2].edge == e) g.nodes[old.n2].edge = f;
  EdgeRecord& ne = g.edges[e];
  ne.n2 = n;
  ne.e_ccw = f;
  ne.e_cw = f;
  NodeRecord& node = g.nodes[n];
  node.edge = e;
  node.degree2 = 1;
  if (temporary) {
    node.status = DUMMY;
    g.degree2.Append(Degree2Record{e, f, n}, kDegree2Growth);
  }
  return f;
}

void RemoveDegree2Nodes() {
  Engine& g = Vd();
  for (std::int32_t i = 0; i < g.degree2.count; ++i) {
    const Degree2Record t = g.degree2[i];
    EdgeRecord& k = g.edges[t.kept];
    const EdgeRecord m = g.edges[t.merged];
    const std::int32_t far = OtherNode(m, t.node);
    // The kept edge takes over the merged edge's far end and neighbours.
    const std::int32_t ccw = CcwAt(m, far);
    const std::int32_t cw = CwAt(m, far);
    if (k.n1 == t.node) {
      // The kept edge runs away from the node: swap so that it ends there.
      std::swap(k.n1, k.n2);
      std::swap(k.lft, k.rgt);
      std::swap(k.ltype, k.rtype);
      std::swap(k.s_ccw, k.e_ccw);
      std::swap(k.s_cw, k.e_cw);
    }
    k.n2 = far;
    k.e_ccw = ccw;
    k.e_cw = cw;
    if (ccw >= 0) Redirect(ccw, far, t.merged, t.kept);
    if (cw >= 0 && cw != ccw) Redirect(cw, far, t.merged, t.kept);
    if (g.nodes[far].edge == t.merged) g.nodes[far].edge = t.kept;
    SetVDPtr(k.ltype, k.lft, t.kept);
    SetVDPtr(k.rtype, k.rgt, t.kept);
    FreeNode(t.node);
    FreeEdge(t.merged);
  }
  g.degree2.count = 0;
}

void SetVDPtr(std::int32_t kind, std::int32_t site, std::int32_t edge) {
  Engine& g = Vd();
  switch (kind) {
    case PNT: g.points[site].vd = edge; break;
    case SEG: g.segments[site].vd = edge; break;
    case ARC: g.arcs[site].vd = edge; break;
    default:
      std::printf("alarm in SetVDPtr: unknown site type %d\n", kind);
      break;
  }
}

}  // namespace zt::vd
