// The node constructions of the segment phase over plain geometry: the point
// of edge e equidistant from e's two sites and a new site, for the site
// combinations that involve segments.
//
// Every construction returns
//  - false, with a suspect pair recorded, on degenerate input (coincident
//    points, a point on a segment, duplicate segments), or false without one
//    where no construction applies (equal sites, arcs);
//  - true with a node that lies on e and is equidistant from the three sites
//    (checked), or with `copied` set when no such node was found (the caller
//    treats the copy as a hint to run the input repair).
#pragma once

#include "voronoi/detail/node_geometry.hpp"

namespace zt::vd::geo {

// Two points p, q and a segment s; `fresh` is the new site (one of the three).
bool node_pps(const EdgeFrame& e, const SiteRef& fresh, const PointSite& p, const PointSite& q, const SegSite& s,
              SuspectPair& suspect, NodeResult& out);

// One point p and two segments.
bool node_pss(const EdgeFrame& e, const SiteRef& fresh, const PointSite& p, const SegSite& sa, const SegSite& sb,
              NodeMemory& memory, SuspectPair& suspect, NodeResult& out);

// Three segments.
bool node_sss(const EdgeFrame& e, const SiteRef& fresh, const SegSite& sa, const SegSite& sb, const SegSite& sc,
              SuspectPair& suspect, NodeResult& out);

// Dispatch by the kinds of e's left site, e's right site and the new site,
// for every combination with a segment; clears `copied` and `on_point`
// first. Three points and any arc: false (the caller handles three points).
bool compute_node(const EdgeFrame& e, const SiteRef& fresh, NodeMemory& memory, SuspectPair& suspect,
                  NodeResult& out);

}  // namespace zt::vd::geo
