// Segment phase. Segment insertion is not available yet: a computation that
// reaches it ends with the engine's fatal error instead of pretending to a
// diagram without its segments.
#include "voronoi/detail/segment_phase.hpp"

#include "voronoi/detail/fatal.hpp"

namespace zt::vd {

void InsertSegment(std::int32_t) {
  VdFatal("Compute() - insertion of line segments into VD not yet supported!");
}

void SplitAtSegmentEndPoints() {}

}  // namespace zt::vd
