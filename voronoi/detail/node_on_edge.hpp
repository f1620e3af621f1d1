// ComputeNodeOnEdge: the new node of a segment insertion on an edge that
// leaves the deleted tree, read from and named in the engine's records.
//
// Promises: on true, (x, y) lies on edge e equidistant from e's two sites and
// site s with clearance r (plain, not squared), or `copied` is set and
// (x, y, r) are those of the kept end node; `onPoint` names the input point
// the node lies on, or is -1. On false, the engine's suspect pair names the
// degenerate input when a construction found one.
#pragma once

#include <cstdint>

#include "voronoi/detail/node_geometry.hpp"

namespace zt::vd {

bool ComputeNodeOnEdge(std::int32_t e, std::int32_t s, std::int32_t kind, double& x, double& y, double& r,
                       bool& copied, std::int32_t& onPoint);
// The same with the new site's geometry given: an insertion computes nodes
// on many edges for one site, and builds its geometry once.
bool ComputeNodeOnEdge(std::int32_t e, const geo::SiteRef& fresh, double& x, double& y, double& r, bool& copied,
                       std::int32_t& onPoint);

// The plain geometry of a site and of an edge, copied from the records.
geo::SiteRef SiteFromRecords(std::int32_t site, std::int32_t kind);
geo::EdgeFrame EdgeFromRecords(std::int32_t e);

}  // namespace zt::vd
