// Acceptance of a constructed node, the bisection along the edge, and the
// fallback copy.
//
// Every closed-form node is checked before it is used: it must lie on the
// edge (C1 within kNodeCheckTol) and be equidistant from the edge's two sites
// and the new site by their true distances. A node that fails is searched
// again by bisection along the edge on dist(new site) − clearance, which is
// positive at the kept end node and not positive at the deleted one; only
// when that finds no sign change is an end node copied.
#pragma once

#include "voronoi/detail/node_geometry.hpp"

namespace zt::vd::geo {

// The point of edge e at u in [0, 1], from the kept end node (0) to the
// deleted one (1): straight for edges between two points, two segments, or a
// segment and one of its own end points; along the parabola, by the foot
// position on the segment, for a point and a segment.
Point2d edge_point(const EdgeFrame& e, double u);

// True when n lies on e and is equidistant from e's sites and s.
bool node_is_sound(const EdgeFrame& e, const SiteRef& s, Point2d n);

// The bisection; true with out set (not copied) when it found the node.
bool bisect_on_edge(const EdgeFrame& e, const SiteRef& s, NodeResult& out);

// The fallback: the kept end node's position and clearance, marked copied.
bool copy_kept_node(const EdgeFrame& e, NodeResult& out);

// Accepts the closed-form node (n, r) when sound, else bisects, else copies.
// Always true.
bool finish_node(const EdgeFrame& e, const SiteRef& s, Point2d n, double r, NodeResult& out);

// No closed form: bisects, else copies. Always true.
bool search_or_copy(const EdgeFrame& e, const SiteRef& s, NodeResult& out);

}  // namespace zt::vd::geo
