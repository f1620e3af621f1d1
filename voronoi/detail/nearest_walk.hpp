// Nearest-site search by a walk through the diagram itself, for insertion
// orders in which consecutive points lie close together.
//
// From a site already in the diagram, the walk moves to the neighbour (a
// point across an edge of the current site's region) nearest the query as
// long as that neighbour is strictly nearer. In a diagram of points, a
// site with no nearer neighbour is a nearest site, so the walk needs no
// search structure: its cost is the number of regions between the start
// and the answer, a step or two when the previous point is the start, and
// the same for any spread of the data, clustered or not.
//
// Promise: WalkToNearest returns a diagram site (corner sites included) at
// the least squared distance from the query over the sites of the diagram
// when the diagram is a diagram of its sites; a site within
// kCoincidentDist2 ends the walk at once. It reads the diagram only.
// ScanNearest is the brute-force answer over every inserted point, for
// the rare insertion whose walk result proves unusable.
#pragma once

#include <cstdint>

#include "voronoi/detail/nearest_search.hpp"

namespace zt::vd {

// Brute-force checks per computation: a diagram whose rounding misleads
// walks again and again is dirty input, for the repairs to handle, and
// must not make the point phase quadratic.
inline constexpr std::int32_t kMaxNearestRescans = 64;

// The walk from site `from` (a point with a region) to the site nearest
// point p (which need not be in the diagram).
Nearest WalkToNearest(std::int32_t from, std::int32_t p);

// The inserted point (with a region, not merged away) nearest p, p itself
// excluded; ties go to the lowest index.
Nearest ScanNearest(std::int32_t p);

}  // namespace zt::vd
