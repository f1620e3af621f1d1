// Choice between the two roots of a node construction.
//
// Two candidate nodes are compared by a chain of criteria, each a
// non-negative number where smaller is better; a criterion is consulted only
// when the previous ones tie exactly (criteria that are satisfied are exactly
// 0, so exact ties are the common case, not an accident of rounding):
//   C1  extent on the edge: 0 inside (or within kRootExtentBand of it), else
//       the distance to the nearer end;
//   C2  for a segment: how far the candidate's foot lies beyond it;
//   C3  radius band: how far the candidate's clearance lies outside the
//       radii of the edge's end nodes (down to the clearance of the edge's
//       apex where the edge passes it), 0 within kRootExtentBand;
//   C4  0 for the candidate nearer to the deleted end node, 1 for the other.
#pragma once

#include "voronoi/detail/node_geometry.hpp"

namespace zt::vd::geo {

// Distances up to this count as 0 in C1 and C3: the rounding of a root that
// coincides with an end node, or with the apex of the edge.
inline constexpr double kRootExtentBand = 1e-11;

// Signed position of end node x along the edge relative to candidate c, as a
// length: cross product along the bisector of two points, across the line of a
// segment for an edge between the segment and one of its own end points, and
// the difference of foot positions along the (lower-indexed) segment otherwise.
double edge_position(const EdgeFrame& e, const EdgeEnd& x, Point2d c);
// C1.
double extent_on_edge(const EdgeFrame& e, Point2d c);
// Distance of c to the edge's left site as C3 measures it: Euclidean for a
// point, |D| for a segment.
double left_clearance(const EdgeFrame& e, Point2d c);
// C3.
double radius_band(const EdgeFrame& e, Point2d c);

// The segments whose C2 a chain consults, in order.
struct RootChain {
  const SegSite* c2[3] = {nullptr, nullptr, nullptr};
  int count = 0;
  RootChain& then(const SegSite& s) {
    c2[count++] = &s;
    return *this;
  }
};

// True when the first candidate wins.
bool first_root_wins(const EdgeFrame& e, Point2d n1, Point2d n2, const RootChain& chain);

}  // namespace zt::vd::geo
