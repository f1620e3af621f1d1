// Nodes and edges of the diagram: creation and recycling through the free
// lists, edge splitting by degree-2 nodes, region pointers, and the
// winged-edge navigation every traversal of the engine uses.
//
// Navigation rule: an edge's s_ fields describe its neighbours around n1 and
// its e_ fields those around n2; every traversal picks the pair by comparing
// the node with the edge's n1.
#pragma once

#include <cstdint>

#include "voronoi/detail/engine_state.hpp"

namespace zt::vd {

std::int32_t NewNode(double x, double y, double r);
void FreeNode(std::int32_t n);
std::int32_t NewEdge(std::int32_t n1, std::int32_t n2, std::int32_t lft, std::int32_t rgt,
                     std::int32_t ltype, std::int32_t rtype);
void FreeEdge(std::int32_t e);

// Inserts node n into edge e: e now ends at n and a new edge from n to e's
// old n2 takes e's sites and its neighbours there. n becomes a degree-2 node;
// with `temporary` it is also listed for RemoveDegree2Nodes and set DUMMY.
// Returns the new edge.
std::int32_t SplitEdge(std::int32_t e, std::int32_t n, bool temporary);

// Folds every listed temporary degree-2 node back out of the diagram.
void RemoveDegree2Nodes();

// Stores `edge` as the region pointer of the site; an unknown kind prints
// the alarm line and changes nothing.
void SetVDPtr(std::int32_t kind, std::int32_t site, std::int32_t edge);

inline bool ValidNode(std::int32_t n) { return Vd().nodes.Valid(n); }
inline bool ValidEdge(std::int32_t e) { return Vd().edges.Valid(e); }

inline std::int32_t OtherNode(const EdgeRecord& e, std::int32_t n) { return e.n1 == n ? e.n2 : e.n1; }
// Next edge counter-clockwise / clockwise around node n, an end of e.
inline std::int32_t CcwAt(const EdgeRecord& e, std::int32_t n) { return e.n1 == n ? e.s_ccw : e.e_ccw; }
inline std::int32_t CwAt(const EdgeRecord& e, std::int32_t n) { return e.n1 == n ? e.s_cw : e.e_cw; }
inline void SetCcwAt(EdgeRecord& e, std::int32_t n, std::int32_t v) { (e.n1 == n ? e.s_ccw : e.e_ccw) = v; }
inline void SetCwAt(EdgeRecord& e, std::int32_t n, std::int32_t v) { (e.n1 == n ? e.s_cw : e.e_cw) = v; }
// The site on the left of e seen from its end n outwards, i.e. the region
// between e and its counter-clockwise neighbour at n; and its kind.
inline std::int32_t LeftSiteFrom(const EdgeRecord& e, std::int32_t n) { return e.n1 == n ? e.lft : e.rgt; }
inline std::int32_t LeftKindFrom(const EdgeRecord& e, std::int32_t n) { return e.n1 == n ? e.ltype : e.rtype; }
inline std::int32_t RightSiteFrom(const EdgeRecord& e, std::int32_t n) { return e.n1 == n ? e.rgt : e.lft; }
inline std::int32_t RightKindFrom(const EdgeRecord& e, std::int32_t n) { return e.n1 == n ? e.rtype : e.ltype; }

// The node at which a walk around the region of (site, kind), with the
// region on the left (counter-clockwise), leaves edge e; -1 when e does not
// bound that region.
inline std::int32_t RegionExitNode(std::int32_t e, std::int32_t site, std::int32_t kind) {
  const EdgeRecord& r = Vd().edges[e];
  if (r.lft == site && r.ltype == kind) return r.n2;
  if (r.rgt == site && r.rtype == kind) return r.n1;
  return kNone;
}
// The next edge of that walk after e; -1 when e does not bound the region.
inline std::int32_t NextRegionEdge(std::int32_t e, std::int32_t site, std::int32_t kind) {
  const std::int32_t n = RegionExitNode(e, site, kind);
  return n < 0 ? kNone : CwAt(Vd().edges[e], n);
}

}  // namespace zt::vd
