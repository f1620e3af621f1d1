// Per-edge tracing data and the point where an offset crosses an edge.
//
// Every function here assumes the diagram is prepared for offsets (plain
// radii, clearance monotone along every edge).
#pragma once

#include <cstdint>

#include "voronoi/detail/engine_state.hpp"
#include "voronoi/detail/offset_state.hpp"

namespace zt::vd {

OffsetEdgeKind EdgeKindOf(const EdgeRecord& r);

// Fills Offs().data[e] when it is marked needs-computing.
void EnsureEdgeData(std::int32_t e);

struct OffsetPoint {
  double x, y;
};

// The point of edge e at clearance t (min radius <= t <= max radius); the
// documented fallback points on degenerate edges.
OffsetPoint CrossingPoint(std::int32_t e, double t);

}  // namespace zt::vd
