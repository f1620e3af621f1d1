// Preparation of a diagram for offset tracing, and the choice of the edges
// that may carry offsets on the requested side.
//
// After PrepareDiagramForOffsets the clearance is monotone along every live
// edge: bisectors of two points are split at the midpoint of the points,
// and edges between a point and a segment not ending at it are split at the
// parabola's apex, each by a permanent degree-2 node.
#pragma once

namespace zt::vd {

// Once per diagram generation; node radii become plain clearances.
void PrepareDiagramForOffsets();

// Per-edge arrays sized to the diagram (data marked needs-computing on a new
// generation) and the work list for one side (left or right) or both (both
// false). For one side, each face of the input segments is listed whole or
// not at all: it lies on the side on which its one-sided segments, by
// length, see it; a segment with the face on both of its sides counts for
// both, and a face with no other segment is listed for either side. Leaves every candidate flag from edge 4 on at 1, those of the
// four outer edges at 0.
void InitializeEdgeData(bool left, bool right);

}  // namespace zt::vd
